// SPDX-License-Identifier: Apache-2.0
// The operators of vec (SYCL 2020, section 4.14.2) as friends that only argument-dependent lookup
// finds, so that swizzles and scalars convert to the vec they meet. All work element by element.
#pragma once

#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "config.hpp"

// Loops over the elements of a vec become straight code at any level of optimisation above none;
// left to itself, GCC keeps them as loops over memory at -O2.
#if defined(__clang__) || defined(__CUDA_ARCH__)
#define LUMEN_UNROLL _Pragma("unroll")
#elif defined(__CUDACC__)
#define LUMEN_UNROLL  // The front end of nvcc refuses what the GCC behind it knows.
#else
#define LUMEN_UNROLL _Pragma("GCC unroll 16")
#endif

LUMEN_NAMESPACE_BEGIN

template <typename T, int N>
class vec;

namespace detail {

template <std::size_t Bytes>
struct signed_of_size;
template <>
struct signed_of_size<1> {
  using type = std::int8_t;
};
template <>
struct signed_of_size<2> {
  using type = std::int16_t;
};
template <>
struct signed_of_size<4> {
  using type = std::int32_t;
};
template <>
struct signed_of_size<8> {
  using type = std::int64_t;
};

// The element type of the result of comparing elements of type T: 0 is false, -1 is true.
template <typename T>
using mask_of = typename signed_of_size<sizeof(T)>::type;

template <typename T>
inline constexpr bool has_bits = std::is_integral_v<T> || std::is_same_v<T, std::byte>;

// A scalar operand: whatever converts to an element without being a vec itself.
template <typename S, typename V, typename T>
inline constexpr bool is_scalar_for =
    std::is_convertible_v<S, T> && !std::is_convertible_v<S, const V&>;
template <typename S, typename T>
inline constexpr bool is_scalar_for<S, vec<T, 1>, T> = std::is_arithmetic_v<S>;

template <typename V, typename T, int N>
struct vec_operators {
// `U` makes each operator a template, so that one which T lacks drops out of overload resolution.
#define LUMEN_VEC_BINARY(op, available)                                       \
  template <typename U = T, std::enable_if_t<available, int> = 0>             \
  SYCL_EXTERNAL friend constexpr V operator op(const V& a, const V& b) {      \
    V result;                                                                 \
    LUMEN_UNROLL for (int i = 0; i < N; ++i) {                                \
      result[i] = static_cast<T>(a[i] op b[i]);                               \
    }                                                                         \
    return result;                                                            \
  }                                                                           \
  template <typename S, typename U = T,                                       \
            std::enable_if_t<(available) && is_scalar_for<S, V, T>, int> = 0> \
  SYCL_EXTERNAL friend constexpr V operator op(const V& a, const S& b) {      \
    return a op V(static_cast<T>(b));                                         \
  }                                                                           \
  template <typename S, typename U = T,                                       \
            std::enable_if_t<(available) && is_scalar_for<S, V, T>, int> = 0> \
  SYCL_EXTERNAL friend constexpr V operator op(const S& a, const V& b) {      \
    return V(static_cast<T>(a)) op b;                                         \
  }                                                                           \
  template <typename U = T, std::enable_if_t<available, int> = 0>             \
  SYCL_EXTERNAL friend constexpr V& operator op##=(V& a, const V& b) {        \
    return a = a op b;                                                        \
  }                                                                           \
  template <typename S, typename U = T,                                       \
            std::enable_if_t<(available) && is_scalar_for<S, V, T>, int> = 0> \
  SYCL_EXTERNAL friend constexpr V& operator op##=(V& a, const S& b) {        \
    return a = a op V(static_cast<T>(b));                                     \
  }

  LUMEN_VEC_BINARY(+, std::is_arithmetic_v<U>)
  LUMEN_VEC_BINARY(-, std::is_arithmetic_v<U>)
  LUMEN_VEC_BINARY(*, std::is_arithmetic_v<U>)
  LUMEN_VEC_BINARY(/, std::is_arithmetic_v<U>)
  LUMEN_VEC_BINARY(%, std::is_integral_v<U>)
  LUMEN_VEC_BINARY(&, has_bits<U>)
  LUMEN_VEC_BINARY(|, has_bits<U>)
  LUMEN_VEC_BINARY(^, has_bits<U>)
  LUMEN_VEC_BINARY(<<, std::is_integral_v<U>)
  LUMEN_VEC_BINARY(>>, std::is_integral_v<U>)
