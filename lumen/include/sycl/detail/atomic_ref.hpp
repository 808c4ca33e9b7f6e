// SPDX-License-Identifier: Apache-2.0
// Atomics of SYCL 2020, section 4.15.3: atomic_ref and atomic_fence.
#pragma once

#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "access.hpp"
#include "atomic_operations.hpp"
#include "config.hpp"
#include "memory_order.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
// What fetch_add and fetch_sub take: a distance for pointers, a value for numbers.
template <typename T>
struct atomic_difference {
  using type = T;
};
template <typename T>
struct atomic_difference<T*> {
  using type = std::ptrdiff_t;
};

}  // namespace detail

// GCC warns that its thread sanitizer does not see fences; that is no fault of the caller.
#if defined(__SANITIZE_THREAD__) && !defined(__clang__)
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wtsan"
#endif
SYCL_EXTERNAL inline void atomic_fence(memory_order order, [[maybe_unused]] memory_scope scope) {
#if defined(__CUDA_ARCH__)
  cuda::atomic_thread_fence(detail::cuda_order(order), detail::cuda_scope(scope));
#else
  __atomic_thread_fence(detail::builtin_order(order));
#endif
}
#if defined(__SANITIZE_THREAD__) && !defined(__clang__)
#pragma GCC diagnostic pop
#endif

// A view of an object of type T through which all access is atomic: an integer of 32 or 64 bits,
// a float, a double, or a pointer.
template <typename T, memory_order DefaultOrder, memory_scope DefaultScope,
          access::address_space Space = access::address_space::generic_space>
class atomic_ref {
  static constexpr bool integral = std::is_integral_v<T> && !std::is_same_v<T, bool>;
  static constexpr bool numeric = integral || std::is_floating_point_v<T>;
  static constexpr bool adds_directly = integral || (numeric && detail::atomic_adds_reals);
  static_assert((numeric || std::is_pointer_v<T>)&&(sizeof(T) == 4 || sizeof(T) == 8),
                "atomic_ref takes integers and floating types of 32 or 64 bits, and pointers");
  static_assert(DefaultOrder == memory_order::relaxed || DefaultOrder == memory_order::acq_rel ||
                    DefaultOrder == memory_order::seq_cst,
                "the default order must suit loads and stores alike");

 public:
  using value_type = T;
  using difference_type = typename detail::atomic_difference<T>::type;

  static constexpr std::size_t required_alignment = sizeof(T);
  static constexpr bool is_always_lock_free = true;
  static constexpr memory_order default_read_order = detail::read_order_of(DefaultOrder);
  static constexpr memory_order default_write_order = detail::write_order_of(DefaultOrder);
  static constexpr memory_order default_read_modify_write_order = DefaultOrder;
  static constexpr memory_scope default_scope = DefaultScope;

  SYCL_EXTERNAL explicit atomic_ref(T& object) noexcept : object_(&object) {}
  atomic_ref(const atomic_ref&) noexcept = default;
  atomic_ref& operator=(const atomic_ref&) = delete;

  SYCL_EXTERNAL bool is_lock_free() const noexcept { return is_always_lock_free; }

  SYCL_EXTERNAL void store(T operand, memory_order order = default_write_order,
                           memory_scope scope = default_scope) const noexcept {
    detail::atomic_store(*object_, operand, order, scope);
  }
  SYCL_EXTERNAL T operator=(T operand) const noexcept {
    store(operand);
    return operand;
  }

  SYCL_EXTERNAL T load(memory_order order = default_read_order,
                       memory_scope scope = default_scope) const noexcept {
    return detail::atomic_load(*object_, order, scope);
  }
  SYCL_EXTERNAL operator T() const noexcept { return load(); }

  SYCL_EXTERNAL T exchange(T operand, memory_order order = default_read_modify_write_order,
                           memory_scope scope = default_scope) const noexcept {
    return detail::atomic_exchange(*object_, operand, order, scope);
  }

#define LUMEN_COMPARE_EXCHANGE(name, weak)                                                      \
  SYCL_EXTERNAL bool name(T& expected, T desired, memory_order success, memory_order failure,   \
                          memory_scope scope = default_scope) const noexcept {                  \
    return detail::atomic_compare_exchange<weak>(*object_, expected, desired, success, failure, \
                                                 scope);                                        \
  }                                                                                             \
  SYCL_EXTERNAL bool name(T& expected, T desired,                                               \
                          memory_order order = default_read_modify_write_order,                 \
                          memory_scope scope = default_scope) const noexcept {                  \
    return name(expected, desired, order, detail::read_order_of(order), scope);                 \
  }
  LUMEN_COMPARE_EXCHANGE(compare_exchange_weak, true)
  LUMEN_COMPARE_EXCHANGE(compare_exchange_strong, false)
#undef LUMEN_COMPARE_EXCHANGE

#define LUMEN_ATOMIC_FETCH(name)                                                        \
  template <typename U = T, std::enable_if_t<numeric && std::is_same_v<U, T>, int> = 0> \
  SYCL_EXTERNAL T name(T operand, memory_order order = default_read_modify_write_order, \
                       memory_scope scope = default_scope) const noexcept {             \
    return detail::atomic_##name(*object_, operand, order, scope);                      \
  }
  LUMEN_ATOMIC_FETCH(fetch_min)
  LUMEN_ATOMIC_FETCH(fetch_max)
#undef LUMEN_ATOMIC_FETCH

// Types with an operation of their own use it; others go through compare and exchange.
#define LUMEN_ATOMIC_FETCH(name, Operand, available, direct, op, assignment)                  \
  template <typename U = T, std::enable_if_t<available && std::is_same_v<U, T>, int> = 0>     \
  SYCL_EXTERNAL T name(Operand operand, memory_order order = default_read_modify_write_order, \
                       memory_scope scope = default_scope) const noexcept {                   \
    if constexpr (direct) {                                                                   \
      return detail::atomic_##name(*object_, operand, order, scope);                          \
    } else {                                                                                  \
      return detail::atomic_update(                                                           \
          *object_, [operand](T before) { return before op operand; }, order, scope);         \
    }                                                                                         \
  }                                                                                           \
  template <typename U = T, std::enable_if_t<available && std::is_same_v<U, T>, int> = 0>     \
  SYCL_EXTERNAL T operator assignment(Operand operand) const noexcept {                       \
    return name(operand) op operand;                                                          \
  }
  LUMEN_ATOMIC_FETCH(fetch_add, difference_type, true, adds_directly, +, +=)
  LUMEN_ATOMIC_FETCH(fetch_sub, difference_type, true, adds_directly, -, -=)
  LUMEN_ATOMIC_FETCH(fetch_and, T, integral, integral, &, &=)
  LUMEN_ATOMIC_FETCH(fetch_or, T, integral, integral, |, |=)
  LUMEN_ATOMIC_FETCH(fetch_xor, T, integral, integral, ^, ^=)
#undef LUMEN_ATOMIC_FETCH

  SYCL_EXTERNAL T operator++(int) const noexcept {
    return fetch_add(1);
  }
  SYCL_EXTERNAL T operator--(int) const noexcept {
    return fetch_sub(1);
  }
  SYCL_EXTERNAL T operator++() const noexcept {
    return *this += 1;
  }
  SYCL_EXTERNAL T operator--() const noexcept {
    return *this -= 1;
  }

 private:
  T* object_;
};

LUMEN_NAMESPACE_END
