#pragma once

#include <cstddef>

// Per-thread chunks that small arrays and records are cut from, one after the other in the
// order they are made. Nothing is given back alone: a chunk goes back whole (to the thread's
// spares, or to the heap) once everything cut from it is freed, on whatever thread. So a parse
// writes its tree into memory it then walks in order, and freeing a tree or a sequence model
// releases a few chunks instead of feeding tens of thousands of pieces to free lists.
//
// Each thread cuts from one chunk per stream, so that what lives long (a sequence model's
// blocks) does not keep alive the chunks of what a parse makes and soon drops.
class NodeArena {
 public:
  enum class Stream { Trees, Records };

  // The size and alignment of a chunk; a piece is found in its chunk by its address.
  static constexpr std::size_t kChunkBytes = std::size_t{256} << 10;
  // Larger pieces go to the heap directly.
  static constexpr std::size_t kMaxPieceBytes = 4096;
  // What one thread keeps at most in spare chunks; beyond it chunks go back to the heap.
  static constexpr std::size_t kMaxSpareBytes = std::size_t{64} << 20;

  static void* Allocate(Stream stream, std::size_t bytes);
  static void Free(void* piece, std::size_t bytes) noexcept;
  // Bytes kept by this thread in spare chunks, free for reuse.
  static std::size_t SpareBytes() noexcept;
};
