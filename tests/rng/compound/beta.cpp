// SPDX-License-Identifier: Apache-2.0
// beta on GPU queues: which method two shapes take and the numbers it is set up with, the place of
// results, inversion, and calls whose passes can be followed by hand.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <string>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "distributions/beta_gpu_dispatch.hpp"
#include "drawing.hpp"
#include "formula_support.hpp"
#include "gamma_support.hpp"
#include "level_calls.hpp"
#include "message.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using gpu::beta_candidates;
using gpu::beta_candidates_of;
using gpu::functors::beta_power;
using gpu::functors::beta_way;
using cja = rng::beta_method::cja;
using cja_accurate = rng::beta_method::cja_accurate;
using rng::detail::device_type;
using rng::detail::distribution_impl_ex;
using tarn_test::both_forms;
using tarn_test::candidate;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::host_run_gpu_queue;
using tarn_test::uniforms;

constexpr std::uint32_t seed = 1618;

template <typename T>
using beta_road = tarn_test::of_reals<T>;
TYPED_TEST_SUITE(beta_road, tarn_test::real_types);

// ---- methods and their numbers ----------------------------------------------------------------

TEST(beta_constants, the_logarithm_of_4_is_that_of_float_in_double_as_well) {
  EXPECT_EQ(sycl::bit_cast<std::uint64_t>(gpu::functors::minus_log_of_4<double>),
            0xBFF62E4300000000u);
  EXPECT_EQ(gpu::functors::minus_log_of_4<float>, -1.38629436f);
  EXPECT_NE(gpu::functors::minus_log_of_4<double>, -std::log(4.0));
}

TYPED_TEST(beta_road, methods_follow_from_the_sides_of_one) {
  using T = TypeParam;
  const auto method = [](T p, T q) { return beta_candidates_of(p, q).method; };
  const T less = TestFixture::below(1);
  const T more = TestFixture::above(1);
  EXPECT_EQ(method(T(0.5), T(0.5)), beta_way::johnk);
  EXPECT_EQ(method(T(0.9), T(0.9)), beta_way::both_below);
  EXPECT_EQ(method(less, less), beta_way::both_below);
  EXPECT_EQ(method(less, more), beta_way::first_below);
  EXPECT_EQ(method(more, less), beta_way::second_below);
  EXPECT_EQ(method(more, more), beta_way::cheng);
  EXPECT_EQ(method(T(0.01), T(100)), beta_way::first_below);
  EXPECT_EQ(method(T(100), T(0.01)), beta_way::second_below);
}

TYPED_TEST(beta_road, the_line_between_methods_belongs_to_johnk) {
  using T = TypeParam;
  const T c1 = static_cast<T>(0.8522552176537243);
  const T c2 = static_cast<T>(-0.9562409713408151);
  const T p = T(0.75);
  // In the same order and type. The steps of q are finer than those of the sum, which meets 0.
  T q = -(c1 * p * p + c2) - 8 * std::numeric_limits<T>::epsilon();
  ASSERT_LT(c1 * p * p + q + c2, 0);
  EXPECT_EQ(beta_candidates_of(p, q).method, beta_way::johnk);
  while (c1 * p * p + q + c2 < 0) {
    q = TestFixture::above(q);
  }
  ASSERT_EQ(c1 * p * p + q + c2, 0);
  EXPECT_EQ(beta_candidates_of(p, q).method, beta_way::johnk);
  while (c1 * p * p + q + c2 <= 0) {
    q = TestFixture::above(q);
  }
  EXPECT_EQ(beta_candidates_of(p, q).method, beta_way::both_below);
}