#undef LUMEN_VEC_BINARY

#define LUMEN_VEC_COMPARISON(op, truth)                                                   \
  SYCL_EXTERNAL friend constexpr vec<mask_of<T>, N> operator op(const V& a, const V& b) { \
    vec<mask_of<T>, N> result;                                                            \
    LUMEN_UNROLL for (int i = 0; i < N; ++i) {                                            \
      result[i] = (truth) ? mask_of<T>(-1) : mask_of<T>(0);                               \
    }                                                                                     \
    return result;                                                                        \
  }                                                                                       \
  template <typename S, std::enable_if_t<is_scalar_for<S, V, T>, int> = 0>                \
  SYCL_EXTERNAL friend constexpr vec<mask_of<T>, N> operator op(const V& a, const S& b) { \
    return a op V(static_cast<T>(b));                                                     \
  }                                                                                       \
  template <typename S, std::enable_if_t<is_scalar_for<S, V, T>, int> = 0>                \
  SYCL_EXTERNAL friend constexpr vec<mask_of<T>, N> operator op(const S& a, const V& b) { \
    return V(static_cast<T>(a)) op b;                                                     \
  }

  LUMEN_VEC_COMPARISON(==, a[i] == b[i])
  LUMEN_VEC_COMPARISON(!=, a[i] != b[i])
  LUMEN_VEC_COMPARISON(<, a[i] < b[i])
  LUMEN_VEC_COMPARISON(>, a[i] > b[i])
  LUMEN_VEC_COMPARISON(<=, a[i] <= b[i])
  LUMEN_VEC_COMPARISON(>=, a[i] >= b[i])
  LUMEN_VEC_COMPARISON(&&, (a[i] != T(0)) && (b[i] != T(0)))
  LUMEN_VEC_COMPARISON(||, (a[i] != T(0)) || (b[i] != T(0)))
#undef LUMEN_VEC_COMPARISON

#define LUMEN_VEC_UNARY(op, available)                            \
  template <typename U = T, std::enable_if_t<available, int> = 0> \
  SYCL_EXTERNAL friend constexpr V operator op(const V& a) {      \
    V result;                                                     \
    LUMEN_UNROLL for (int i = 0; i < N; ++i) {                    \
      result[i] = static_cast<T>(op a[i]);                        \
    }                                                             \
    return result;                                                \
  }

  LUMEN_VEC_UNARY(+, std::is_arithmetic_v<U>)
  LUMEN_VEC_UNARY(-, std::is_arithmetic_v<U>)
  LUMEN_VEC_UNARY(~, has_bits<U>)
#undef LUMEN_VEC_UNARY

  SYCL_EXTERNAL friend constexpr vec<mask_of<T>, N> operator!(const V& a) {
    return a == V(T(0));
  }

#define LUMEN_VEC_STEP(op)                                                      \
  template <typename U = T, std::enable_if_t<std::is_arithmetic_v<U>, int> = 0> \
  SYCL_EXTERNAL friend constexpr V& operator op##op(V& a) {                     \
    return a = a op V(T(1));                                                    \
  }                                                                             \
  template <typename U = T, std::enable_if_t<std::is_arithmetic_v<U>, int> = 0> \
  SYCL_EXTERNAL friend constexpr V operator op##op(V& a, int) {                 \
    const V before = a;                                                         \
    a = a op V(T(1));                                                           \
    return before;                                                              \
  }

  LUMEN_VEC_STEP(+)
  LUMEN_VEC_STEP(-)
#undef LUMEN_VEC_STEP
};

}  // namespace detail

LUMEN_NAMESPACE_END
