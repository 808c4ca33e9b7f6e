// SPDX-License-Identifier: Apache-2.0
// Identities of the standard function objects (SYCL 2020, section 4.17.2): where a scan or a
// reduction starts from.
#pragma once

#include <limits>
#include <type_traits>

#include "functional.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
enum class identity_kind : char { unknown, zero, one, all_ones, lowest, highest };

template <typename Op, typename T>
struct identity_of {
  static constexpr identity_kind kind = identity_kind::unknown;
};
// Function objects are known by their own type of operand and in their void form.
#define LUMEN_IDENTITY(op, condition, which)                         \
  template <typename T>                                              \
  struct identity_of<op<T>, T> {                                     \
    static constexpr identity_kind kind =                            \
        (condition) ? identity_kind::which : identity_kind::unknown; \
  };                                                                 \
  template <typename T>                                              \
  struct identity_of<op<void>, T> : identity_of<op<T>, T> {};
LUMEN_IDENTITY(plus, std::is_arithmetic_v<T>, zero)
LUMEN_IDENTITY(multiplies, std::is_arithmetic_v<T>, one)
LUMEN_IDENTITY(bit_and, std::is_integral_v<T>, all_ones)
LUMEN_IDENTITY(bit_or, std::is_integral_v<T>, zero)
LUMEN_IDENTITY(bit_xor, std::is_integral_v<T>, zero)
LUMEN_IDENTITY(logical_and, (std::is_same_v<T, bool>), one)
LUMEN_IDENTITY(logical_or, (std::is_same_v<T, bool>), zero)
LUMEN_IDENTITY(minimum, std::is_arithmetic_v<T>, highest)
LUMEN_IDENTITY(maximum, std::is_arithmetic_v<T>, lowest)
#undef LUMEN_IDENTITY

template <typename T>
SYCL_EXTERNAL constexpr T identity_value(identity_kind kind) {
  using limits = std::numeric_limits<T>;
  switch (kind) {
    case identity_kind::one:
      return T(1);
    case identity_kind::all_ones:
      if constexpr (std::is_integral_v<T>) {
        return static_cast<T>(~T(0));
      }
      break;
    case identity_kind::lowest:
      return limits::has_infinity ? static_cast<T>(-limits::infinity()) : limits::lowest();
    case identity_kind::highest:
      return limits::has_infinity ? limits::infinity() : limits::max();
    default:
      break;
  }
  return T(0);
}
}  // namespace detail

template <typename Op, typename T>
struct has_known_identity : std::bool_constant<detail::identity_of<Op, std::remove_cv_t<T>>::kind !=
                                               detail::identity_kind::unknown> {};
template <typename Op, typename T>
inline constexpr bool has_known_identity_v = has_known_identity<Op, T>::value;

template <typename Op, typename T>
struct known_identity {
  static_assert(has_known_identity_v<Op, T>, "no identity is known for this operation");
  static constexpr T value = detail::identity_value<std::remove_cv_t<T>>(
      detail::identity_of<Op, std::remove_cv_t<T>>::kind);
};
// Kernels may pass it by reference, for which code for GPUs needs a copy in the device's memory.
#if defined(__CUDA_ARCH__)
template <typename Op, typename T>
static __device__ constexpr T known_identity_v = known_identity<Op, T>::value;
#else
template <typename Op, typename T>
inline constexpr T known_identity_v = known_identity<Op, T>::value;
#endif

LUMEN_NAMESPACE_END