TYPED_TEST(beta_road, records_draw_canonical_reals_two_for_a_candidate) {
  using T = TypeParam;
  using functor = beta_candidates<T>;
  static_assert(std::is_trivially_copyable_v<functor>);
  static_assert(functor::asks == gpu::drawn::reals && gpu::has_pair<functor>);
  static_assert(gpu::words_per_result<functor> == 2 && !gpu::is_whole<functor>);
  const auto& [r0, r1, p, q, split, t, w1, w2, e1, e2, r1t, rt, inv, s, bb, cc, method] =
      beta_candidates_of(T(0.25), T(0.5));
  EXPECT_EQ(r0, 0);
  EXPECT_EQ(r1, 1);
  EXPECT_EQ(p, T(0.25));
  EXPECT_EQ(q, T(0.5));
  for (const T unused : {split, t, w1, w2, e1, e2, r1t, rt, inv[0], inv[1], s, bb, cc}) {
    EXPECT_EQ(unused, 0);
  }
  static_assert(sizeof method == sizeof(std::int32_t));
  EXPECT_EQ(static_cast<int>(method), 0);
}

/// Both pieces end at t, where the hat steps from one to the other.
template <typename T>
void expect_pieces_to_meet(const beta_candidates<T>& record) {
  const T error = record.t * 64 * std::numeric_limits<T>::epsilon() / std::min(record.p, record.q);
  EXPECT_GT(record.t, 0);
  EXPECT_LT(record.t, 1);
  EXPECT_NEAR(record.w1 * std::pow(record.split, record.inv[0]), record.t, error);
  EXPECT_NEAR(1 - record.w2 * std::pow(1 - record.split, record.inv[1]), record.t, error);
}

TYPED_TEST(beta_road, numbers_of_the_switching_methods) {
  using T = TypeParam;
  const T p = T(0.75), q = T(0.6);
  const auto both = beta_candidates_of(p, q);
  ASSERT_EQ(both.method, beta_way::both_below);
  expect_pieces_to_meet(both);
  const double root = std::sqrt(0.25 * 0.75);
  EXPECT_NEAR(both.t, root / (std::sqrt(0.24) + root), 1e-6);
  EXPECT_EQ(both.e1, 1 - q);
  EXPECT_EQ(both.e2, 1 - p);
  EXPECT_EQ(both.r1t, 1 / (1 - both.t));
  EXPECT_EQ(both.rt, 1 / both.t);
  const auto first = beta_candidates_of(p, T(3));
  expect_pieces_to_meet(first);
  EXPECT_EQ(first.t, T(0.25) / T(3.25));
  EXPECT_EQ(first.e1, -2);
  EXPECT_EQ(first.e2, T(0.25));
  EXPECT_EQ(first.inv[0], 1 / p);
  EXPECT_EQ(first.inv[1], 1 / T(3));
  EXPECT_EQ(first.rt, 0);
  // The mirror image has the pieces of the shapes in the other order.
  const auto second = beta_candidates_of(T(3), p);
  for (const auto member :
       {&beta_candidates<T>::split, &beta_candidates<T>::t, &beta_candidates<T>::w1,
        &beta_candidates<T>::w2, &beta_candidates<T>::e1, &beta_candidates<T>::e2}) {
    EXPECT_EQ(second.*member, first.*member);
  }
  EXPECT_EQ(second.inv[0], first.inv[0]);
  EXPECT_EQ(second.inv[1], first.inv[1]);
}

TYPED_TEST(beta_road, numbers_of_cheng_are_of_the_first_shape_not_of_the_lesser_one) {
  using T = TypeParam;
  const auto record = beta_candidates_of(T(5), T(2));
  EXPECT_EQ(record.s, 7);
  EXPECT_EQ(record.bb, std::sqrt(T(5) / T(13)));
  EXPECT_EQ(record.cc, 5 + 1 / record.bb);
}

