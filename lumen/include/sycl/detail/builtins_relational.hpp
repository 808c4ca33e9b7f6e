// SPDX-License-Identifier: Apache-2.0
// The relational functions of SYCL 2020, section 4.17.9. Scalars give bool; vecs give integers
// of the elements' size, 0 for false and -1 for true.
#pragma once

#include <cmath>
#include <type_traits>

#include "bit.hpp"
#include "builtins_lift.hpp"
#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

#define LUMEN_RELATION_1(name, ...)                                        \
  SYCL_EXTERNAL inline bool name(float x) {                                \
    return __VA_ARGS__;                                                    \
  }                                                                        \
  SYCL_EXTERNAL inline bool name(double x) {                               \
    return __VA_ARGS__;                                                    \
  }                                                                        \
  template <typename V, typename A = detail::real_vec<V>>                  \
  SYCL_EXTERNAL auto name(const V& x) {                                    \
    const A a = x;                                                         \
    detail::vec_like<detail::mask_of<typename A::element_type>, A> result; \
    for (int i = 0; i < detail::count_of<A>; ++i) {                        \
      result[i] = name(a[i]) ? -1 : 0;                                     \
    }                                                                      \
    return result;                                                         \
  }
#define LUMEN_RELATION_2(name, ...)                                                        \
  SYCL_EXTERNAL inline bool name(float x, float y) {                                       \
    return __VA_ARGS__;                                                                    \
  }                                                                                        \
  SYCL_EXTERNAL inline bool name(double x, double y) {                                     \
    return __VA_ARGS__;                                                                    \
  }                                                                                        \
  template <typename V, typename W, typename A = detail::same_vec<detail::real_vec, V, W>> \
  SYCL_EXTERNAL auto name(const V& x, const W& y) {                                        \
    const A a = x;                                                                         \
    const A b = y;                                                                         \
    detail::vec_like<detail::mask_of<typename A::element_type>, A> result;                 \
    for (int i = 0; i < detail::count_of<A>; ++i) {                                        \
      result[i] = name(a[i], b[i]) ? -1 : 0;                                               \
    }                                                                                      \
    return result;                                                                         \
  }

LUMEN_RELATION_1(isfinite, std::isfinite(x))
LUMEN_RELATION_1(isinf, std::isinf(x))
LUMEN_RELATION_1(isnan, std::isnan(x))
LUMEN_RELATION_1(isnormal, std::isnormal(x))
LUMEN_RELATION_1(signbit, std::signbit(x))
LUMEN_RELATION_2(isequal, x == y)
LUMEN_RELATION_2(isnotequal, x != y)
LUMEN_RELATION_2(isgreater, std::isgreater(x, y))
LUMEN_RELATION_2(isgreaterequal, std::isgreaterequal(x, y))
LUMEN_RELATION_2(isless, std::isless(x, y))
LUMEN_RELATION_2(islessequal, std::islessequal(x, y))
LUMEN_RELATION_2(islessgreater, std::islessgreater(x, y))
LUMEN_RELATION_2(isordered, !std::isunordered(x, y))
LUMEN_RELATION_2(isunordered, std::isunordered(x, y))
#undef LUMEN_RELATION_1
#undef LUMEN_RELATION_2

namespace detail {
template <typename T>
using if_signed = std::enable_if_t<is_integer<T> && std::is_signed_v<T>, int>;
template <typename V>
using signed_vec = vec_if<integer_vec<V>, std::is_signed_v<typename any_vec<V>::element_type>>;
}  // namespace detail

// Whether the most significant bit is set, in any or in all elements.
template <typename T, detail::if_signed<T> = 0>
SYCL_EXTERNAL constexpr bool any(T x) {
  return x < 0;
}
template <typename T, detail::if_signed<T> = 0>
SYCL_EXTERNAL constexpr bool all(T x) {
  return x < 0;
}
template <typename V, typename A = detail::signed_vec<V>>
SYCL_EXTERNAL bool any(const V& x) {
  const A a = x;
  bool found = false;
  for (int i = 0; i < detail::count_of<A>; ++i) {
    found = found || a[i] < 0;
  }
  return found;
}
template <typename V, typename A = detail::signed_vec<V>>
SYCL_EXTERNAL bool all(const V& x) {
  const A a = x;
  bool kept = true;
  for (int i = 0; i < detail::count_of<A>; ++i) {
    kept = kept && a[i] < 0;
  }
  return kept;
}

// Each bit of y where z has a one, of x where it has a zero.
template <typename T, std::enable_if_t<detail::is_integer<T> || detail::is_real<T>, int> = 0>
SYCL_EXTERNAL T bitselect(T x, T y, T z) {
  using bits = std::make_unsigned_t<detail::mask_of<T>>;
  const auto chosen = sycl::bit_cast<bits>(z);
  return sycl::bit_cast<T>(
      static_cast<bits>((sycl::bit_cast<bits>(x) & ~chosen) | (sycl::bit_cast<bits>(y) & chosen)));
}
LUMEN_LIFT_3(any_vec, bitselect)

// y where the condition holds, else x. A condition for each element holds if its most
// significant bit is set.
template <typename T, std::enable_if_t<detail::is_integer<T> || detail::is_real<T>, int> = 0>
SYCL_EXTERNAL constexpr T select(T x, T y, bool condition) {
  return condition ? y : x;
}

namespace detail {
template <typename A>
SYCL_EXTERNAL A select_elements(const A& x, const A& y,
                                const vec_like<mask_of<typename A::element_type>, A>& mask) {
  A result;
  LUMEN_UNROLL for (int i = 0; i < count_of<A>; ++i) {
    result[i] = mask[i] < 0 ? y[i] : x[i];
  }
  return result;
}
}  // namespace detail

template <typename V, typename W, typename A = detail::same_vec<detail::any_vec, V, W>>
SYCL_EXTERNAL A select(const V& x, const W& y,
                       const detail::vec_like<detail::mask_of<typename A::element_type>, A>& z) {
  return detail::select_elements<A>(x, y, z);
}
template <typename V, typename W, typename A = detail::same_vec<detail::any_vec, V, W>>
SYCL_EXTERNAL A select(
    const V& x, const W& y,
    const detail::vec_like<std::make_unsigned_t<detail::mask_of<typename A::element_type>>, A>& z) {
  using mask = detail::vec_like<detail::mask_of<typename A::element_type>, A>;
  return detail::select_elements<A>(x, y, z.template as<mask>());
}

LUMEN_NAMESPACE_END
