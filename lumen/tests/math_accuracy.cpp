// SPDX-License-Identifier: Apache-2.0
// The math functions against long double over wide ranges, with bounds in units in the last
// place: for functions of the C library those that glibc documents, which it counts from the
// correctly rounded value (half a unit more where the true value decides), and for our own those
// that their comments promise.
#include <cmath>
#include <functional>
#include <string>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "math_ulp.hpp"

namespace {

using lumen_test::spread;
using lumen_test::ulps;
using exact = long double;

constexpr exact pi = 3.141592653589793238462643383279502884L;

// sin(pi x) by whole turns instead of quarters, as a road of its own: remainder(x, 1) is exact.
exact sin_pi(exact x) {
  const exact rest = std::remainder(x, 1.0L);
  const bool odd = std::fmod(std::fabs(x - rest), 2.0L) == 1.0L;
  return odd ? -std::sin(pi * rest) : std::sin(pi * rest);
}
exact cos_pi(exact x) {
  const exact rest = std::remainder(x, 1.0L);
  const bool odd = std::fmod(std::fabs(x - rest), 2.0L) == 1.0L;
  const exact size = std::sin(pi * (0.5L - std::fabs(rest)));
  return odd ? -size : size;
}

template <typename T>
struct function_of_one {
  std::string name;
  std::function<T(T)> tested;
  std::function<exact(exact)> reference;
  double lowest;
  double highest;
  double bound;
};

#define LUMEN_TEST_ROW(name, reference, lowest, highest, bound)                                   \
  {                                                                                               \
#name, [](T x) { return sycl::name(x); }, [](exact x) { return reference; }, lowest, highest, \
                                                                              bound               \
  }

template <typename T>
std::vector<function_of_one<T>> functions_of_one() {
  constexpr bool single = sizeof(T) == 4;
  const double most = single ? 88 : 708;  // Below the overflow of exp.
  return {
      LUMEN_TEST_ROW(acos, std::acos(x), -1, 1, 1),
      LUMEN_TEST_ROW(acosh, std::acosh(x), 1, 1e6, 2),
      LUMEN_TEST_ROW(acospi, std::acos(x) / pi, -1, 1, 2),
      LUMEN_TEST_ROW(asin, std::asin(x), -1, 1, 1),
      LUMEN_TEST_ROW(asinh, std::asinh(x), -1e6, 1e6, 2),
      LUMEN_TEST_ROW(asinpi, std::asin(x) / pi, -1, 1, 2),
      LUMEN_TEST_ROW(atan, std::atan(x), -1e3, 1e3, 1),
      LUMEN_TEST_ROW(atanh, std::atanh(x), -0.9999, 0.9999, 2),
      LUMEN_TEST_ROW(atanpi, std::atan(x) / pi, -1e3, 1e3, 2),
      LUMEN_TEST_ROW(cbrt, std::cbrt(x), -1e9, 1e9, 4),
      LUMEN_TEST_ROW(cos, std::cos(x), -1e4, 1e4, 1),
      LUMEN_TEST_ROW(cosh, std::cosh(x), -80, 80, 2),
      LUMEN_TEST_ROW(cospi, cos_pi(x), -300, 300, 2),
      LUMEN_TEST_ROW(erf, std::erf(x), -6, 6, 1),
      LUMEN_TEST_ROW(erfc, std::erfc(x), -6, 9, 5),
      LUMEN_TEST_ROW(exp, std::exp(x), -most, most, 1),
      LUMEN_TEST_ROW(exp10, std::pow(10.0L, x), -37, 38, 1),
      LUMEN_TEST_ROW(exp2, std::exp2(x), -126, 127, 1),
      LUMEN_TEST_ROW(expm1, std::expm1(x), -50, most, 1),
      LUMEN_TEST_ROW(lgamma, std::lgamma(x), 2.5, 1e4, 4),
      LUMEN_TEST_ROW(log, std::log(x), 1e-30, 1e30, 1),
      LUMEN_TEST_ROW(log10, std::log10(x), 1e-30, 1e30, 2),
      LUMEN_TEST_ROW(log1p, std::log1p(x), -0.999, 1e6, 1),
      LUMEN_TEST_ROW(log2, std::log2(x), 1e-30, 1e30, 1),
      LUMEN_TEST_ROW(rsqrt, 1 / std::sqrt(x), 1e-30, 1e30, 1.5),
      LUMEN_TEST_ROW(sin, std::sin(x), -1e4, 1e4, 1),
      LUMEN_TEST_ROW(sinh, std::sinh(x), -80, 80, 2),
      LUMEN_TEST_ROW(sinpi, sin_pi(x), -300, 300, 2),
      LUMEN_TEST_ROW(sqrt, std::sqrt(x), 0, 1e30, 0.5),
      LUMEN_TEST_ROW(tan, std::tan(x), -1e4, 1e4, 1),
      LUMEN_TEST_ROW(tanh, std::tanh(x), -20, 20, 2),
      LUMEN_TEST_ROW(tanpi, sin_pi(x) / cos_pi(x), -300, 300, 4),
      LUMEN_TEST_ROW(tgamma, std::tgamma(x), 0.1, 34, 10),
  };
}
#undef LUMEN_TEST_ROW

template <typename T>
struct MathAccuracy : testing::Test {};
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(MathAccuracy, real_types);

TYPED_TEST(MathAccuracy, FunctionsOfOneArgument) {
  using T = TypeParam;
  for (const auto& row : functions_of_one<T>()) {
    double worst = 0;
    T worst_at = 0;
    for (const T x : spread<T>(row.lowest, row.highest)) {
      const double error = ulps(row.tested(x), row.reference(x));
      if (error > worst) {
        worst = error;
        worst_at = x;
      }
    }
    EXPECT_LE(worst, row.bound) << row.name << " at " << worst_at;
  }
}

TYPED_TEST(MathAccuracy, FunctionsOfTwoArguments) {
  using T = TypeParam;
  const auto xs = spread<T>(1e-3, 40);
  const auto ys = spread<T>(-20, 20);
  for (std::size_t i = 0; i < xs.size(); ++i) {
    const T x = xs[i];
    const T y = ys[ys.size() - 1 - i];
    ASSERT_LE(ulps(sycl::pow(x, y), std::pow(exact(x), exact(y))), 1) << x << " " << y;
    ASSERT_LE(ulps(sycl::powr(x, y), std::pow(exact(x), exact(y))), 1) << x << " " << y;
    ASSERT_LE(ulps(sycl::atan2(y, x), std::atan2(exact(y), exact(x))), 1.5) << x << " " << y;
    ASSERT_LE(ulps(sycl::atan2pi(y, x), std::atan2(exact(y), exact(x)) / pi), 2);
    ASSERT_LE(ulps(sycl::hypot(x, y), std::hypot(exact(x), exact(y))), 1) << x << " " << y;
    ASSERT_EQ(sycl::fma(x, y, T(1)), std::fma(x, y, T(1)));
    ASSERT_EQ(sycl::mad(x, y, T(1)), std::fma(x, y, T(1)));
  }
}

TYPED_TEST(MathAccuracy, RootsAndIntegerPowersOverTheWholeRange) {
  using T = TypeParam;
  const int end = std::numeric_limits<T>::max_exponent - 1;
  for (int exponent = -end; exponent <= end; exponent += 7) {
    const T x = std::ldexp(T(1.37), exponent);
    for (const int n : {1, 2, 3, 5, 10, 100, -1, -2, -3, -7}) {
      const exact root = std::pow(exact(x), 1.0L / n);
      ASSERT_LE(ulps(sycl::rootn(x, n), root), sizeof(T) == 4 ? 1 : 2) << x << " " << n;
      const exact power = std::pow(exact(x), exact(n));
      ASSERT_LE(ulps(sycl::pown(x, n), power), 1) << x << " " << n;
    }
  }
  // Not every int is a float: the exponent must not be rounded to one.
  const T near_one = 1 + 4 * std::numeric_limits<T>::epsilon();
  const exact want = std::pow(exact(near_one), 16777217.0L);
  EXPECT_LE(ulps(sycl::pown(near_one, 16777217), want), 1);
  EXPECT_EQ(sycl::pown(T(-1), 16777217), T(-1));
}

}  // namespace
