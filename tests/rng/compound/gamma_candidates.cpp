// SPDX-License-Identifier: Apache-2.0
// Candidates of gamma, by the kernel functor called with chosen uniforms: the three methods, and
// the edges of each acceptance.
#include <cmath>
#include <limits>

#include <gtest/gtest.h>

#include "distributions/gamma_gpu_dispatch.hpp"
#include "gamma_support.hpp"

namespace {

namespace gpu = kestrel::tarn::rng::detail::gpu;
using gpu::gamma_candidates;
using gpu::functors::gamma_way;

template <typename T>
struct gamma_candidate : tarn_test::of_reals<T> {
  struct two {
    T first;
    T second;
  };
  static two candidates(const gpu::functors::gamma<T>& functor, T v0, T v1, T v2, T v3) {
    const auto values = functor(sycl::vec<T, 4>(v0, v1, v2, v3));
    static_assert(decltype(values)::size() == 2);
    return {values[0], values[1]};
  }
};
TYPED_TEST_SUITE(gamma_candidate, tarn_test::real_types);

// ---- candidates from the cube of a normal ---------------------------------------------------

TYPED_TEST(gamma_candidate, two_normals_share_a_radius_and_an_angle) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(20));
  const T radius = std::sqrt(-2 * std::log(T(0.5)));
  const T angle = T(0.125) * static_cast<T>(6.28318530717958647693);
  const auto cubed = [&](T x) {
    const T w = std::fma(functor.k1, x, T(1));
    return functor.k2 * (w * w * w);
  };
  const auto got = TestFixture::candidates(functor, T(0.5), T(0.25), T(0.125), T(0.375));
  EXPECT_EQ(got.first, cubed(radius * std::sin(angle)));
  EXPECT_EQ(got.second, cubed(radius * std::cos(angle)));
  // Each has a uniform of its own to be judged by.
  const auto first_lost = TestFixture::candidates(functor, T(0.5), 1, T(0.125), T(0.375));
  EXPECT_EQ(first_lost.first, -1);
  EXPECT_EQ(first_lost.second, got.second);
  const auto second_lost = TestFixture::candidates(functor, T(0.5), T(0.25), T(0.125), 1);
  EXPECT_EQ(second_lost.first, got.first);
  EXPECT_EQ(second_lost.second, -1);
}

TYPED_TEST(gamma_candidate, a_normal_of_zero_is_lost_to_a_uniform_of_one_only) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(3));
  // The squeeze and the bound of the density are both reached, and both are strict.
  EXPECT_EQ(TestFixture::candidates(functor, T(0.5), TestFixture::below(1), 0, 0).first,
            functor.k2);
  EXPECT_EQ(TestFixture::candidates(functor, T(0.5), 1, 0, 0).first, -1);
}

TYPED_TEST(gamma_candidate, a_normal_outside_of_the_law_is_rejected_whatever_judges_it) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(1.01));
  // The angle is pi: cosine -1, and a radius of 3 is beyond -1 / k1.
  const auto outside = TestFixture::candidates(functor, T(0.01), T(0.5), T(0.5), 0);
  EXPECT_GT(outside.first, 0);
  EXPECT_EQ(outside.second, -1);
  const auto no_number = TestFixture::candidates(functor, TestFixture::nan, T(0.5), T(0.5), 0);
  EXPECT_EQ(no_number.first, -1);
  EXPECT_EQ(no_number.second, -1);
}

TYPED_TEST(gamma_candidate, the_squeeze_comes_behind_the_end_of_the_law_and_before_the_density) {
  using T = TypeParam;
  // Numbers of no shape, for which the three do not agree: of x = 2 at the angle 0 the density is
  // about exp(-66), of x = -2 at the angle pi w is -1. The squeeze of both is 0.47.
  const gpu::functors::gamma<T> functor{0, 1, T(3), gamma_way::cube, 1, 3};
  const T radius_word = static_cast<T>(std::exp(-2.0));
  const auto second = [&](T angle, T u) {
    return TestFixture::candidates(functor, radius_word, T(0.5), angle, u).second;
  };
  EXPECT_NEAR(second(0, T(0.46)), 81, 1e-4);
  EXPECT_EQ(second(0, T(0.48)), -1);
  EXPECT_EQ(second(T(0.5), T(0.46)), -1);
}

TYPED_TEST(gamma_candidate, beyond_the_squeeze_the_density_decides) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(1.5));
  // A radius of 2 at the angle 0: the second normal is 2.
  const T radius_word = static_cast<T>(std::exp(-2.0));
  const double x = std::sqrt(-2 * std::log(static_cast<double>(radius_word)));
  const double w = 1 + static_cast<double>(functor.k1) * x;
  const double w3 = w * w * w;
  const double density =
      std::exp(x * x / 2 + static_cast<double>(functor.k2) * (1 - w3 + std::log(w3)));
  const double squeeze = 1 - 0.0331 * x * x * x * x;
  ASSERT_GT(density, squeeze + 0.01);
  const auto second = [&](double u) {
    return TestFixture::candidates(functor, radius_word, 0, 0, static_cast<T>(u)).second;
  };
  EXPECT_GT(second(squeeze - 1e-4), 0);
  EXPECT_EQ(second(squeeze + 1e-4), second(squeeze - 1e-4));
  EXPECT_EQ(second(density - 1e-4), second(squeeze - 1e-4));
  EXPECT_EQ(second(density + 1e-4), -1);
}