TYPED_TEST(beta_road, the_public_parameters_reach_candidates_and_place) {
  using T = TypeParam;
  using algorithm = gpu::beta_algorithm::acc_rej;
  const distribution_impl_ex<T, rng::beta<T, cja>, device_type::gpu, algorithm> plain(
      rng::beta<T, cja>(T(2.5), T(1.5), T(-1), 3));
  EXPECT_EQ(plain.kernel.p, T(2.5));
  EXPECT_EQ(plain.kernel.q, T(1.5));
  EXPECT_EQ(plain.post.a, -1);
  EXPECT_EQ(plain.post.b, 3);
  EXPECT_EQ(plain.post.accurate, 0);
  EXPECT_EQ(plain.consumed, 0);
  const distribution_impl_ex<T, rng::beta<T, cja_accurate>, device_type::gpu, algorithm> accurate(
      rng::beta<T, cja_accurate>(T(2.5), T(1.5), T(-1), 3));
  EXPECT_EQ(accurate.post.accurate, 1);
}

// ---- results ----------------------------------------------------------------------------------

TYPED_TEST(beta_road, the_place_of_a_result_is_rounded_once) {
  using T = TypeParam;
  const gpu::functors::beta_post<T> post{T(-0.3), T(1.7), 0};
  int differ = 0;
  for (int i = 0; i <= 1000; ++i) {
    const T v = static_cast<T>(i) / 1000;
    ASSERT_EQ(post(v), std::fma(v, T(1.7), T(-0.3)));
    const T product = v * T(1.7);
    differ += post(v) != product + T(-0.3) ? 1 : 0;
  }
  EXPECT_GT(differ, 10);
}

TYPED_TEST(beta_road, accurate_results_are_raised_then_lowered) {
  using T = TypeParam;
  using gpu::functors::beta_post;
  // Numbers outside of [0, 1] stand for what rounding might leave there.
  const T beyond = TestFixture::above(1);
  const T short_of = -std::numeric_limits<T>::epsilon();
  EXPECT_LT((beta_post<T>{1, 2, 0}(short_of)), 1);
  EXPECT_EQ((beta_post<T>{1, 2, 1}(short_of)), 1);
  EXPECT_GT((beta_post<T>{0, 2, 0}(beyond)), 2);
  EXPECT_EQ((beta_post<T>{0, 2, 1}(beyond)), 2);
  // The upper end is the sum as the type has it, and is applied last.
  const T a = T(0.1), b = T(0.7);
  EXPECT_EQ((beta_post<T>{a, b, 1}(2)), a + b);
  EXPECT_EQ((beta_post<T>{1, -2, 1}(T(0.5))), -1);
  EXPECT_EQ((beta_post<T>{a, b, 1}(T(0.5))), std::fma(T(0.5), b, a));
}

// ---- inversion --------------------------------------------------------------------------------

TYPED_TEST(beta_road, a_shape_of_one_has_an_inverse_the_first_before_the_second) {
  using T = TypeParam;
  const auto record = [](T p, T q) { return gpu::beta_power_of<T>(p, q, 2, 3, true); };
  EXPECT_EQ(record(1, T(0.3)).method, beta_power::first_is_one);
  EXPECT_EQ(record(1, T(0.3)).shape, T(0.3));
  EXPECT_EQ(record(T(0.3), 1).method, beta_power::second_is_one);
  EXPECT_EQ(record(T(0.3), 1).shape, T(0.3));
  EXPECT_EQ(record(1, 1).method, beta_power::first_is_one);
  EXPECT_EQ(record(1, 1).shape, 1);
  EXPECT_EQ(record(1, TestFixture::nan).method, beta_power::first_is_one);
  EXPECT_EQ(record(TestFixture::nan, 1).method, beta_power::second_is_one);
  const auto& [r0, r1, shape, a, b, method, accurate] = record(T(7), TestFixture::nan);
  EXPECT_EQ(method, beta_power::no_number);
  EXPECT_EQ(r0, 2);
  EXPECT_EQ(r1, 5);
  EXPECT_EQ(a, 2);
  EXPECT_EQ(b, 3);
  EXPECT_EQ(accurate, 1);
  static_assert(sizeof method == sizeof(std::int32_t) && sizeof accurate == 1);
  EXPECT_EQ(record(1, 2).range().lo, 0);
  EXPECT_EQ(record(1, 2).range().hi, 1);
}

