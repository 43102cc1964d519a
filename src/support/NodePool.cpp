#include "support/NodePool.h"

#include <array>
#include <new>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/asan_interface.h>
#define QEN_POISON(p, n) ASAN_POISON_MEMORY_REGION(p, n)
#define QEN_UNPOISON(p, n) ASAN_UNPOISON_MEMORY_REGION(p, n)
#else
#define QEN_POISON(p, n) ((void)(p), (void)(n))
#define QEN_UNPOISON(p, n) ((void)(p), (void)(n))
#endif

namespace {

constexpr std::size_t kGrain = 16;
constexpr std::size_t kClasses = NodePool::kMaxPooledBytes / kGrain + 1;

struct FreeBlock {
  FreeBlock* next;
};

struct Lists {
  std::array<FreeBlock*, kClasses> heads{};
  std::size_t kept = 0;

  ~Lists() {
    for (std::size_t c = 0; c < kClasses; ++c) {
      for (FreeBlock* block = heads[c]; block != nullptr;) {
        QEN_UNPOISON(block, c * kGrain);
        FreeBlock* next = block->next;
        ::operator delete(block);
        block = next;
      }
    }
  }
};

// A plain pointer outlives the owner's destructor, so a list destroyed late in a thread's exit
// (a static, another thread-local) finds it empty and frees to the heap.
thread_local Lists* tLists = nullptr;

struct Owner {
  Lists lists;
  Owner() { tLists = &lists; }
  ~Owner() { tLists = nullptr; }
};

Lists* ThreadLists() {
  if (tLists == nullptr) {
    thread_local Owner owner;
  }
  return tLists;
}

std::size_t ClassOf(std::size_t bytes) {
  return (bytes + kGrain - 1) / kGrain;
}

}  // namespace

void* NodePool::Allocate(std::size_t bytes) {
  if (bytes > kMaxPooledBytes) return ::operator new(bytes);
  const std::size_t c = ClassOf(bytes);
  Lists* lists = ThreadLists();
  FreeBlock* block = lists != nullptr ? lists->heads[c] : nullptr;
  if (block == nullptr) return ::operator new(c * kGrain);
  QEN_UNPOISON(block, c * kGrain);
  lists->heads[c] = block->next;
  lists->kept -= c * kGrain;
  return block;
}

void NodePool::Free(void* block, std::size_t bytes) noexcept {
  if (block == nullptr) return;
  const std::size_t c = ClassOf(bytes);
  Lists* lists = bytes <= kMaxPooledBytes ? tLists : nullptr;
  if (lists == nullptr || lists->kept + c * kGrain > kMaxKeptBytes) {
    ::operator delete(block);
    return;
  }
  FreeBlock* head = static_cast<FreeBlock*>(block);
  head->next = lists->heads[c];
  lists->heads[c] = head;
  lists->kept += c * kGrain;
  QEN_POISON(block, c * kGrain);
}

std::size_t NodePool::KeptBytes() noexcept {
  return tLists != nullptr ? tLists->kept : 0;
}
