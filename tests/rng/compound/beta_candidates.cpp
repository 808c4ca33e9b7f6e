// SPDX-License-Identifier: Apache-2.0
// Candidates of beta, by the kernel functor called with chosen uniforms: the five methods, and the
// edges of each acceptance.
#include <cmath>
#include <cstdint>
#include <limits>

#include <gtest/gtest.h>

#include "distributions/beta_gpu_dispatch.hpp"
#include "gamma_support.hpp"

namespace {

namespace gpu = kestrel::tarn::rng::detail::gpu;
using gpu::beta_candidates;
using gpu::beta_candidates_of;
using gpu::functors::beta_way;
using tarn_test::candidate;

template <typename T>
using beta_candidate = tarn_test::of_reals<T>;
TYPED_TEST_SUITE(beta_candidate, tarn_test::real_types);

TYPED_TEST(beta_candidate, johnk_takes_the_share_of_the_first_of_two_powers) {
  using T = TypeParam;
  const auto functor = beta_candidates_of(T(0.5), T(0.5));
  // Squares of the uniforms: 1/16 and 1/4.
  EXPECT_NEAR(candidate(functor, T(0.25), T(0.5)), 0.2, 1e-6);
  EXPECT_EQ(candidate(functor, T(0.9), T(0.9)), -1);
  const auto both = functor(sycl::vec<T, 4>(T(0.25), T(0.5), T(0.9), T(0.9)));
  static_assert(decltype(both)::size() == 2);
  EXPECT_EQ(both[0], candidate(functor, T(0.25), T(0.5)));
  EXPECT_EQ(both[1], -1);
}

TYPED_TEST(beta_candidate, johnk_accepts_a_sum_of_one_and_rejects_a_sum_of_zero) {
  using T = TypeParam;
  const auto functor = beta_candidates_of(T(1e-4), T(1e-4));
  // A power of a half is 0 in either type, that of 1 is 1.
  EXPECT_EQ(candidate(functor, T(0.5), T(0.5)), -1);
  EXPECT_EQ(candidate(functor, 0, 0), -1);
  EXPECT_EQ(candidate(functor, 1, T(0.5)), 1);
  EXPECT_EQ(candidate(functor, T(0.5), 1), 0);  // accepted
  EXPECT_EQ(candidate(functor, 1, 1), -1);
  EXPECT_EQ(candidate(functor, TestFixture::nan, T(0.5)), -1);
}

/// A switching method whose pieces do not meet: u^1 / 4 up to 1/2, beyond it 1.
template <typename T>
beta_candidates<T> with_a_step(beta_way method) {
  beta_candidates<T> record = beta_candidates_of(T(0.9), T(0.9));
  record.method = method;
  record.split = T(0.5);
  record.w1 = T(0.25);
  record.w2 = 0;
  record.e1 = record.e2 = 0;
  record.inv[0] = record.inv[1] = 1;
  return record;
}

TYPED_TEST(beta_candidate, the_end_of_the_first_piece_belongs_to_it) {
  using T = TypeParam;
  const T next = TestFixture::above(T(0.5));
  for (const auto method : {beta_way::both_below, beta_way::first_below}) {
    EXPECT_EQ(candidate(with_a_step<T>(method), T(0.5), T(0.5)), T(0.125));
    EXPECT_EQ(candidate(with_a_step<T>(method), next, T(0.5)), 1);
  }
  const auto mirrored = with_a_step<T>(beta_way::second_below);
  EXPECT_EQ(candidate(mirrored, T(0.5), T(0.5)), T(0.875));
  EXPECT_EQ(candidate(mirrored, next, T(0.5)), 0);
}

TYPED_TEST(beta_candidate, switching_rejects_above_zero_and_what_is_no_number) {
  using T = TypeParam;
  for (const auto method : {beta_way::both_below, beta_way::first_below, beta_way::second_below}) {
    auto functor = with_a_step<T>(method);
    // The test value is the logarithm of the judge.
    EXPECT_NE(candidate(functor, T(0.25), 1), -1);
    EXPECT_EQ(candidate(functor, T(0.25), TestFixture::above(1)), -1);
    EXPECT_EQ(candidate(functor, T(0.25), TestFixture::nan), -1);
    EXPECT_EQ(candidate(functor, TestFixture::nan, T(0.5)), -1);
    // Judged by 0 as by its logarithm, which is finite: 64.5 is no obstacle, 6454 is.
    if (method != beta_way::both_below) {
      functor.e1 = -1000;
      EXPECT_NE(candidate(functor, T(0.25), 0), -1);
      EXPECT_EQ(candidate(functor, T(0.25), 1), -1);
      functor.e1 = -100000;
      EXPECT_EQ(candidate(functor, T(0.25), 0), -1);
    }
  }
}

TYPED_TEST(beta_candidate, the_first_piece_is_judged_by_the_other_factor_of_the_density) {
  using T = TypeParam;
  for (const auto& functor : {beta_candidates_of(T(0.9), T(0.8)), beta_candidates_of(T(0.4), T(3)),
                              beta_candidates_of(T(3), T(0.4))}) {
    const double u = 0.25 * static_cast<double>(functor.split);
    const double x = functor.w1 * std::pow(u, static_cast<double>(functor.inv[0]));
    const bool both = functor.method == beta_way::both_below;
    const double relative = both ? (1 - x) / (1 - static_cast<double>(functor.t)) : 1 - x;
    const double edge = std::pow(relative, -static_cast<double>(functor.e1));
    ASSERT_LT(edge, 0.999);
    const T inside = candidate(functor, static_cast<T>(u), static_cast<T>(edge * (1 - 1e-4)));
    EXPECT_NEAR(inside, functor.method == beta_way::second_below ? 1 - x : x, 1e-5);
    EXPECT_EQ(candidate(functor, static_cast<T>(u), static_cast<T>(edge * (1 + 1e-4))), -1);
  }
}

TYPED_TEST(beta_candidate, the_second_piece_is_judged_by_the_other_factor_of_the_density) {
  using T = TypeParam;
  for (const auto& functor : {beta_candidates_of(T(0.9), T(0.8)), beta_candidates_of(T(0.4), T(3)),
                              beta_candidates_of(T(3), T(0.4))}) {
    const double u = 0.5 * (1 + static_cast<double>(functor.split));
    const double x = 1 - functor.w2 * std::pow(1 - u, static_cast<double>(functor.inv[1]));
    const double edge = std::pow(x / functor.t, -static_cast<double>(functor.e2));
    ASSERT_LT(edge, 1);
    const T inside = candidate(functor, static_cast<T>(u), static_cast<T>(edge * (1 - 1e-4)));
    const bool mirrored = functor.method == beta_way::second_below;
    EXPECT_NEAR(inside, mirrored ? 1 - x : x, 1e-5);
    EXPECT_EQ(candidate(functor, static_cast<T>(u), static_cast<T>(edge * (1 + 1e-4))), -1);
  }
}

TYPED_TEST(beta_candidate, the_mirror_image_gives_what_is_left_to_one) {
  using T = TypeParam;
  const auto first = beta_candidates_of(T(0.3), T(2.5));
  const auto second = beta_candidates_of(T(2.5), T(0.3));
  const auto u = tarn_test::uniforms<T>(1618, 2000);
  int accepted = 0;
  for (std::size_t i = 0; i < u.size(); i += 2) {
    const T x = candidate(first, u[i], u[i + 1]);
    ASSERT_EQ(candidate(second, u[i], u[i + 1]), x < 0 ? x : 1 - x);
    accepted += x < 0 ? 0 : 1;
  }
  EXPECT_GT(accepted, 500);
  EXPECT_LT(accepted, 1000);
}

TYPED_TEST(beta_candidate, cheng_compares_logarithms_of_density_and_judge) {
  using T = TypeParam;
  const auto functor = beta_candidates_of(T(3), T(2));
  for (const double u : {0.05, 0.5, 0.9}) {
    const double v = functor.bb * std::log(u / (1 - u));
    const double w = 3 * std::exp(v);
    const double h = 5 * std::log(5 / (2 + w)) + functor.cc * v - 1.3862943649291992;
    const double edge = std::exp(h) / (u * u);
    ASSERT_LT(edge, 1);
    EXPECT_NEAR(candidate(functor, static_cast<T>(u), static_cast<T>(edge * (1 - 1e-4))),
                w / (2 + w), 1e-6);
    EXPECT_EQ(candidate(functor, static_cast<T>(u), static_cast<T>(edge * (1 + 1e-4))), -1);
  }
}

TYPED_TEST(beta_candidate, cheng_at_the_ends_of_uniforms) {
  using T = TypeParam;
  auto functor = beta_candidates_of(T(3), T(2));
  EXPECT_EQ(candidate(functor, 0, T(0.5)), -1);
  EXPECT_EQ(candidate(functor, TestFixture::nan, T(0.5)), -1);
  // 1 has infinite odds, and no share.
  EXPECT_FALSE(gpu::is_accepted(candidate(functor, 1, T(0.5))));
  // With small odds both logarithms of a 0 show: finite odds, and a judge that can reject.
  functor.bb = T(0.001);
  functor.cc = 0;
  const T w = 3 * std::exp(functor.bb * TestFixture::log_zero);
  ASSERT_GT(w, 0);
  EXPECT_EQ(candidate(functor, 0, T(0.5)), w * (1 / (2 + w)));
  functor.cc = 1100;
  EXPECT_EQ(candidate(functor, 0, T(0.5)), -1);
}

}  // namespace
