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

// `nearest` is x rounded to nearest; the result is x rounded as Mode says. The comparisons need
// a type that holds both exactly, which long double is for elements of up to 64 bits.
template <rounding_mode Mode, typename To, typename From>
SYCL_EXTERNAL To correct_rounding(To nearest, From x) {
  constexpr To infinity = std::numeric_limits<To>::infinity();
  const auto rounded = static_cast<long double>(nearest);
  const auto exact = static_cast<long double>(x);
  const bool downwards = Mode == rounding_mode::rtn || (Mode == rounding_mode::rtz && exact > 0);
  if (downwards) {
    return rounded > exact ? std::nextafter(nearest, -infinity) : nearest;
  }
  return rounded < exact ? std::nextafter(nearest, infinity) : nearest;
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
    return correct_rounding<Mode>(static_cast<To>(x), x);
  } else {
    return static_cast<To>(x);
  }
}

}  // namespace detail

LUMEN_NAMESPACE_END
