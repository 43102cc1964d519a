#pragma once

#include <cstddef>

#include "support/NodeArena.h"

// The allocator of the arrays that parcels, parsed lists and sequence blocks keep their
// elements in: stateless, so that containers made on any thread mix freely.
template <typename T, NodeArena::Stream S = NodeArena::Stream::Records>
struct NodeAllocator {
  using value_type = T;
  template <typename U>
  struct rebind {
    using other = NodeAllocator<U, S>;
  };

  NodeAllocator() noexcept = default;
  template <typename U>
  NodeAllocator(const NodeAllocator<U, S>&) noexcept {}

  T* allocate(std::size_t n) { return static_cast<T*>(NodeArena::Allocate(S, n * sizeof(T))); }
  void deallocate(T* p, std::size_t n) noexcept { NodeArena::Free(p, n * sizeof(T)); }

  template <typename U>
  bool operator==(const NodeAllocator<U, S>&) const noexcept {
    return true;
  }
};
