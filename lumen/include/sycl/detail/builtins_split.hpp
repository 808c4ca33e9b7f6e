// SPDX-License-Identifier: Apache-2.0
// The math functions of SYCL 2020, section 4.17.5, that have a second result, which they write
// through a multi_ptr: fract, frexp, lgamma_r, modf, remquo and sincos.
#pragma once

#include <cmath>

#include "builtins_lift.hpp"
#include "config.hpp"
#include "real_functions.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// The scalar forms, which write through a plain pointer.
template <typename T>
SYCL_EXTERNAL T split_fract(T x, T* floor) {
  *floor = std::floor(x);
  return fraction(x, *floor);
}
template <typename T>
SYCL_EXTERNAL T split_frexp(T x, int* exponent) {
  const T part = std::frexp(x, exponent);
  if (!std::isfinite(x)) {
    *exponent = 0;  // The C library and that of CUDA leave it open.
  }
  return part;
}
template <typename T>
SYCL_EXTERNAL T split_lgamma_r(T x, int* sign) {
  return log_gamma(x, sign);
}
template <typename T>
SYCL_EXTERNAL T split_modf(T x, T* whole) {
  return std::modf(x, whole);
}
template <typename T>
SYCL_EXTERNAL T split_sincos(T x, T* cosine) {
  return sine_and_cosine(x, cosine);
}
template <typename T>
SYCL_EXTERNAL T split_remquo(T x, T y, int* quotient) {
  *quotient = 0;
  return std::remquo(x, y, quotient);
}

}  // namespace detail

// `Second` is the type of the second result for elements of type T.
#define LUMEN_SPLIT(name, Second)                                                  \
  template <typename T, typename P, std::enable_if_t<detail::is_real<T>, int> = 0, \
            detail::if_points_to<P, Second> = 0>                                   \
  SYCL_EXTERNAL T name(T x, P second) {                                            \
    return detail::split_##name(x, second.get());                                  \
  }                                                                                \
  template <typename V, typename P, typename A = detail::real_vec<V>,              \
            typename T = typename A::element_type,                                 \
            detail::if_points_to<P, detail::vec_like<Second, A>> = 0>              \
  SYCL_EXTERNAL A name(const V& x, P second) {                                     \
    const A a = x;                                                                 \
    A result;                                                                      \
    for (int i = 0; i < detail::count_of<A>; ++i) {                                \
      result[i] = detail::split_##name(a[i], &(*second.get())[i]);                 \
    }                                                                              \
    return result;                                                                 \
  }

LUMEN_SPLIT(fract, T)
LUMEN_SPLIT(frexp, int)
LUMEN_SPLIT(lgamma_r, int)
LUMEN_SPLIT(modf, T)
LUMEN_SPLIT(sincos, T)
#undef LUMEN_SPLIT

template <typename T, typename P, std::enable_if_t<detail::is_real<T>, int> = 0,
          detail::if_points_to<P, int> = 0>
SYCL_EXTERNAL T remquo(T x, T y, P quotient) {
  return detail::split_remquo(x, y, quotient.get());
}
template <typename V, typename W, typename P, typename A = detail::same_vec<detail::real_vec, V, W>,
          detail::if_points_to<P, detail::vec_like<int, A>> = 0>
SYCL_EXTERNAL A remquo(const V& x, const W& y, P quotient) {
  const A a = x;
  const A b = y;
  A result;
  for (int i = 0; i < detail::count_of<A>; ++i) {
    result[i] = detail::split_remquo(a[i], b[i], &(*quotient.get())[i]);
  }
  return result;
}

LUMEN_NAMESPACE_END
