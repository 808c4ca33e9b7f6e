// SPDX-License-Identifier: Apache-2.0
// The integer functions of SYCL 2020, section 4.17.6, for every integer type but bool.
// min, max and clamp are with the common functions, which have the same overloads for vecs.
#pragma once

#include <cstdint>
#include <type_traits>

#include "builtins_lift.hpp"
#include "config.hpp"
#include "integer_functions.hpp"

LUMEN_NAMESPACE_BEGIN

#define LUMEN_INTEGER_1(name, ...)                 \
  template <typename T, detail::if_integer<T> = 0> \
  SYCL_EXTERNAL constexpr T name(T x) {            \
    return __VA_ARGS__;                            \
  }                                                \
  LUMEN_LIFT_1(integer_vec, name)
#define LUMEN_INTEGER_2(name, ...)                 \
  template <typename T, detail::if_integer<T> = 0> \
  SYCL_EXTERNAL constexpr T name(T x, T y) {       \
    return __VA_ARGS__;                            \
  }                                                \
  LUMEN_LIFT_2(integer_vec, name)
#define LUMEN_INTEGER_3(name, ...)                 \
  template <typename T, detail::if_integer<T> = 0> \
  SYCL_EXTERNAL constexpr T name(T x, T y, T z) {  \
    return __VA_ARGS__;                            \
  }                                                \
  LUMEN_LIFT_3(integer_vec, name)

LUMEN_INTEGER_1(abs, detail::is_negative(x) ? detail::wrapping_subtract(T(0), x) : x)
LUMEN_INTEGER_1(clz, detail::leading_zeros(x))
LUMEN_INTEGER_1(ctz, detail::trailing_zeros(x))
LUMEN_INTEGER_1(popcount, detail::count_ones(x))

LUMEN_INTEGER_2(abs_diff, x < y ? detail::wrapping_subtract(y, x) : detail::wrapping_subtract(x, y))
LUMEN_INTEGER_2(add_sat, detail::add_saturated(x, y))
LUMEN_INTEGER_2(hadd, detail::mean_down(x, y))
LUMEN_INTEGER_2(mul_hi, detail::multiply_high(x, y))
LUMEN_INTEGER_2(rhadd, detail::mean_up(x, y))
LUMEN_INTEGER_2(rotate, detail::rotate_left(x, y))
LUMEN_INTEGER_2(sub_sat, detail::subtract_saturated(x, y))

LUMEN_INTEGER_3(mad_hi, detail::wrapping_add(detail::multiply_high(x, y), z))
LUMEN_INTEGER_3(mad_sat, detail::multiply_add_saturated(x, y, z))

#undef LUMEN_INTEGER_1
#undef LUMEN_INTEGER_2
#undef LUMEN_INTEGER_3

// 32-bit products of operands that fit 24 bits; the result wraps to 32 bits.
#define LUMEN_INTEGER_24(T)                        \
  SYCL_EXTERNAL constexpr T mul24(T x, T y) {      \
    return detail::wrapping_multiply(x, y);        \
  }                                                \
  SYCL_EXTERNAL constexpr T mad24(T x, T y, T z) { \
    return detail::wrapping_add(mul24(x, y), z);   \
  }
LUMEN_INTEGER_24(std::int32_t)
LUMEN_INTEGER_24(std::uint32_t)
#undef LUMEN_INTEGER_24

namespace detail {
template <typename V>
using word_vec = vec_if<integer_vec<V>, sizeof(typename any_vec<V>::element_type) == 4>;
}
LUMEN_LIFT_2(word_vec, mul24)
LUMEN_LIFT_3(word_vec, mad24)

// The integer of twice the width made of a high half and an unsigned low half.
template <typename T, detail::if_integer<T> = 0>
SYCL_EXTERNAL constexpr typename detail::wider<T>::type upsample(T high,
                                                                 detail::unsigned_of<T> low) {
  return detail::join_halves(high, low);
}
template <typename V, typename A = detail::integer_vec<V>, typename T = typename A::element_type,
          typename Wide = typename detail::wider<T>::type>
SYCL_EXTERNAL detail::vec_like<Wide, A> upsample(
    const V& high, const detail::vec_like<detail::unsigned_of<T>, A>& low) {
  const A upper = high;
  detail::vec_like<Wide, A> result;
  for (int i = 0; i < detail::count_of<A>; ++i) {
    result[i] = detail::join_halves(upper[i], low[i]);
  }
  return result;
}

LUMEN_NAMESPACE_END
