// SPDX-License-Identifier: Apache-2.0
// The math functions on every device. Two bounds in units in the last place stand for each that is
// not exact: the largest error that the tables of the CUDA C++ Programming Guide, "Mathematical
// Functions", give for float and for double (where editions differ, the greater), to which comes
// that of the host's own function, from math_accuracy.cpp. A quotient may count the errors of what
// it divides twice, since its unit may be half as large, and adds one of its own.
#include "device_pass.hpp"

namespace {

class device_pass_math : public on_every_device {};

#define LUMEN_TEST_NAMED(name) LUMEN_TEST_FUNCTION(of_##name, return sycl::name(x);)
#define LUMEN_TEST_NAMED_2(name) LUMEN_TEST_FUNCTION(of_##name, return sycl::name(x, y);)

LUMEN_TEST_NAMED(acos)
LUMEN_TEST_NAMED(acosh)
LUMEN_TEST_NAMED(acospi)
LUMEN_TEST_NAMED(asin)
LUMEN_TEST_NAMED(asinh)
LUMEN_TEST_NAMED(asinpi)
LUMEN_TEST_NAMED(atan)
LUMEN_TEST_NAMED(atanh)
LUMEN_TEST_NAMED(atanpi)
LUMEN_TEST_NAMED(cbrt)
LUMEN_TEST_NAMED(cos)
LUMEN_TEST_NAMED(cosh)
LUMEN_TEST_NAMED(cospi)
LUMEN_TEST_NAMED(erf)
LUMEN_TEST_NAMED(erfc)
LUMEN_TEST_NAMED(exp)
LUMEN_TEST_NAMED(exp10)
LUMEN_TEST_NAMED(exp2)
LUMEN_TEST_NAMED(expm1)
LUMEN_TEST_NAMED(lgamma)
LUMEN_TEST_NAMED(log)
LUMEN_TEST_NAMED(log10)
LUMEN_TEST_NAMED(log1p)
LUMEN_TEST_NAMED(log2)
LUMEN_TEST_NAMED(rsqrt)
LUMEN_TEST_NAMED(sin)
LUMEN_TEST_NAMED(sinh)
LUMEN_TEST_NAMED(sinpi)
LUMEN_TEST_NAMED(tan)
LUMEN_TEST_NAMED(tanh)
LUMEN_TEST_NAMED(tanpi)
LUMEN_TEST_NAMED(tgamma)
LUMEN_TEST_NAMED_2(atan2)
LUMEN_TEST_NAMED_2(atan2pi)
LUMEN_TEST_NAMED_2(hypot)
LUMEN_TEST_NAMED_2(pow)
LUMEN_TEST_NAMED_2(powr)
LUMEN_TEST_FUNCTION(of_pown, return sycl::pown(x, to_ints(y));)
LUMEN_TEST_FUNCTION(of_rootn, return sycl::rootn(x, to_ints(y));)
LUMEN_TEST_FUNCTION(of_lgamma_r, {
  typename shape<V>::template of<int> sign{};
  return sycl::lgamma_r(x, private_to(sign));
})
LUMEN_TEST_FUNCTION(sine_of_sincos, {
  V cosine{};
  return sycl::sincos(x, private_to(cosine));
})
LUMEN_TEST_FUNCTION(cosine_of_sincos, {
  V cosine{};
  sycl::sincos(x, private_to(cosine));
  return cosine;
})

// Functions of x from `lowest` to `highest`, where y stays small enough for powers.
template <typename Function>
void expect_near_host(const sycl::queue& q, double lowest, double highest, double cuda_float,
                      double cuda_double, double host) {
  const auto check = [&](auto zero, double cuda) {
    using T = decltype(zero);
    constexpr T infinity = std::numeric_limits<T>::infinity();
    constexpr T nan = std::numeric_limits<T>::quiet_NaN();
    arguments<T> given;
    const T limits[] = {T(0), T(-0.0), T(1), T(-1), infinity, -infinity, nan, T(2)};
    for (const T x : limits) {
      for (const T y : {T(1), T(-1), T(2), T(5)}) {
        given.add(x, y, T(0));
      }
    }
    const auto xs = lumen_test::spread<T>(lowest, highest, 1000);
    const auto ys = lumen_test::spread<T>(-9, 9, 1000);
    for (std::size_t i = 0; i < xs.size(); ++i) {
      given.add(xs[i], ys[ys.size() - 1 - i], T(0));
    }
    expect_like_host<T, Function>(q, given, cuda + host);
  };
  check(float(), cuda_float);
  check(double(), cuda_double);
}

TEST_P(device_pass_math, functions_of_one_argument) {
  const sycl::queue q(device());
  expect_near_host<of_acos>(q, -1, 1, 3, 2, 1);
  expect_near_host<of_acosh>(q, 1, 1e6, 4, 3, 2);
  expect_near_host<of_acospi>(q, -1, 1, 7, 5, 2);
  expect_near_host<of_asin>(q, -1, 1, 4, 2, 1);
  expect_near_host<of_asinh>(q, -1e6, 1e6, 3, 3, 2);
  expect_near_host<of_asinpi>(q, -1, 1, 9, 5, 2);
  expect_near_host<of_atan>(q, -1e3, 1e3, 2, 2, 1);
  expect_near_host<of_atanh>(q, -0.9999, 0.9999, 3, 2, 2);
  expect_near_host<of_atanpi>(q, -1e3, 1e3, 5, 5, 2);
  expect_near_host<of_cbrt>(q, -1e9, 1e9, 1, 1, 4);
  expect_near_host<of_cos>(q, -1e4, 1e4, 2, 2, 1);
  expect_near_host<of_cosh>(q, -80, 80, 2, 1, 2);
  expect_near_host<of_cospi>(q, -300, 300, 2, 2, 2);
  expect_near_host<of_erf>(q, -6, 6, 2, 2, 1);
  expect_near_host<of_erfc>(q, -6, 9, 6, 5, 5);
  expect_near_host<of_exp>(q, -80, 80, 2, 1, 1);
  expect_near_host<of_exp10>(q, -36, 36, 2, 1, 1);
  expect_near_host<of_exp2>(q, -120, 120, 2, 1, 1);
  expect_near_host<of_expm1>(q, -50, 80, 1, 1, 1);
  expect_near_host<of_lgamma>(q, 2.5, 1e4, 6, 4, 4);
  expect_near_host<of_lgamma_r>(q, 2.5, 1e4, 6, 4, 4);
  expect_near_host<of_log>(q, 1e-30, 1e30, 1, 1, 1);
  expect_near_host<of_log10>(q, 1e-30, 1e30, 3, 1, 2);
  expect_near_host<of_log1p>(q, -0.999, 1e6, 2, 1, 1);
  expect_near_host<of_log2>(q, 1e-30, 1e30, 3, 1, 1);
  expect_near_host<of_rsqrt>(q, 1e-30, 1e30, 2, 1, 1.5);
  expect_near_host<of_sin>(q, -1e4, 1e4, 2, 2, 1);
  expect_near_host<of_sinh>(q, -80, 80, 3, 2, 2);
  expect_near_host<of_sinpi>(q, -300, 300, 2, 2, 2);
  expect_near_host<of_tan>(q, -1e4, 1e4, 4, 2, 1);
  expect_near_host<of_tanh>(q, -20, 20, 2, 1, 2);
  expect_near_host<of_tanpi>(q, -300, 300, 9, 9, 4);
  expect_near_host<of_tgamma>(q, 0.1, 34, 11, 10, 10);
  expect_near_host<sine_of_sincos>(q, -1e4, 1e4, 2, 2, 1);
  expect_near_host<cosine_of_sincos>(q, -1e4, 1e4, 2, 2, 1);
}

TEST_P(device_pass_math, functions_of_two_arguments) {
  const sycl::queue q(device());
  expect_near_host<of_atan2>(q, -40, 40, 3, 2, 1.5);
  expect_near_host<of_atan2pi>(q, -40, 40, 7, 5, 2);
  expect_near_host<of_hypot>(q, -40, 40, 3, 2, 1);
  expect_near_host<of_pow>(q, 1e-3, 40, 9, 2, 1);
  expect_near_host<of_powr>(q, 1e-3, 40, 9, 2, 1);
  // Through pow of double for both types; roots end with a correction of at most one unit.
  expect_near_host<of_pown>(q, 1e-3, 40, 1, 2, 1);
  expect_near_host<of_rootn>(q, 1e-3, 1e9, 1, 3, 2);
}

// Code for GPUs works the sign out by itself.
TEST(device_pass_gamma, signs_agree_with_the_c_library) {
  int sign = 0;
  for (const double x :
       {-0.0, 0.0, -0.5, -1.5, -2.5, -100.5, 0.5, 3.0, -1e300,
        -std::numeric_limits<double>::infinity(), -std::numeric_limits<double>::denorm_min()}) {
    ::lgamma_r(x, &sign);
    EXPECT_EQ(sycl::detail::sign_of_gamma(x), sign) << x;
    ::lgammaf_r(static_cast<float>(x), &sign);
    EXPECT_EQ(sycl::detail::sign_of_gamma(static_cast<float>(x)), sign) << x;
  }
}

LUMEN_ON_EVERY_DEVICE(device_pass_math);
LUMEN_REPORTS_CUDA(device_pass_math)

}  // namespace