TYPED_TEST(gamma_candidate, uniforms_of_zero_have_finite_logarithms) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(20));
  const T angle = T(0.25) * static_cast<T>(6.28318530717958647693);
  const T x = std::sqrt(-2 * TestFixture::log_zero) * std::sin(angle);
  const T w = std::fma(functor.k1, x, T(1));
  const T w3 = w * w * w;
  // As far out as that only a uniform of 0 can be below the density: its logarithm decides.
  const double bound = 0.5 * x * x + functor.k2 * (1 - w3 + std::log(w3));
  ASSERT_GT(bound, TestFixture::log_zero);
  EXPECT_EQ(TestFixture::candidates(functor, 0, 0, T(0.25), 0).first, functor.k2 * w3);
  EXPECT_EQ(TestFixture::candidates(functor, 0, T(0.001), T(0.25), 0).first, -1);
}

// ---- candidates for shapes below 1 ----------------------------------------------------------

TYPED_TEST(gamma_candidate, weibull_rejection_compares_sums_of_exponentials) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(0.8));
  for (const T u : {T(0.9), T(0.5), T(0.1)}) {
    const T e1 = -std::log(u);
    const T x = sycl::powr(e1, functor.k1);
    // The judge's uniform at which both sides are equal.
    const double edge = std::exp(-(static_cast<double>(x) + functor.k2 - e1));
    ASSERT_LT(edge, 1);
    const T inside = static_cast<T>(edge * (1 - 1e-5));
    const T outside = static_cast<T>(edge * (1 + 1e-5));
    // Both pairs of the four are alike.
    const auto got = TestFixture::candidates(functor, u, inside, u, outside);
    EXPECT_EQ(got.first, x);
    EXPECT_EQ(got.second, -1);
    EXPECT_EQ(TestFixture::candidates(functor, u, outside, u, inside).second, x);
  }
}

TYPED_TEST(gamma_candidate, weibull_rejection_at_the_ends_of_uniforms) {
  using T = TypeParam;
  const auto functor = gamma_candidates(TestFixture::below(1));
  const auto got = TestFixture::candidates(functor, 0, 0, 1, T(0.5));
  // The stand-in of ln(0), to a power just above 1.
  EXPECT_NEAR(got.first, -TestFixture::log_zero, 1e-4 * -TestFixture::log_zero);
  EXPECT_EQ(got.second, 0);  // accepted: rejected ones are -1
  EXPECT_FALSE(
      gpu::is_accepted(TestFixture::candidates(functor, TestFixture::nan, T(0.5), 0, 0).first));
}

TYPED_TEST(gamma_candidate, small_shapes_take_a_power_up_to_the_edge_and_beyond_it_an_exponential) {
  using T = TypeParam;
  // With another k2 the two meet nowhere, so that the edge shows: 1/4 belongs to the power.
  const gpu::functors::gamma<T> functor{0, 1, T(0.5), gamma_way::power, 2, T(0.25)};
  const T next = TestFixture::above(T(0.25));
  const auto got = TestFixture::candidates(functor, T(0.25), T(0.5), next, T(0.5));
  EXPECT_EQ(got.first, T(0.0625));
  const T e2 = -std::log((1 - next) * 2);
  EXPECT_EQ(got.second, sycl::powr(std::fma(T(0.5), e2, T(0.25)), T(2)));
  EXPECT_LT(got.second, T(0.01));
}

TYPED_TEST(gamma_candidate, small_shapes_are_rejected_above_the_exponential_only) {
  using T = TypeParam;
  // The power with exponent 1 is the uniform itself: equal to the exponential it is accepted.
  const gpu::functors::gamma<T> itself{0, 1, T(0.5), gamma_way::power, 1, T(0.5)};
  const T e = -std::log(T(0.75));
  EXPECT_EQ(TestFixture::candidates(itself, e, T(0.75), 0, 0).first, e);
  EXPECT_EQ(TestFixture::candidates(itself, TestFixture::above(e), T(0.75), 0, 0).first, -1);
  // Beyond the edge the bound is the sum of both exponentials.
  const auto functor = gamma_candidates(T(0.5));
  const T u = T(0.9);
  const double e2 = -std::log((1 - static_cast<double>(u)) * 2);
  const double x = std::pow(0.5 * e2 + 0.5, 2);
  const double edge = std::exp(-(x - e2));
  ASSERT_LT(edge, 1);
  const auto got = TestFixture::candidates(functor, u, static_cast<T>(edge * (1 - 1e-4)), u,
                                           static_cast<T>(edge * (1 + 1e-4)));
  EXPECT_NEAR(got.first, x, 1e-5);
  EXPECT_EQ(got.second, -1);
}

TYPED_TEST(gamma_candidate, small_shapes_at_the_ends_of_uniforms) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(0.6));
  const auto ends = TestFixture::candidates(functor, 0, T(0.5), 0, 1);
  EXPECT_EQ(ends.first, 0);  // accepted
  EXPECT_EQ(ends.second, 0);
  // 1 has the stand-in of ln(0): finite, and above what any exponential can be.
  EXPECT_EQ(TestFixture::candidates(functor, 1, 0, 0, 0).first, -1);
  EXPECT_FALSE(gpu::is_accepted(TestFixture::candidates(functor, TestFixture::nan, 0, 0, 0).first));
  // Shapes whose reciprocal is beyond the type still give zeros.
  const auto least = gamma_candidates(std::numeric_limits<T>::denorm_min());
  EXPECT_EQ(TestFixture::candidates(least, T(0.5), T(0.5), T(0.9), T(0.9)).second, 0);
}

}  // namespace
