// SPDX-License-Identifier: Apache-2.0
// How vec and its swizzles name their elements (SYCL 2020, section 4.14.2): x() to w(), r() to
// a(), s0() to sF(), the halves lo, hi, odd, even, swizzle<...>(), and the named swizzles if the
// user defines SYCL_SIMPLE_SWIZZLES.
#pragma once

#include <type_traits>
#include <utility>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

template <typename T, int N>
class vec;

struct elem {
  static constexpr int x = 0, y = 1, z = 2, w = 3;
  static constexpr int r = 0, g = 1, b = 2, a = 3;
  static constexpr int s0 = 0, s1 = 1, s2 = 2, s3 = 3, s4 = 4, s5 = 5, s6 = 6, s7 = 7;
  static constexpr int s8 = 8, s9 = 9, sA = 10, sB = 11, sC = 12, sD = 13, sE = 14, sF = 15;
};

namespace detail {

// `Self` has operator[] and pick<I...>(), the swizzle without a check of the indexes.
template <typename Self, int N>
class vec_elements {
  static constexpr int half = (N + 1) / 2;
  using half_sequence = std::make_integer_sequence<int, half>;

 public:
#define LUMEN_VEC_ELEMENT(name, index, available)                              \
  SYCL_EXTERNAL constexpr decltype(auto) name() {                              \
    static_assert((available) && (index) < N, "this vec has no such element"); \
    return self()[index];                                                      \
  }                                                                            \
  SYCL_EXTERNAL constexpr auto name() const {                                  \
    static_assert((available) && (index) < N, "this vec has no such element"); \
    return self()[index];                                                      \
  }

  LUMEN_VEC_ELEMENT(x, 0, N <= 4)
  LUMEN_VEC_ELEMENT(y, 1, N <= 4)
  LUMEN_VEC_ELEMENT(z, 2, N <= 4)
  LUMEN_VEC_ELEMENT(w, 3, N <= 4)
  LUMEN_VEC_ELEMENT(r, 0, N == 4)
  LUMEN_VEC_ELEMENT(g, 1, N == 4)
  LUMEN_VEC_ELEMENT(b, 2, N == 4)
  LUMEN_VEC_ELEMENT(a, 3, N == 4)
  LUMEN_VEC_ELEMENT(s0, 0, true)
  LUMEN_VEC_ELEMENT(s1, 1, true)
  LUMEN_VEC_ELEMENT(s2, 2, true)
  LUMEN_VEC_ELEMENT(s3, 3, true)
  LUMEN_VEC_ELEMENT(s4, 4, true)
  LUMEN_VEC_ELEMENT(s5, 5, true)
  LUMEN_VEC_ELEMENT(s6, 6, true)
  LUMEN_VEC_ELEMENT(s7, 7, true)
  LUMEN_VEC_ELEMENT(s8, 8, true)
  LUMEN_VEC_ELEMENT(s9, 9, true)
  LUMEN_VEC_ELEMENT(sA, 10, true)
  LUMEN_VEC_ELEMENT(sB, 11, true)
  LUMEN_VEC_ELEMENT(sC, 12, true)
  LUMEN_VEC_ELEMENT(sD, 13, true)
  LUMEN_VEC_ELEMENT(sE, 14, true)
  LUMEN_VEC_ELEMENT(sF, 15, true)
#undef LUMEN_VEC_ELEMENT

// A vec of three counts as one of four here: its last odd and high element has no set value.
#define LUMEN_VEC_HALF(name, first, stride)                   \
  SYCL_EXTERNAL constexpr auto name() {                       \
    static_assert(N > 1, "one element has no halves");        \
    return pick_from<first, stride>(self(), half_sequence{}); \
  }                                                           \
  SYCL_EXTERNAL constexpr auto name() const {                 \
    static_assert(N > 1, "one element has no halves");        \
    return pick_from<first, stride>(self(), half_sequence{}); \
  }

  LUMEN_VEC_HALF(lo, 0, 1)
  LUMEN_VEC_HALF(hi, half, 1)
  LUMEN_VEC_HALF(even, 0, 2)
  LUMEN_VEC_HALF(odd, 1, 2)
#undef LUMEN_VEC_HALF

  template <int... Indexes>
  SYCL_EXTERNAL constexpr auto swizzle() {
    static_assert(((Indexes >= 0 && Indexes < N) && ...), "this vec has no such element");
    return self().template pick<Indexes...>();
  }
  template <int... Indexes>
  SYCL_EXTERNAL constexpr auto swizzle() const {
    static_assert(((Indexes >= 0 && Indexes < N) && ...), "this vec has no such element");
    return self().template pick<Indexes...>();
  }

#if defined(SYCL_SIMPLE_SWIZZLES)
#include "vec_named_swizzles.hpp"
#endif

 private:
  SYCL_EXTERNAL constexpr Self& self() {
    return static_cast<Self&>(*this);
  }
  SYCL_EXTERNAL constexpr const Self& self() const {
    return static_cast<const Self&>(*this);
  }

  template <int First, int Stride, typename S, int... I>
  SYCL_EXTERNAL static constexpr auto pick_from(S& source, std::integer_sequence<int, I...>) {
    return source.template pick<(First + Stride * I)...>();
  }
};

}  // namespace detail

LUMEN_NAMESPACE_END