TYPED_TEST(beta_road, inversion_rounds_power_product_and_sum_apart) {
  using T = TypeParam;
  const T a = T(-0.3), b = T(1.7);
  const auto up = gpu::beta_power_of<T>(T(2.5), 1, a, b, false);
  const auto down = gpu::beta_power_of<T>(1, T(2.5), a, b, false);
  int fused_differs = 0;
  for (const T u : tarn_test::canonical_reals<T>(0, 1)) {
    const T power = sycl::pow(u, 1 / T(2.5));
    const T product = b * power;
    const T rest = b * (1 - power);
    ASSERT_EQ(up.one(u), product + a);
    ASSERT_EQ(down.one(u), rest + a);
    fused_differs += up.one(u) != std::fma(b, power, a) ? 1 : 0;
  }
  EXPECT_GT(fused_differs, 100);
}

TYPED_TEST(beta_road, accurate_inversion_is_raised_then_lowered) {
  using T = TypeParam;
  const T beyond = T(1.25);
  for (const bool accurate : {false, true}) {
    const auto up = gpu::beta_power_of<T>(2, 1, 1, 3, accurate);
    const auto down = gpu::beta_power_of<T>(1, 2, 1, 3, accurate);
    const auto plain = gpu::beta_power_of<T>(TestFixture::nan, 2, 1, 3, accurate);
    EXPECT_EQ(up.one(beyond) == 4, accurate);
    EXPECT_EQ(down.one(beyond) == 1, accurate);
    EXPECT_EQ(plain.one(5) == 4, accurate);
    EXPECT_EQ(plain.one(0) == 1, accurate);
    EXPECT_EQ(plain.one(2), 2);
  }
}

/// Draws with shapes one of which is 1, or no number, in both forms of output.
template <typename T, typename Method>
void expect_inversion(T p, T q, const std::vector<T>& expected) {
  const auto n = static_cast<std::int64_t>(expected.size());
  for (const auto form : both_forms) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    const auto got = draw_at_level(form, rng::beta<T, Method>(p, q, T(-0.3), T(1.7)), engine, n,
                                   expected.size());
    EXPECT_EQ(got.values, expected);
    EXPECT_EQ(got.consumed, n);
  }
}

TYPED_TEST(beta_road, shapes_of_one_are_uniform_through_a_power) {
  using T = TypeParam;
  for (const std::int64_t n : {0, 1, 2, 7, 1001}) {
    std::vector<T> expected;
    for (const T u : uniforms<T>(seed, n)) {
      expected.push_back(T(1.7) * (1 - sycl::pow(u, T(1))) + T(-0.3));
    }
    expect_inversion<T, cja>(1, 1, expected);
    expect_inversion<T, cja_accurate>(1, 1, expected);
  }
}

TYPED_TEST(beta_road, a_shape_that_is_no_number_gives_uniforms_of_the_range) {
  using T = TypeParam;
  const T a = T(-0.3), b = T(1.7);
  const auto expected = uniforms<T>(seed, 103, a, a + b);
  expect_inversion<T, cja>(TestFixture::nan, 2, expected);
  expect_inversion<T, cja>(2, TestFixture::nan, expected);
  expect_inversion<T, cja_accurate>(T(0.5), TestFixture::nan, expected);
}

// ---- calls --------------------------------------------------------------------------------------

TYPED_TEST(beta_road, one_result_is_the_first_survivor_two_words_each) {
  using T = TypeParam;
  const auto u = uniforms<T>(seed, 400);
  const T shapes[][2] = {{T(0.5), T(0.5)}, {T(0.9), T(0.9)}, {T(0.5), 3}, {3, T(0.5)}, {2, 3}};
  for (const auto& [p, q] : shapes) {
    const auto functor = beta_candidates_of(p, q);
    std::size_t words = 0;
    T expected = -1;
    while (!(expected >= 0)) {
      expected = candidate(functor, u[words], u[words + 1]);
      words += 2;
    }
    for (const auto form : both_forms) {
      rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
      const auto got = draw_at_level(form, rng::beta<T, cja>(p, q, -1, 2), engine, 1, 1);
      EXPECT_EQ(got.values[0], std::fma(expected, T(2), T(-1)));
      EXPECT_EQ(got.consumed, static_cast<std::int64_t>(words));
    }
  }
}

