// SPDX-License-Identifier: Apache-2.0
// Conversion of one element under the rounding modes of vec::convert (SYCL 2020, 4.14.2.3).
#pragma once

#include <cmath>
#include <limits>
#include <type_traits>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

// `automatic` is the C++ conversion: towards zero to integers, to nearest to floating types.
enum class rounding_mode { automatic, rte, rtz, rtp, rtn };

namespace detail {

template <rounding_mode Mode, typename From>
SYCL_EXTERNAL From round_to_integral(From x) {
  if constexpr (Mode == rounding_mode::rte) {
    return std::rint(x);
  } else if constexpr (Mode == rounding_mode::rtp) {
    return std::ceil(x);
  } else if constexpr (Mode == rounding_mode::rtn) {
    return std::floor(x);
  } else {
    return std::trunc(x);
  }
}

#if defined(__CUDA_ARCH__)
// The conversions of the instruction set for the widest types; all others end in one of them or
// are exact.
#define LUMEN_CONVERT_DIRECTED(To, From, intrinsic)             \
  template <rounding_mode Mode>                                 \
  __device__ inline void convert_directed(From x, To& result) { \
    result = Mode == rounding_mode::rtz   ? intrinsic##_rz(x)   \
             : Mode == rounding_mode::rtp ? intrinsic##_ru(x)   \
                                          : intrinsic##_rd(x);  \
  }
LUMEN_CONVERT_DIRECTED(float, double, __double2float)
LUMEN_CONVERT_DIRECTED(float, long long, __ll2float)
LUMEN_CONVERT_DIRECTED(float, unsigned long long, __ull2float)
LUMEN_CONVERT_DIRECTED(double, long long, __ll2double)
LUMEN_CONVERT_DIRECTED(double, unsigned long long, __ull2double)
#undef LUMEN_CONVERT_DIRECTED
#endif

// x rounded as Mode says. On the host the value rounded to nearest is corrected by one step; the
// comparisons need a type that holds both exactly, which long double is for up to 64 bits.
template <rounding_mode Mode, typename To, typename From>
SYCL_EXTERNAL To round_directed(From x) {
#if defined(__CUDA_ARCH__)
  using widest_integer = std::conditional_t<std::is_signed_v<From>, long long, unsigned long long>;
  using widest = std::conditional_t<std::is_floating_point_v<From>, double, widest_integer>;
  if constexpr (std::is_floating_point_v<From> && sizeof(From) <= sizeof(To)) {
    return static_cast<To>(x);
  } else {
    To result;
    convert_directed<Mode>(static_cast<widest>(x), result);
    return result;
  }
#else
  const auto nearest = static_cast<To>(x);
  constexpr To infinity = std::numeric_limits<To>::infinity();
  const auto rounded = static_cast<long double>(nearest);
  const auto exact = static_cast<long double>(x);
  const bool downwards = Mode == rounding_mode::rtn || (Mode == rounding_mode::rtz && exact > 0);
  if (downwards) {
    return rounded > exact ? std::nextafter(nearest, -infinity) : nearest;
  }
  return rounded < exact ? std::nextafter(nearest, infinity) : nearest;
#endif
}

template <typename To, rounding_mode Mode, typename From>
SYCL_EXTERNAL constexpr To convert_element(From x) {
  constexpr bool from_floating = std::is_floating_point_v<From>;
  constexpr bool to_floating = std::is_floating_point_v<To>;
  constexpr bool directed =
      Mode == rounding_mode::rtz || Mode == rounding_mode::rtp || Mode == rounding_mode::rtn;
  if constexpr (from_floating && !to_floating && Mode != rounding_mode::automatic) {
    return static_cast<To>(round_to_integral<Mode>(x));
  } else if constexpr (to_floating && directed) {
    return round_directed<Mode, To>(x);
  } else {
    return static_cast<To>(x);
  }
}

}  // namespace detail

LUMEN_NAMESPACE_END
