// SPDX-License-Identifier: Apache-2.0
// The common functions of SYCL 2020, section 4.17.7, for float and double.
#pragma once

#include <cmath>

#include "builtins_lift.hpp"
#include "config.hpp"
#include "real_functions.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// 1 or -1 with the sign of x, x itself for zeros, 0 for NaN.
template <typename T>
SYCL_EXTERNAL T sign_of(T x) {
  return std::isnan(x) ? T(0) : x == 0 ? x : std::copysign(T(1), x);
}

// 0 below `from`, 1 above `to`, and the cubic with level ends between them.
template <typename T>
SYCL_EXTERNAL T smooth_between(T from, T to, T x) {
  const T t = std::fmin(std::fmax((x - from) / (to - from), T(0)), T(1));
  return t * t * (3 - 2 * t);
}

}  // namespace detail

// min, max and clamp take integers as well (section 4.17.6).
#define LUMEN_ORDER_2(name, ...)                   \
  LUMEN_SCALAR_2(float, name, __VA_ARGS__)         \
  LUMEN_SCALAR_2(double, name, __VA_ARGS__)        \
  template <typename T, detail::if_integer<T> = 0> \
  SYCL_EXTERNAL constexpr T name(T x, T y) {       \
    return __VA_ARGS__;                            \
  }                                                \
  LUMEN_LIFT_2(any_vec, name)                      \
  LUMEN_LIFT_2_SCALAR(any_vec, name)
LUMEN_ORDER_2(max, x < y ? y : x)
LUMEN_ORDER_2(min, y < x ? y : x)
#undef LUMEN_ORDER_2

LUMEN_SCALAR_3(float, clamp, std::fmin(std::fmax(x, y), z))
LUMEN_SCALAR_3(double, clamp, std::fmin(std::fmax(x, y), z))
template <typename T, detail::if_integer<T> = 0>
SYCL_EXTERNAL constexpr T clamp(T x, T lowest, T highest) {
  return min(max(x, lowest), highest);
}
LUMEN_LIFT_3(any_vec, clamp)
template <typename V, typename A = detail::any_vec<V>>
SYCL_EXTERNAL A clamp(const V& x, typename A::element_type lowest,
                      typename A::element_type highest) {
  return clamp(A(x), A(lowest), A(highest));
}

LUMEN_REAL_1(degrees, (180 / detail::pi_of<decltype(x)>)*x)
LUMEN_REAL_1(radians, (detail::pi_of<decltype(x)> / 180) * x)
LUMEN_REAL_1(sign, detail::sign_of(x))

LUMEN_REAL_2(step, y < x ? decltype(x)(0) : decltype(x)(1))
template <typename V, typename A = detail::real_vec<V>>
SYCL_EXTERNAL A step(typename A::element_type edge, const V& x) {
  return step(A(edge), A(x));
}

LUMEN_REAL_3(mix, x + (y - x) * z)
template <typename V, typename W, typename A = detail::same_vec<detail::real_vec, V, W>>
SYCL_EXTERNAL A mix(const V& x, const W& y, typename A::element_type weight) {
  return mix(A(x), A(y), A(weight));
}
LUMEN_REAL_3(smoothstep, detail::smooth_between(x, y, z))
template <typename V, typename A = detail::real_vec<V>>
SYCL_EXTERNAL A smoothstep(typename A::element_type from, typename A::element_type to, const V& x) {
  return smoothstep(A(from), A(to), A(x));
}

LUMEN_NAMESPACE_END
