#pragma once

#include <cstddef>

#include "support/NodePool.h"

// The allocator of parsed lists' element arrays: stateless, so lists of any parse mix freely.
template <typename T>
struct NodeAllocator {
  using value_type = T;

  NodeAllocator() noexcept = default;
  template <typename U>
  NodeAllocator(const NodeAllocator<U>&) noexcept {}

  T* allocate(std::size_t n) { return static_cast<T*>(NodePool::Allocate(n * sizeof(T))); }
  void deallocate(T* p, std::size_t n) noexcept { NodePool::Free(p, n * sizeof(T)); }

  template <typename U>
  bool operator==(const NodeAllocator<U>&) const noexcept {
    return true;
  }
};