TYPED_TEST(beta_road, odd_counts_draw_odd_counts_of_candidates) {
  using T = TypeParam;
  const auto u = uniforms<T>(seed, 400);
  const auto functor = beta_candidates_of(T(2), T(3));
  // Passes of as many candidates as results are missing.
  std::vector<T> expected;
  std::size_t next = 0;
  while (expected.size() < 7) {
    for (std::size_t left = 7 - expected.size(); left > 0; --left, next += 2) {
      const T x = candidate(functor, u[next], u[next + 1]);
      if (x >= 0) {
        expected.push_back(x);
      }
    }
  }
  for (const auto form : both_forms) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    const auto got = draw_at_level(form, rng::beta<T, cja>(2, 3, 0, 1), engine, 7, 7);
    EXPECT_EQ(got.values, expected);
    EXPECT_EQ(got.consumed, static_cast<std::int64_t>(next));
  }
}

TYPED_TEST(beta_road, accurate_results_stay_inside) {
  using T = TypeParam;
  const T a = T(0.1), b = T(0.7);
  const T shapes[][2] = {{T(0.02), T(0.02)}, {T(0.9), T(0.9)}, {T(0.1), 3}, {3, T(0.1)}, {2, 3}};
  for (const auto& [p, q] : shapes) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    for (const T x : draw(rng::beta<T, cja_accurate>(p, q, a, b), engine, 5000)) {
      ASSERT_TRUE(a <= x && x <= a + b) << x;
    }
  }
}

// Without the refusal each of these would draw candidates for ever, or nearly so.
TYPED_TEST(beta_road, shapes_of_which_nothing_would_be_accepted_are_refused) {
  using T = TypeParam;
  constexpr bool single = std::is_same_v<T, float>;
  const auto refusal = [](T p, T q) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    T value = 7;
    const std::string text = tarn_test::message_of<kestrel::tarn::invalid_argument>(
        [&] { rng::generate(rng::beta<T>(p, q), engine, 1, &value).wait(); });
    EXPECT_EQ(value == 7, text != "[nothing raised]");
    return text;
  };
  const std::string refused =
      "kestrel::tarn::rng::beta: invalid argument: these parameters are not supported on GPU";
  const T tiny = single ? T(1e-7) : T(1e-8);
  EXPECT_EQ(refusal(tiny, tiny), refused);                           // both powers vanish
  EXPECT_EQ(refusal(single ? T(1e-6) : T(1e-8), T(0.99)), refused);  // no height of the first piece
  const T least = std::numeric_limits<T>::min();
  const T greatest = std::numeric_limits<T>::max();
  EXPECT_EQ(refusal(greatest, greatest), refused);
  EXPECT_EQ(refusal(2 / std::numeric_limits<T>::epsilon(), 8), refused);
  EXPECT_EQ(refusal(TestFixture::below(1), greatest), refused);  // no first piece
  EXPECT_EQ(refusal(T(1e-4), T(1e-4)), "[nothing raised]");
  EXPECT_EQ(refusal(T(1e-4), T(0.99)), "[nothing raised]");
  EXPECT_EQ(refusal(least, 2), "[nothing raised]");
  EXPECT_EQ(refusal(1 / std::numeric_limits<T>::epsilon(), 8), "[nothing raised]");
}

TYPED_TEST(beta_road, no_results_take_no_words) {
  using T = TypeParam;
  for (const auto form : both_forms) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), seed);
    EXPECT_EQ(draw_at_level(form, rng::beta<T, cja>(2, 3, 0, 1), engine, 0, 0).consumed, 0);
    EXPECT_EQ(draw(rng::uniform<T>(0, 1), engine, 4), uniforms<T>(seed, 4));
  }
}

}  // namespace
