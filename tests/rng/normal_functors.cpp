// SPDX-License-Identifier: Apache-2.0
// The kernel functors of gaussian and lognormal, called as plain functions: inversion bit for bit,
// Box and Muller against the formula in long double, the edges, and what reaches them of the public
// parameters.
#include <cmath>
#include <cstdint>
#include <type_traits>

#include <gtest/gtest.h>

#include "distributions/gaussian.hpp"
#include "formula_support.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using rng::detail::device_type;
using rng::detail::distribution_impl;
using tarn_test::canonical_reals;
using tarn_test::expect_within;

template <typename R>
struct normal_functor : testing::Test {
  static constexpr long double log_zero =
      std::is_same_v<R, float> ? -103.278931L : -744.44007192138122L;
};
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(normal_functor, real_types);

TYPED_TEST(normal_functor, inversion_rounds_the_product_before_the_sum) {
  using R = TypeParam;
  const R mean = R(-2.5);
  const R stddev = R(0.3);
  const gpu::gaussian_icdf<R> functor{mean, stddev};
  const R factor = stddev * static_cast<R>(1.41421356237309504880L);
  int fused_differs = 0;
  const auto reals = canonical_reals<R>(-1, 1);
  for (std::size_t i = 0; i + 4 <= reals.size(); i += 4) {
    const auto values =
        functor(sycl::vec<R, 4>(reals[i], reals[i + 1], reals[i + 2], reals[i + 3]));
    for (int k = 0; k < 4; ++k) {
      const R x = gpu::erfinv_wrapper(reals[i + static_cast<std::size_t>(k)]);
      const R product = factor * x;
      ASSERT_EQ(values[k], product + mean);
      fused_differs += values[k] != std::fma(factor, x, mean) ? 1 : 0;
    }
  }
  EXPECT_GT(fused_differs, 100);
}

TYPED_TEST(normal_functor, inversion_ends_next_to_one) {
  using R = TypeParam;
  // erfinv of the neighbour of 1: 3.8325069 and 5.8635847; times the root of 2.
  const double end = std::is_same_v<R, float> ? 5.41998 : 8.29236;
  const gpu::gaussian_icdf<R> functor{10, 2};
  EXPECT_NEAR(functor.one(-1), 10 - 2 * end, 1e-4);
  EXPECT_NEAR(functor.one(1), 10 + 2 * end, 1e-4);
  EXPECT_EQ(functor.one(0), 10);
}

TYPED_TEST(normal_functor, lognormal_by_inversion_is_the_exponential_of_gaussian) {
  using R = TypeParam;
  const gpu::lognormal_icdf<R> functor{R(0.5), R(0.25), R(-3), 2};
  const gpu::gaussian_icdf<R> normal{R(0.5), R(0.25)};
  for (const R u : canonical_reals<R>(-1, 1)) {
    const long double y = normal.one(u);
    const long double product = 2 * std::exp(y);
    // One unit of the exponential, half a unit of the sum.
    ASSERT_NO_FATAL_FAILURE(
        expect_within<R>(functor.one(u), product - 3, 1.5L, std::fmax(product, 3.0L)));
  }
}

TYPED_TEST(normal_functor, lognormal_without_scale_is_its_displacement) {
  using R = TypeParam;
  const sycl::vec<R, 4> u(R(-0.5), R(0.25), R(0.5), R(0.75));
  const auto inverted = gpu::lognormal_icdf<R>{0, 1, R(-3), 0}(u);
  const auto paired = gpu::lognormal_box_muller2<R>{
      0, 1, R(-3), 0}(sycl::vec<R, 4>(R(0.5), R(0.25), R(0.125), R(0.75)));
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(inverted[i], R(-3));
    EXPECT_EQ(paired[i], R(-3));
  }
}

/// The two standard normals of a pair. The angle is the rounded one: the formula begins there.
template <typename R>
struct plain_pair {
  long double sine, cosine;
  plain_pair(R u0, R u1, long double log_zero) {
    const long double l = u0 == 0 ? log_zero : std::log(static_cast<long double>(u0));
    const R angle = u1 * static_cast<R>(6.28318530717958647693L);
    const long double radius = std::sqrt(-2 * l);
    sine = radius * std::sin(static_cast<long double>(angle));
    cosine = radius * std::cos(static_cast<long double>(angle));
  }
};

// A standard normal is four rounded steps: logarithm (halved by the root), root, sine, product,
// three units together and up to twice that in its own mantissa; then half a unit of the sum.
constexpr long double pair_units = 6.5L;

