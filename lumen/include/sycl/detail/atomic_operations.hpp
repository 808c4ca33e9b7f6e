// SPDX-License-Identifier: Apache-2.0
// Atomic operations on plain objects: on the host the compiler's, where all work-items share one
// memory, so that every scope is as wide as the widest; in code for GPUs those of libcu++.
#pragma once

#include <type_traits>

#include "config.hpp"
#include "memory_order.hpp"
#if defined(__CUDACC__)
#include "cuda_atomic.hpp"
#endif

LUMEN_NAMESPACE_BEGIN

namespace detail {

SYCL_EXTERNAL constexpr int builtin_order(memory_order order) {
  constexpr int orders[] = {__ATOMIC_RELAXED, __ATOMIC_ACQUIRE, __ATOMIC_RELEASE, __ATOMIC_ACQ_REL,
                            __ATOMIC_SEQ_CST};
  return orders[static_cast<int>(order)];
}

// Whether floating types have an atomic addition of their own.
#if defined(__CUDA_ARCH__)
inline constexpr bool atomic_adds_reals = true;
#else
inline constexpr bool atomic_adds_reals = false;
#endif

template <typename T>
SYCL_EXTERNAL inline void atomic_store(T& object, T operand, memory_order order,
                                       [[maybe_unused]] memory_scope scope) {
#if defined(__CUDA_ARCH__)
  on_cuda_atomic(object, scope, [=](const auto& ref) { ref.store(operand, cuda_order(order)); });
#else
  __atomic_store(&object, &operand, builtin_order(order));
#endif
}

template <typename T>
SYCL_EXTERNAL inline T atomic_load(T& object, memory_order order,
                                   [[maybe_unused]] memory_scope scope) {
#if defined(__CUDA_ARCH__)
  return on_cuda_atomic(object, scope,
                        [=](const auto& ref) { return ref.load(cuda_order(order)); });
#else
  T value;
  __atomic_load(&object, &value, builtin_order(order));
  return value;
#endif
}

template <typename T>
SYCL_EXTERNAL inline T atomic_exchange(T& object, T operand, memory_order order,
                                       [[maybe_unused]] memory_scope scope) {
#if defined(__CUDA_ARCH__)
  return on_cuda_atomic(object, scope,
                        [=](const auto& ref) { return ref.exchange(operand, cuda_order(order)); });
#else
  T before;
  __atomic_exchange(&object, &operand, &before, builtin_order(order));
  return before;
#endif
}

// `Weak` may fail without a reason.
template <bool Weak, typename T>
SYCL_EXTERNAL inline bool atomic_compare_exchange(T& object, T& expected, T desired,
                                                  memory_order success, memory_order failure,
                                                  [[maybe_unused]] memory_scope scope) {
#if defined(__CUDA_ARCH__)
  return on_cuda_atomic(object, scope, [&](const auto& ref) {
    const auto after = cuda_order(success);
    const auto unchanged = cuda_order(failure);
    return Weak ? ref.compare_exchange_weak(expected, desired, after, unchanged)
                : ref.compare_exchange_strong(expected, desired, after, unchanged);
  });
#else
  return __atomic_compare_exchange(&object, &expected, &desired, Weak, builtin_order(success),
                                   builtin_order(failure));
#endif
}

// Stores next(before) and returns `before`, what was there.
template <typename T, typename Next>
SYCL_EXTERNAL inline T atomic_update(T& object, Next next, memory_order order, memory_scope scope) {
  T before = atomic_load(object, memory_order::relaxed, scope);
  while (!atomic_compare_exchange<true>(object, before, next(before), order, read_order_of(order),
                                        scope)) {
  }
  return before;
}

// Steps that have an instruction of their own. Each returns what was there before.
#if defined(__CUDA_ARCH__)
#define LUMEN_ATOMIC_STEP(name, ...)   \
  return on_cuda_atomic(object, scope, \
                        [=](const auto& ref) { return ref.name(operand, cuda_order(order)); });
#else
#define LUMEN_ATOMIC_STEP(name, ...) return __VA_ARGS__;
#endif
#define LUMEN_ATOMIC_FETCH(name, ...)                                            \
  template <typename T>                                                          \
  SYCL_EXTERNAL inline T atomic_##name(T& object, T operand, memory_order order, \
                                       [[maybe_unused]] memory_scope scope) {    \
    LUMEN_ATOMIC_STEP(name, __VA_ARGS__)                                         \
  }
LUMEN_ATOMIC_FETCH(fetch_add, __atomic_fetch_add(&object, operand, builtin_order(order)))
LUMEN_ATOMIC_FETCH(fetch_sub, __atomic_fetch_sub(&object, operand, builtin_order(order)))
LUMEN_ATOMIC_FETCH(fetch_and, __atomic_fetch_and(&object, operand, builtin_order(order)))
LUMEN_ATOMIC_FETCH(fetch_or, __atomic_fetch_or(&object, operand, builtin_order(order)))
LUMEN_ATOMIC_FETCH(fetch_xor, __atomic_fetch_xor(&object, operand, builtin_order(order)))
LUMEN_ATOMIC_FETCH(fetch_min,
                   atomic_update(
                       object, [operand](T before) { return operand < before ? operand : before; },
                       order, scope))
LUMEN_ATOMIC_FETCH(fetch_max,
                   atomic_update(
                       object, [operand](T before) { return before < operand ? operand : before; },
                       order, scope))
#undef LUMEN_ATOMIC_FETCH
#undef LUMEN_ATOMIC_STEP

}  // namespace detail

LUMEN_NAMESPACE_END
