// SPDX-License-Identifier: Apache-2.0
// gamma on GPU queues: which method a shape takes and the numbers it is set up with, the place of
// results, and calls whose passes can be followed by hand.
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "distributions/gamma_gpu_dispatch.hpp"
#include "drawing.hpp"
#include "gamma_support.hpp"
#include "level_calls.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using gpu::gamma_candidates;
using gpu::functors::gamma_way;
using marsaglia = rng::gamma_method::marsaglia;
using marsaglia_accurate = rng::gamma_method::marsaglia_accurate;
using rng::detail::device_type;
using rng::detail::distribution_impl;
using tarn_test::both_forms;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::host_run_gpu_queue;
using tarn_test::uniforms;

constexpr std::uint32_t seed = 2718;

template <typename T>
using gamma_road = tarn_test::of_reals<T>;
TYPED_TEST_SUITE(gamma_road, tarn_test::real_types);

TEST(gamma_constants, a_third_is_that_of_float_in_double_as_well) {
  EXPECT_EQ(sycl::bit_cast<std::uint64_t>(gpu::functors::minus_third<double>), 0xBFD5555560000000u);
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(gpu::functors::minus_third<float>), 0xBEAAAAABu);
  EXPECT_EQ(gamma_candidates(2.0).k2, 2.0 - 0.3333333432674408);
  EXPECT_NE(gamma_candidates(2.0).k2, 2.0 - 1.0 / 3);
}

TYPED_TEST(gamma_road, methods_change_above_six_tenths_and_above_one) {
  using T = TypeParam;
  const auto method = [](T alpha) { return gamma_candidates(alpha).method; };
  const T edge = static_cast<T>(0.6);
  EXPECT_EQ(method(std::numeric_limits<T>::denorm_min()), gamma_way::power);
  EXPECT_EQ(method(edge), gamma_way::power);
  EXPECT_EQ(method(TestFixture::above(edge)), gamma_way::weibull);
  EXPECT_EQ(method(TestFixture::below(1)), gamma_way::weibull);
  EXPECT_EQ(method(TestFixture::above(1)), gamma_way::cube);
  EXPECT_EQ(method(T(1.0000001)), gamma_way::cube);
  EXPECT_EQ(method(std::numeric_limits<T>::max()), gamma_way::cube);
}

TYPED_TEST(gamma_road, numbers_of_a_shape_just_above_one) {
  using T = TypeParam;
  const auto functor = gamma_candidates(T(1.0000001));
  // Of shape 1 they would be the root of 1/6 and 2/3.
  EXPECT_NEAR(functor.k1, 0.408248290, 1e-7);
  EXPECT_NEAR(functor.k2, 0.666666667, 2e-7);
  EXPECT_EQ(functor.alpha, T(1.0000001));
}

TYPED_TEST(gamma_road, numbers_of_shapes_below_one) {
  using T = TypeParam;
  const auto weibull = gamma_candidates(T(0.75));
  EXPECT_EQ(weibull.k1, 1 / T(0.75));
  // (1/4) (3/4)^3: an exponential of a logarithm, each within a unit in the last place.
  EXPECT_NEAR(weibull.k2, 27.0 / 256, 27.0 / 256 * 4 * std::numeric_limits<T>::epsilon());
  const auto power = gamma_candidates(T(0.25));
  EXPECT_EQ(power.k1, 4);
  EXPECT_EQ(power.k2, T(0.75));
}

TYPED_TEST(gamma_road, a_record_draws_canonical_reals_two_for_a_candidate) {
  using T = TypeParam;
  using functor = gpu::functors::gamma<T>;
  static_assert(std::is_trivially_copyable_v<functor>);
  static_assert(functor::asks == gpu::drawn::reals && gpu::is_whole<functor>);
  static_assert(gpu::words_per_result<functor> == 2);
  for (const T alpha : {T(0.25), T(0.75), T(2)}) {
    const auto& [r0, r1, shape, method, k1, k2] = gamma_candidates(alpha);
    EXPECT_EQ(r0, 0);
    EXPECT_EQ(r1, 1);
    EXPECT_EQ(shape, alpha);
    static_assert(sizeof method == sizeof(std::int32_t));
    EXPECT_EQ(static_cast<int>(method), alpha > 1 ? 2 : alpha > T(0.6) ? 0 : 1);
  }
}

TYPED_TEST(gamma_road, the_public_parameters_reach_candidates_and_place) {
  using T = TypeParam;
  const distribution_impl<T, rng::gamma<T, marsaglia>, device_type::gpu> plain(
      rng::gamma<T, marsaglia>(T(2.5), T(-1), 3));
  EXPECT_EQ(plain.kernel.alpha, T(2.5));
  EXPECT_EQ(plain.post.a, -1);
  EXPECT_EQ(plain.post.beta, 3);
  EXPECT_EQ(plain.post.accurate, 0);
  EXPECT_EQ(plain.consumed, 0);
  const distribution_impl<T, rng::gamma<T, marsaglia_accurate>, device_type::gpu> accurate(
      rng::gamma<T, marsaglia_accurate>(T(0.5), 1, 2));
  EXPECT_EQ(accurate.kernel.alpha, T(0.5));
  EXPECT_EQ(accurate.post.accurate, 1);
}

