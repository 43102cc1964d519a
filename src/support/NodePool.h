#pragma once

#include <cstddef>

// Per-thread free lists of the small arrays that parsed lists keep their elements in. A parse
// builds hundreds of thousands of them and frees them together; handed back to the heap they
// are returned to the system and faulted in again by the next parse, so they are kept here
// instead, up to a bound per thread. A block may be freed on another thread than the one that
// made it: it simply joins that thread's lists.
class NodePool {
 public:
  // Larger arrays go to the heap directly.
  static constexpr std::size_t kMaxPooledBytes = 4096;
  // What one thread keeps at most; beyond it freed blocks go back to the heap.
  static constexpr std::size_t kMaxKeptBytes = std::size_t{64} << 20;

  static void* Allocate(std::size_t bytes);
  static void Free(void* block, std::size_t bytes) noexcept;
  // Bytes kept by this thread, free for reuse.
  static std::size_t KeptBytes() noexcept;
};
