// SPDX-License-Identifier: Apache-2.0
// The atomic operations of libcu++ for code that runs on CUDA devices: its memory orders and
// scopes. There a scope is part of the type of a reference.
#pragma once

#include <cuda/atomic>

#include "config.hpp"
#include "memory_order.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

__device__ constexpr cuda::std::memory_order cuda_order(memory_order order) {
  constexpr cuda::std::memory_order orders[] = {
      cuda::std::memory_order_relaxed, cuda::std::memory_order_acquire,
      cuda::std::memory_order_release, cuda::std::memory_order_acq_rel,
      cuda::std::memory_order_seq_cst};
  return orders[static_cast<int>(order)];
}

// One item and a sub-group, which has one, need no more than the group that they are in.
__device__ constexpr cuda::thread_scope cuda_scope(memory_scope scope) {
  return scope == memory_scope::system   ? cuda::thread_scope_system
         : scope == memory_scope::device ? cuda::thread_scope_device
                                         : cuda::thread_scope_block;
}

// Gives `work` the reference to the object whose type has the scope.
template <typename T, typename Work>
__device__ inline auto on_cuda_atomic(T& object, memory_scope scope, const Work& work) {
  switch (cuda_scope(scope)) {
    case cuda::thread_scope_system:
      return work(cuda::atomic_ref<T, cuda::thread_scope_system>(object));
    case cuda::thread_scope_device:
      return work(cuda::atomic_ref<T, cuda::thread_scope_device>(object));
    default:
      return work(cuda::atomic_ref<T, cuda::thread_scope_block>(object));
  }
}

}  // namespace detail

LUMEN_NAMESPACE_END
