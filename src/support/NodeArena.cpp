#include "support/NodeArena.h"

#include <atomic>
#include <cstdint>
#include <new>

#include "support/AsanPoison.h"

namespace {

constexpr std::size_t kGrain = 16;
constexpr std::size_t kStreams = 2;
constexpr std::align_val_t kAlignment{NodeArena::kChunkBytes};
// Counted as that many pieces while a thread cuts from the chunk, so that it cannot go back
// meanwhile; what was not cut is taken off when the thread moves on.
constexpr std::size_t kCutting = std::size_t{1} << 40;

struct alignas(64) Chunk {
  // Pieces not yet freed (plus kCutting while it is cut from); the last free returns the chunk.
  std::atomic<std::size_t> live{0};
  Chunk* nextSpare = nullptr;
};
constexpr std::size_t kHeader = sizeof(Chunk);

// What a piece takes of its chunk: whole grains, at least one, so that no two share an address.
std::size_t Footprint(std::size_t bytes) {
  return bytes == 0 ? kGrain : (bytes + kGrain - 1) & ~(kGrain - 1);
}

Chunk* ChunkOf(void* piece) {
  return reinterpret_cast<Chunk*>(reinterpret_cast<std::uintptr_t>(piece) & ~(NodeArena::kChunkBytes - 1));
}

void PoisonBody(Chunk* chunk) {
  QEN_POISON(reinterpret_cast<char*>(chunk) + kHeader, NodeArena::kChunkBytes - kHeader);
}

void Delete(Chunk* chunk) noexcept {
  QEN_UNPOISON(chunk, NodeArena::kChunkBytes);
  chunk->~Chunk();
  ::operator delete(chunk, kAlignment);
}

// A thread's chunks that nothing is cut from, ready for reuse.
struct Spares {
  Chunk* head = nullptr;
  std::size_t bytes = 0;

  Spares() = default;
  Spares(const Spares&) = delete;
  Spares& operator=(const Spares&) = delete;
  ~Spares() {
    while (Chunk* chunk = Take()) Delete(chunk);
  }

  bool Keep(Chunk* chunk) noexcept {
    if (bytes + NodeArena::kChunkBytes > NodeArena::kMaxSpareBytes) return false;
    PoisonBody(chunk);
    chunk->nextSpare = head;
    head = chunk;
    bytes += NodeArena::kChunkBytes;
    return true;
  }
  Chunk* Take() noexcept {
    Chunk* chunk = head;
    if (chunk == nullptr) return nullptr;
    head = chunk->nextSpare;
    bytes -= NodeArena::kChunkBytes;
    return chunk;
  }
};

// The chunk one stream of a thread cuts from.
struct Cutter {
  Chunk* chunk = nullptr;
  char* next = nullptr;
  char* end = nullptr;
  std::size_t cut = 0;

  void* Cut(std::size_t size, Spares& spares) {
    if (static_cast<std::size_t>(end - next) < size) Renew(spares);
    void* piece = next;
    next += size;
    ++cut;
    QEN_UNPOISON(piece, size);
    return piece;
  }
  void Renew(Spares& spares);
  void Retire() noexcept;
};

struct Owner {
  Spares spares;  // destroyed last: the cutters' chunks may join it first
  Cutter cutters[kStreams];
  Owner();
  Owner(const Owner&) = delete;
  Owner& operator=(const Owner&) = delete;
  ~Owner();
};

// A plain pointer outlives the owner's destructor, so a piece freed late in a thread's exit
// (by a static, another thread-local) finds no owner and its chunk goes to the heap.
thread_local Owner* tOwner = nullptr;

Owner::Owner() {
  tOwner = this;
}

Owner::~Owner() {
  tOwner = nullptr;
  for (Cutter& cutter : cutters) cutter.Retire();
}

Owner* ThreadOwner() {
  if (tOwner == nullptr) {
    thread_local Owner owner;
  }
  return tOwner;
}

// Back to this thread's spares, or to the heap beyond the bound or without an owner.
void Recycle(Chunk* chunk) noexcept {
  Owner* owner = tOwner;
  if (owner == nullptr || !owner->spares.Keep(chunk)) Delete(chunk);
}

void Cutter::Renew(Spares& spares) {
  Retire();
  Chunk* fresh = spares.Take();
  if (fresh == nullptr) {
    fresh = new (::operator new(NodeArena::kChunkBytes, kAlignment)) Chunk;
    PoisonBody(fresh);
  }
  fresh->live.store(kCutting, std::memory_order_relaxed);
  chunk = fresh;
  next = reinterpret_cast<char*>(chunk) + kHeader;
  end = reinterpret_cast<char*>(chunk) + NodeArena::kChunkBytes;
  cut = 0;
}

void Cutter::Retire() noexcept {
  if (chunk == nullptr) return;
  const std::size_t uncut = kCutting - cut;
  Chunk* done = chunk;
  chunk = nullptr;
  next = end = nullptr;
  if (done->live.fetch_sub(uncut, std::memory_order_acq_rel) == uncut) Recycle(done);
}

}  // namespace

void* NodeArena::Allocate(Stream stream, std::size_t bytes) {
  if (bytes > kMaxPieceBytes) return ::operator new(bytes);
  if (Owner* owner = ThreadOwner())
    return owner->cutters[static_cast<std::size_t>(stream)].Cut(Footprint(bytes), owner->spares);
  // Late in the thread's exit: a chunk for this one piece, returned when it is freed.
  Spares none;
  Cutter last;
  void* piece = last.Cut(Footprint(bytes), none);
  last.Retire();
  return piece;
}

void NodeArena::Free(void* piece, std::size_t bytes) noexcept {
  if (piece == nullptr) return;
  if (bytes > kMaxPieceBytes) {
    ::operator delete(piece);
    return;
  }
  QEN_POISON(piece, Footprint(bytes));
  Chunk* chunk = ChunkOf(piece);
  if (chunk->live.fetch_sub(1, std::memory_order_acq_rel) == 1) Recycle(chunk);
}

std::size_t NodeArena::SpareBytes() noexcept {
  return tOwner != nullptr ? tOwner->spares.bytes : 0;
}