TYPED_TEST(normal_functor, box_and_muller_give_the_sine_before_the_cosine) {
  using R = TypeParam;
  const R mean = R(0.5);
  const R stddev = R(3);
  const auto reals = canonical_reals<R>(0, 1);
  const gpu::gaussian_box_muller<R> sines{mean, stddev};
  const gpu::gaussian_box_muller2<R> both{mean, stddev};
  const gpu::lognormal_box_muller2<R> lognormal{mean, R(0.125), R(-2), R(4)};
  const auto expect_normal = [&](R got, long double z) {
    const long double x = 0.5L + 3 * z;
    expect_within<R>(got, x, pair_units, std::fmax(std::fabs(x), std::fabs(3 * z)));
  };
  for (std::size_t i = 0; i + 4 <= reals.size(); i += 4) {
    const R u[] = {reals[i], reals[i + 1], reals[i + 2], reals[i + 3]};
    const sycl::vec<R, 4> four(u[0], u[1], u[2], u[3]);
    const auto two = sines(four);
    const auto all = both(four);
    const auto exponentials = lognormal(four);
    static_assert(decltype(two)::size() == 2 && decltype(all)::size() == 4);
    for (int k = 0; k < 2; ++k) {
      const plain_pair<R> z(u[2 * k], u[2 * k + 1], TestFixture::log_zero);
      ASSERT_NO_FATAL_FAILURE(expect_normal(two[k], z.sine));
      ASSERT_NO_FATAL_FAILURE(expect_normal(all[2 * k], z.sine));
      ASSERT_NO_FATAL_FAILURE(expect_normal(all[2 * k + 1], z.cosine));
      for (const int second : {0, 1}) {
        const long double y = 0.5L + 0.125L * (second == 0 ? z.sine : z.cosine);
        const long double e = 4 * std::exp(y);
        // The error of y, below 7 units of 2, comes to that of e, and one unit more.
        ASSERT_NO_FATAL_FAILURE(expect_within<R>(exponentials[2 * k + second], e - 2,
                                                 2 * pair_units, std::fmax(e, 2.0L)));
      }
    }
  }
}

TYPED_TEST(normal_functor, a_radius_of_zero_takes_the_stand_in_of_its_logarithm) {
  using R = TypeParam;
  const long double radius = std::sqrt(-2 * TestFixture::log_zero);  // of 206.557862 in float
  R out[2];
  gpu::gaussian_box_muller2<R>{0, 1}.pair(0, R(0.25), out);  // a quarter turn
  expect_within<R>(out[0], radius, 1, radius);
  EXPECT_NEAR(out[1], 0, 1e-5);
  gpu::gaussian_box_muller2<R>{0, 1}.pair(0, 0, out);
  EXPECT_EQ(out[0], 0);
  expect_within<R>(out[1], radius, 1, radius);
  gpu::gaussian_box_muller<R>{0, 1}.pair(0, R(0.25), out);
  expect_within<R>(out[0], radius, 1, radius);
  // u0 = 1 is a radius of nothing.
  gpu::gaussian_box_muller2<R>{7, 1}.pair(1, R(0.375), out);
  EXPECT_EQ(out[0], 7);
  EXPECT_EQ(out[1], 7);
}

template <typename T, typename Method>
auto gaussian_functor() {
  return distribution_impl<T, rng::gaussian<T, Method>, device_type::gpu>(
             rng::gaussian<T, Method>(T(0.25), T(4)))
      .kernel;
}
template <typename T, typename Method>
auto lognormal_functor() {
  return distribution_impl<T, rng::lognormal<T, Method>, device_type::gpu>(
             rng::lognormal<T, Method>(T(0.25), T(4), T(-5), T(6)))
      .kernel;
}

template <typename Functor, typename Record>
void expect_gaussian_record(const Record& record, int lo) {
  static_assert(std::is_same_v<Record, Functor> && std::is_trivially_copyable_v<Record>);
  const auto& [mean, stddev, from, to] = record;
  EXPECT_EQ(mean, 0.25);
  EXPECT_EQ(stddev, 4);
  EXPECT_EQ(from, lo);
  EXPECT_EQ(to, 1);
  EXPECT_EQ(record.range().lo, lo);
  EXPECT_EQ(record.range().hi, 1);
}
template <typename Functor, typename Record>
void expect_lognormal_record(const Record& record, int lo) {
  static_assert(std::is_same_v<Record, Functor> && std::is_trivially_copyable_v<Record>);
  const auto& [m, s, displ, scale, from, to] = record;
  EXPECT_EQ(m, 0.25);
  EXPECT_EQ(s, 4);
  EXPECT_EQ(displ, -5);
  EXPECT_EQ(scale, 6);
  EXPECT_EQ(from, lo);
  EXPECT_EQ(to, 1);
}

TYPED_TEST(normal_functor, records_are_the_parameters_then_the_range) {
  using R = TypeParam;
  namespace g = rng::gaussian_method;
  namespace l = rng::lognormal_method;
  expect_gaussian_record<gpu::gaussian_box_muller<R>>(gaussian_functor<R, g::box_muller>(), 0);
  expect_gaussian_record<gpu::gaussian_box_muller2<R>>(gaussian_functor<R, g::box_muller2>(), 0);
  expect_gaussian_record<gpu::gaussian_icdf<R>>(gaussian_functor<R, g::icdf>(), -1);
  expect_lognormal_record<gpu::lognormal_box_muller2<R>>(lognormal_functor<R, l::box_muller2>(), 0);
  expect_lognormal_record<gpu::lognormal_icdf<R>>(lognormal_functor<R, l::icdf>(), -1);
  expect_lognormal_record<gpu::lognormal_icdf<R>>(lognormal_functor<R, l::icdf_accurate>(), -1);
  // Kept: on a device this method is drawn by inversion.
  expect_lognormal_record<gpu::lognormal_icdf<R>>(lognormal_functor<R, l::box_muller2_accurate>(),
                                                  -1);
}

}  // namespace
