// SPDX-License-Identifier: Apache-2.0
// Runs functions on a device, for scalars and for vecs, and compares them with the host's results.
// A function is a class with a name and a static template `of(x, y, z)` for values of one type.
#pragma once

#include <cmath>
#include <cstdint>
#include <limits>
#include <string>
#include <vector>

#include "every_device.hpp"
#include "math_ulp.hpp"

namespace {

// What goes with a scalar or a vec of `element`: a function gives one type and takes one, so that
// integers and truth values enter and leave as elements.
template <typename V>
struct shape {
  using element = V;
  template <typename U>
  using of = U;
  template <typename U, sycl::rounding_mode Mode = sycl::rounding_mode::automatic>
  SYCL_EXTERNAL static U convert(V x) {
    return sycl::vec<V, 1>(x).template convert<U, Mode>()[0];
  }
  template <typename U>
  SYCL_EXTERNAL static U bits(V x) {
    return sycl::bit_cast<U>(x);
  }
};
template <typename T, int N>
struct shape<sycl::vec<T, N>> {
  using element = T;
  template <typename U>
  using of = sycl::vec<U, N>;
  template <typename U, sycl::rounding_mode Mode = sycl::rounding_mode::automatic>
  SYCL_EXTERNAL static sycl::vec<U, N> convert(const sycl::vec<T, N>& x) {
    return x.template convert<U, Mode>();
  }
  template <typename U>
  SYCL_EXTERNAL static sycl::vec<U, N> bits(const sycl::vec<T, N>& x) {
    return x.template as<sycl::vec<U, N>>();
  }
};

// `to_ints(x)` as arguments, `to_reals<V>(n)` as results; true is 1 as a result.
template <typename V>
SYCL_EXTERNAL auto to_ints(const V& x) {
  return shape<V>::template convert<int>(x);
}
template <typename V>
SYCL_EXTERNAL V to_reals(const typename shape<V>::template of<int>& n) {
  return shape<typename shape<V>::template of<int>>::template convert<typename shape<V>::element>(
      n);
}
template <typename V>
SYCL_EXTERNAL V truth(bool holds) {
  return holds ? V(1) : V(0);
}
template <typename V, typename M, int N>
SYCL_EXTERNAL V truth(const sycl::vec<M, N>& mask) {
  return V(0) - mask.template convert<typename V::element_type>();
}

// A multi_ptr to a variable of the calling item.
template <typename T>
SYCL_EXTERNAL sycl::raw_private_ptr<T> private_to(T& object) {
  return sycl::raw_private_ptr<T>(&object);
}

#define LUMEN_TEST_FUNCTION(function, ...)                                              \
  struct function {                                                                     \
    static constexpr const char* name = #function;                                      \
    template <typename V>                                                               \
    SYCL_EXTERNAL static V of([[maybe_unused]] const V& x, [[maybe_unused]] const V& y, \
                              [[maybe_unused]] const V& z) {                            \
      using T [[maybe_unused]] = typename shape<V>::element;                            \
      __VA_ARGS__                                                                       \
    }                                                                                   \
  };

// Two neighbours an item: what the function gives of each, and of both as vecs.
template <typename T, typename Function>
struct apply_to_pairs {
  const T* x;
  const T* y;
  const T* z;
  T* scalar;
  T* lifted;

  SYCL_EXTERNAL void operator()(sycl::id<1> pair) const {
    const std::size_t first = 2 * pair[0];
    for (std::size_t i = first; i < first + 2; ++i) {
      scalar[i] = Function::of(x[i], y[i], z[i]);
    }
    using both = sycl::vec<T, 2>;
    const both a(x[first], x[first + 1]);
    const both b(y[first], y[first + 1]);
    const both c(z[first], z[first + 1]);
    Function::of(a, b, c).store(pair[0], lifted);
  }
};

// Equal with the same sign of zero, or not a number both.
template <typename T>
bool same_value(T a, T b) {
  if constexpr (std::is_floating_point_v<T>) {
    return std::isnan(a) ? std::isnan(b) : a == b && std::signbit(a) == std::signbit(b);
  } else {
    return a == b;
  }
}

// Whether `got` is `want`, or as near as `bound` units in the last place if that is not 0.
template <typename T>
bool near_enough(T got, T want, double bound) {
  if constexpr (std::is_floating_point_v<T>) {
    if (bound != 0) {
      return lumen_test::ulps(got, want) <= bound;
    }
  }
  return same_value(got, want);
}

// Triples of arguments; their number is even.
template <typename T>
struct arguments {
  std::vector<T> x, y, z;
  void add(T a, T b, T c) {
    x.push_back(a);
    y.push_back(b);
    z.push_back(c);
  }
};

template <typename T>
struct shared_arguments {
  shared_arguments(const arguments<T>& given, const sycl::queue& q)
      : x(given.x.size(), q), y(given.x.size(), q), z(given.x.size(), q) {
    std::copy(given.x.begin(), given.x.end(), x.begin());
    std::copy(given.y.begin(), given.y.end(), y.begin());
    std::copy(given.z.begin(), given.z.end(), z.begin());
  }
  const shared_array<T> x, y, z;
};

// The function on the queue's device against itself on the host: the same bits where host threads
// run the kernel, within `bound` on other devices, and vecs like their elements anywhere.
template <typename T, typename Function>
void expect_one_like_host(sycl::queue q, const shared_arguments<T>& given, double bound) {
  const auto& [x, y, z] = given;
  const std::size_t count = x.size();
  ASSERT_GT(count, 0U);
  ASSERT_EQ(count % 2, 0U);
  const shared_array<T> scalar(count, q, T(77)), lifted(count, q, T(78));
  q.parallel_for(
       sycl::range<1>(count / 2),
       apply_to_pairs<T, Function>{x.data(), y.data(), z.data(), scalar.data(), lifted.data()})
      .wait_and_throw();
  const bool is_host_run = q.get_device().get_backend() == sycl::backend::host;
  for (std::size_t i = 0; i < count; ++i) {
    const T want = Function::of(x[i], y[i], z[i]);
    ASSERT_TRUE(near_enough(scalar[i], want, is_host_run ? 0 : bound))
        << Function::name << " of " << +x[i] << ", " << +y[i] << ", " << +z[i] << " is "
        << +scalar[i] << ", not " << +want;
    ASSERT_TRUE(same_value(lifted[i], scalar[i]))
        << Function::name << " of a vec, " << +x[i] << ": " << +lifted[i] << ", not " << +scalar[i];
  }
}

// A kernel for each function: all in one would be long work for compilers that inline it whole.
template <typename T, typename... Functions>
void expect_like_host(const sycl::queue& q, const arguments<T>& given, double bound = 0) {
  const shared_arguments<T> shared(given, q);
  (expect_one_like_host<T, Functions>(q, shared, bound), ...);
}

}  // namespace
