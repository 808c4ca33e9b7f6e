// SPDX-License-Identifier: Apache-2.0
// How a built-in function of scalars becomes one of vecs: constraints on argument types, and the
// macros that write the overloads. Included, and its macros undefined, by builtins.hpp.
#pragma once

#include <cstdint>
#include <type_traits>
#include <utility>

#include "config.hpp"
#include "vec.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// The vec that an argument stands for: itself, or what a swizzle of several elements converts to.
template <typename V>
struct as_vec {};
template <typename T, int N>
struct as_vec<vec<T, N>> {
  using type = vec<T, N>;
};
template <typename Result, typename Source, int First, int Second, int... Rest>
struct as_vec<swizzled_vec<Result, Source, First, Second, Rest...>> {
  using type = Result;
};

template <typename V>
using any_vec = typename as_vec<V>::type;

template <typename V, bool Available>
using vec_if = std::enable_if_t<Available, V>;

template <typename T>
inline constexpr bool is_real = std::is_same_v<T, float> || std::is_same_v<T, double>;
template <typename T>
inline constexpr bool is_integer = std::is_integral_v<T> && !std::is_same_v<T, bool>;

template <typename V>
using real_vec = vec_if<any_vec<V>, is_real<typename any_vec<V>::element_type>>;
template <typename V>
using float_vec = vec_if<any_vec<V>, std::is_same_v<typename any_vec<V>::element_type, float>>;
template <typename V>
using integer_vec = vec_if<any_vec<V>, is_integer<typename any_vec<V>::element_type>>;
// The common vec of several arguments, if they agree.
template <template <typename> class Kind, typename V, typename... More>
using same_vec = vec_if<Kind<V>, (std::is_same_v<any_vec<V>, any_vec<More>> && ...)>;

template <typename T>
using if_integer = std::enable_if_t<is_integer<T>, int>;

template <typename V>
inline constexpr int count_of = static_cast<int>(V::size());
// The vec of the same length with other elements.
template <typename T, typename V>
using vec_like = vec<T, count_of<V>>;

// A multi_ptr to values of type T. Plain pointers are no multi_ptr, as in the standard.
template <typename P, typename T>
using if_points_to =
    std::enable_if_t<std::is_same_v<decltype(std::declval<const P&>().get()), T*>, int>;

}  // namespace detail

// One scalar function of `T`; the arguments are x, y and z, the rest is the value returned.
#define LUMEN_SCALAR_1(T, name, ...) \
  SYCL_EXTERNAL inline T name(T x) { \
    return __VA_ARGS__;              \
  }
#define LUMEN_SCALAR_2(T, name, ...)      \
  SYCL_EXTERNAL inline T name(T x, T y) { \
    return __VA_ARGS__;                   \
  }
#define LUMEN_SCALAR_3(T, name, ...)           \
  SYCL_EXTERNAL inline T name(T x, T y, T z) { \
    return __VA_ARGS__;                        \
  }

// The overloads for vecs of the given kind: element i of the result is `name` of elements i.
#define LUMEN_LIFT_1(kind, name)                                 \
  template <typename V, typename A = detail::kind<V>>            \
  SYCL_EXTERNAL auto name(const V& x) {                          \
    const A a = x;                                               \
    detail::vec_like<decltype(name(a[0])), A> result;            \
    LUMEN_UNROLL for (int i = 0; i < detail::count_of<A>; ++i) { \
      result[i] = name(a[i]);                                    \
    }                                                            \
    return result;                                               \
  }
#define LUMEN_LIFT_2(kind, name)                                                       \
  template <typename V, typename W, typename A = detail::same_vec<detail::kind, V, W>> \
  SYCL_EXTERNAL A name(const V& x, const W& y) {                                       \
    const A a = x;                                                                     \
    const A b = y;                                                                     \
    A result;                                                                          \
    LUMEN_UNROLL for (int i = 0; i < detail::count_of<A>; ++i) {                       \
      result[i] = name(a[i], b[i]);                                                    \
    }                                                                                  \
    return result;                                                                     \
  }
#define LUMEN_LIFT_3(kind, name)                                  \
  template <typename V, typename W, typename U,                   \
            typename A = detail::same_vec<detail::kind, V, W, U>> \
  SYCL_EXTERNAL A name(const V& x, const W& y, const U& z) {      \
    const A a = x;                                                \
    const A b = y;                                                \
    const A c = z;                                                \
    A result;                                                     \
    LUMEN_UNROLL for (int i = 0; i < detail::count_of<A>; ++i) {  \
      result[i] = name(a[i], b[i], c[i]);                         \
    }                                                             \
    return result;                                                \
  }
// The second argument is one scalar for all elements.
#define LUMEN_LIFT_2_SCALAR(kind, name)                          \
  template <typename V, typename A = detail::kind<V>>            \
  SYCL_EXTERNAL A name(const V& x, typename A::element_type y) { \
    return name(A(x), A(y));                                     \
  }
// The second argument is an int for each element, or one for all.
#define LUMEN_LIFT_2_INT(name)                                          \
  template <typename V, typename A = detail::real_vec<V>>               \
  SYCL_EXTERNAL A name(const V& x, const detail::vec_like<int, A>& y) { \
    const A a = x;                                                      \
    A result;                                                           \
    LUMEN_UNROLL for (int i = 0; i < detail::count_of<A>; ++i) {        \
      result[i] = name(a[i], y[i]);                                     \
    }                                                                   \
    return result;                                                      \
  }

// Functions of float and double, and of vecs of them.
#define LUMEN_REAL_1(name, ...)             \
  LUMEN_SCALAR_1(float, name, __VA_ARGS__)  \
  LUMEN_SCALAR_1(double, name, __VA_ARGS__) \
  LUMEN_LIFT_1(real_vec, name)
#define LUMEN_REAL_2(name, ...)             \
  LUMEN_SCALAR_2(float, name, __VA_ARGS__)  \
  LUMEN_SCALAR_2(double, name, __VA_ARGS__) \
  LUMEN_LIFT_2(real_vec, name)
#define LUMEN_REAL_3(name, ...)             \
  LUMEN_SCALAR_3(float, name, __VA_ARGS__)  \
  LUMEN_SCALAR_3(double, name, __VA_ARGS__) \
  LUMEN_LIFT_3(real_vec, name)

LUMEN_NAMESPACE_END
