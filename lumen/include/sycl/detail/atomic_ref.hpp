// SPDX-License-Identifier: Apache-2.0
// Atomics of SYCL 2020, section 4.15.3: memory orders and scopes, atomic_ref and atomic_fence, on
// the compiler's atomic operations. All work-items of the host share one memory, so that every
// scope is as wide as the widest.
#pragma once

#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "access.hpp"
#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

enum class memory_order : int { relaxed, acquire, release, acq_rel, seq_cst };
inline constexpr auto memory_order_relaxed = memory_order::relaxed;
inline constexpr auto memory_order_acquire = memory_order::acquire;
inline constexpr auto memory_order_release = memory_order::release;
inline constexpr auto memory_order_acq_rel = memory_order::acq_rel;
inline constexpr auto memory_order_seq_cst = memory_order::seq_cst;

enum class memory_scope : int { work_item, sub_group, work_group, device, system };
inline constexpr auto memory_scope_work_item = memory_scope::work_item;
inline constexpr auto memory_scope_sub_group = memory_scope::sub_group;
inline constexpr auto memory_scope_work_group = memory_scope::work_group;
inline constexpr auto memory_scope_device = memory_scope::device;
inline constexpr auto memory_scope_system = memory_scope::system;

namespace detail {

SYCL_EXTERNAL constexpr int builtin_order(memory_order order) {
  constexpr int orders[] = {__ATOMIC_RELAXED, __ATOMIC_ACQUIRE, __ATOMIC_RELEASE, __ATOMIC_ACQ_REL,
                            __ATOMIC_SEQ_CST};
  return orders[static_cast<int>(order)];
}

// The orders that a load, and the failing side of a compare-exchange, may have.
SYCL_EXTERNAL constexpr memory_order read_order_of(memory_order order) {
  return order == memory_order::acq_rel   ? memory_order::acquire
         : order == memory_order::release ? memory_order::relaxed
                                          : order;
}
SYCL_EXTERNAL constexpr memory_order write_order_of(memory_order order) {
  return order == memory_order::acq_rel   ? memory_order::release
         : order == memory_order::acquire ? memory_order::relaxed
                                          : order;
}

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
SYCL_EXTERNAL inline void atomic_fence(memory_order order, memory_scope) {
  __atomic_thread_fence(detail::builtin_order(order));
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
                           memory_scope = default_scope) const noexcept {
    __atomic_store(object_, &operand, detail::builtin_order(order));
  }
  SYCL_EXTERNAL T operator=(T operand) const noexcept {
    store(operand);
    return operand;
  }

  SYCL_EXTERNAL T load(memory_order order = default_read_order,
                       memory_scope = default_scope) const noexcept {
    T value;
    __atomic_load(object_, &value, detail::builtin_order(order));
    return value;
  }
  SYCL_EXTERNAL operator T() const noexcept { return load(); }

  SYCL_EXTERNAL T exchange(T operand, memory_order order = default_read_modify_write_order,
                           memory_scope = default_scope) const noexcept {
    T before;
    __atomic_exchange(object_, &operand, &before, detail::builtin_order(order));
    return before;
  }

#define LUMEN_COMPARE_EXCHANGE(name, weak)                                                    \
  SYCL_EXTERNAL bool name(T& expected, T desired, memory_order success, memory_order failure, \
                          memory_scope = default_scope) const noexcept {                      \
    return __atomic_compare_exchange(object_, &expected, &desired, weak,                      \
                                     detail::builtin_order(success),                          \
                                     detail::builtin_order(failure));                         \
  }                                                                                           \
  SYCL_EXTERNAL bool name(T& expected, T desired,                                             \
                          memory_order order = default_read_modify_write_order,               \
                          memory_scope scope = default_scope) const noexcept {                \
    return name(expected, desired, order, detail::read_order_of(order), scope);               \
  }
  LUMEN_COMPARE_EXCHANGE(compare_exchange_weak, true)
  LUMEN_COMPARE_EXCHANGE(compare_exchange_strong, false)
#undef LUMEN_COMPARE_EXCHANGE

// Each stores `next`, computed from `before` and `operand`, and returns `before`.
#define LUMEN_ATOMIC_FETCH(name, Operand, available, next)                                    \
  template <typename U = T, std::enable_if_t<available && std::is_same_v<U, T>, int> = 0>     \
  SYCL_EXTERNAL T name(Operand operand, memory_order order = default_read_modify_write_order, \
                       memory_scope = default_scope) const noexcept {                         \
    return update([operand](T before) { return static_cast<T>(next); }, order);               \
  }
  LUMEN_ATOMIC_FETCH(fetch_min, T, numeric, operand < before ? operand : before)
  LUMEN_ATOMIC_FETCH(fetch_max, T, numeric, before < operand ? operand : before)
#undef LUMEN_ATOMIC_FETCH

// Integers have instructions of their own for these; others go through compare and exchange.
#define LUMEN_ATOMIC_FETCH(name, Operand, available, builtin, op, assignment)                 \
  template <typename U = T, std::enable_if_t<available && std::is_same_v<U, T>, int> = 0>     \
  SYCL_EXTERNAL T name(Operand operand, memory_order order = default_read_modify_write_order, \
                       memory_scope = default_scope) const noexcept {                         \
    if constexpr (integral) {                                                                 \
      return builtin(object_, operand, detail::builtin_order(order));                         \
    } else {                                                                                  \
      return update([operand](T before) { return before op operand; }, order);                \
    }                                                                                         \
  }                                                                                           \
  template <typename U = T, std::enable_if_t<available && std::is_same_v<U, T>, int> = 0>     \
  SYCL_EXTERNAL T operator assignment(Operand operand) const noexcept {                       \
    return name(operand) op operand;                                                          \
  }
  LUMEN_ATOMIC_FETCH(fetch_add, difference_type, true, __atomic_fetch_add, +, +=)
  LUMEN_ATOMIC_FETCH(fetch_sub, difference_type, true, __atomic_fetch_sub, -, -=)
  LUMEN_ATOMIC_FETCH(fetch_and, T, integral, __atomic_fetch_and, &, &=)
  LUMEN_ATOMIC_FETCH(fetch_or, T, integral, __atomic_fetch_or, |, |=)
  LUMEN_ATOMIC_FETCH(fetch_xor, T, integral, __atomic_fetch_xor, ^, ^=)
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
  template <typename Next>
  SYCL_EXTERNAL T update(Next next, memory_order order) const noexcept {
    T before = load(memory_order::relaxed);
    while (!compare_exchange_weak(before, next(before), order)) {
    }
    return before;
  }

  T* object_;
};

LUMEN_NAMESPACE_END
