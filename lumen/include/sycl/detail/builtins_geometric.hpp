// SPDX-License-Identifier: Apache-2.0
// The geometric functions of SYCL 2020, section 4.17.8, for scalars and vecs of 2 to 4 elements.
// length and what rests on it do not overflow where the result is finite; the fast forms square.
#pragma once

#include <cmath>

#include "builtins_lift.hpp"
#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
template <typename V>
using real_point = vec_if<real_vec<V>, (count_of<any_vec<V>> <= 4)>;
template <typename V>
using float_point = vec_if<float_vec<V>, (count_of<any_vec<V>> <= 4)>;
template <typename V>
using spatial_point = vec_if<real_point<V>, (count_of<any_vec<V>> >= 3)>;
}  // namespace detail

// A fourth element of the operands is ignored; that of the result is 0.
template <typename V, typename W, typename A = detail::same_vec<detail::spatial_point, V, W>>
SYCL_EXTERNAL A cross(const V& x, const W& y) {
  const A a = x;
  const A b = y;
  A result;
  for (int i = 0; i < 3; ++i) {
    const int j = (i + 1) % 3;
    const int k = (i + 2) % 3;
    result[i] = a[j] * b[k] - a[k] * b[j];
  }
  return result;
}

#define LUMEN_GEOMETRIC_SCALARS(T)              \
  SYCL_EXTERNAL inline T dot(T x, T y) {        \
    return x * y;                               \
  }                                             \
  SYCL_EXTERNAL inline T length(T x) {          \
    return std::fabs(x);                        \
  }                                             \
  SYCL_EXTERNAL inline T distance(T x, T y) {   \
    return std::fabs(x - y);                    \
  }                                             \
  SYCL_EXTERNAL inline T normalize(T x) {       \
    return x == 0 ? x : std::copysign(T(1), x); \
  }
LUMEN_GEOMETRIC_SCALARS(float)
LUMEN_GEOMETRIC_SCALARS(double)
#undef LUMEN_GEOMETRIC_SCALARS

template <typename V, typename W, typename A = detail::same_vec<detail::real_point, V, W>>
SYCL_EXTERNAL typename A::element_type dot(const V& x, const W& y) {
  const A products = A(x) * A(y);
  typename A::element_type sum = products[0];
  for (int i = 1; i < detail::count_of<A>; ++i) {
    sum += products[i];
  }
  return sum;
}

template <typename V, typename A = detail::real_point<V>>
SYCL_EXTERNAL typename A::element_type length(const V& x) {
  const A a = x;
  typename A::element_type size = std::fabs(a[0]);
  for (int i = 1; i < detail::count_of<A>; ++i) {
    size = std::hypot(size, a[i]);
  }
  return size;
}

template <typename V, typename W, typename A = detail::same_vec<detail::real_point, V, W>>
SYCL_EXTERNAL typename A::element_type distance(const V& x, const W& y) {
  return length(A(x) - A(y));
}

// A vec of zeros stays as it is.
template <typename V, typename A = detail::real_point<V>>
SYCL_EXTERNAL A normalize(const V& x) {
  const A a = x;
  const typename A::element_type size = length(a);
  return size == 0 ? a : a / size;
}

SYCL_EXTERNAL inline float fast_length(float x) {
  return length(x);
}
SYCL_EXTERNAL inline float fast_distance(float x, float y) {
  return distance(x, y);
}
SYCL_EXTERNAL inline float fast_normalize(float x) {
  return normalize(x);
}

template <typename V, typename A = detail::float_point<V>>
SYCL_EXTERNAL float fast_length(const V& x) {
  return std::sqrt(dot(x, x));
}
template <typename V, typename W, typename A = detail::same_vec<detail::float_point, V, W>>
SYCL_EXTERNAL float fast_distance(const V& x, const W& y) {
  return fast_length(A(x) - A(y));
}
template <typename V, typename A = detail::float_point<V>>
SYCL_EXTERNAL A fast_normalize(const V& x) {
  const A a = x;
  const float size = fast_length(a);
  return size == 0 ? a : a / size;
}

LUMEN_NAMESPACE_END