TYPED_TEST(gamma_road, the_place_of_a_result_is_rounded_once) {
  using T = TypeParam;
  const gpu::functors::gamma_post<T> post{T(-0.3), T(1.7), 0};
  int differ = 0;
  for (int i = 1; i <= 1000; ++i) {
    const T v = static_cast<T>(i) / 7;
    ASSERT_EQ(post(v), std::fma(v, T(1.7), T(-0.3)));
    const T product = v * T(1.7);
    differ += post(v) != product + T(-0.3) ? 1 : 0;
  }
  EXPECT_GT(differ, 10);
}

TYPED_TEST(gamma_road, accurate_results_are_not_below_the_displacement) {
  using T = TypeParam;
  // A negative number stands for what rounding might leave below.
  const T just_below = -std::numeric_limits<T>::epsilon();
  EXPECT_LT((gpu::functors::gamma_post<T>{1, 1, 0}(just_below)), 1);
  EXPECT_EQ((gpu::functors::gamma_post<T>{1, 1, 1}(just_below)), 1);
  EXPECT_EQ((gpu::functors::gamma_post<T>{1, 2, 1}(3)), 7);
  EXPECT_EQ((gpu::functors::gamma_post<T>{1, 2, 1}(0)), 1);
}

/// Shape 1 with a method against exponential with another: the same bits, a word each.
template <typename T, typename Method, typename ExponentialMethod>
void expect_exponential() {
  for (const std::int64_t n : {0, 1, 6, 1001}) {
    rng::philox4x32x10 plain(host_run_gpu_queue(), seed);
    const auto expected = draw(rng::exponential<T, ExponentialMethod>(T(-0.5), T(1.25)), plain, n);
    for (const auto form : both_forms) {
      rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
      const auto got = draw_at_level(form, rng::gamma<T, Method>(1, T(-0.5), T(1.25)), engine, n,
                                     static_cast<std::size_t>(n));
      EXPECT_EQ(got.values, expected);
      EXPECT_EQ(got.consumed, n);
    }
  }
}

TYPED_TEST(gamma_road, shape_one_is_exponential_with_one_word_for_a_result) {
  expect_exponential<TypeParam, marsaglia, rng::exponential_method::icdf>();
  expect_exponential<TypeParam, marsaglia_accurate, rng::exponential_method::icdf_accurate>();
}

TYPED_TEST(gamma_road, one_result_is_the_first_survivor_of_pairs_four_words_each) {
  using T = TypeParam;
  const auto u = uniforms<T>(seed, 400);
  for (const T alpha : {T(0.3), T(0.8), T(1.5)}) {
    const rng::gamma<T, marsaglia> distr(alpha, T(-1), 2);
    const auto functor = gamma_candidates(alpha);
    std::size_t words = 0;
    T expected = -1;
    while (!(expected >= 0)) {
      const auto pair =
          functor(sycl::vec<T, 4>(u[words], u[words + 1], u[words + 2], u[words + 3]));
      words += 4;
      expected = pair[0] >= 0 ? pair[0] : pair[1];
    }
    for (const auto form : both_forms) {
      rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
      const auto got = draw_at_level(form, distr, engine, 1, 1);
      EXPECT_EQ(got.values[0], std::fma(expected, T(2), T(-1)));
      EXPECT_EQ(got.consumed, static_cast<std::int64_t>(words));
    }
  }
}

TYPED_TEST(gamma_road, odd_counts_end_with_a_pair_for_the_last_result) {
  using T = TypeParam;
  // Hardly anything of a large shape is rejected: candidates 1 and 2, then the first of a pair.
  const auto u = uniforms<T>(seed, 8);
  const rng::gamma<T, marsaglia> distr(500, 0, 1);
  const auto functor = gamma_candidates(T(500));
  const auto first = functor(sycl::vec<T, 4>(u[0], u[1], u[2], u[3]));
  const auto last = functor(sycl::vec<T, 4>(u[4], u[5], u[6], u[7]));
  ASSERT_TRUE(first[0] >= 0 && first[1] >= 0 && last[0] >= 0);
  for (const auto form : both_forms) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    const auto got = draw_at_level(form, distr, engine, 3, 3);
    EXPECT_EQ(got.values, (std::vector<T>{first[0], first[1], last[0]}));
    EXPECT_EQ(got.consumed, 8);
  }
}

TYPED_TEST(gamma_road, no_results_take_no_words) {
  using T = TypeParam;
  for (const auto form : both_forms) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    EXPECT_EQ(draw_at_level(form, rng::gamma<T, marsaglia>(T(0.5), 0, 1), engine, 0, 0).consumed,
              0);
    EXPECT_EQ(draw(rng::uniform<T>(0, 1), engine, 4), uniforms<T>(seed, 4));
  }
}

TYPED_TEST(gamma_road, accurate_draws_the_same_above_the_displacement) {
  using T = TypeParam;
  // Next to a large displacement most results of a small shape are rounded to it.
  const T a = T(1000);
  for (const T alpha : {T(0.05), T(0.7), T(2)}) {
    rng::philox4x32x10 plain_engine(host_run_gpu_queue(), seed), engine(host_run_gpu_queue(), seed);
    const auto plain = draw(rng::gamma<T, marsaglia>(alpha, a, T(0.001)), plain_engine, 999);
    const auto accurate = draw(rng::gamma<T, marsaglia_accurate>(alpha, a, T(0.001)), engine, 999);
    EXPECT_EQ(accurate, plain);
    for (const T x : accurate) {
      ASSERT_GE(x, a);
    }
  }
}

}  // namespace
