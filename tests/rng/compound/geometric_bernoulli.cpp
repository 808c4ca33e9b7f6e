// SPDX-License-Identifier: Apache-2.0
// geometric and bernoulli on GPUs: the kernel functors on chosen uniforms, at the ends of their
// probabilities, and through generate.
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/trials.hpp"
#include "drawing.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using rng::detail::device_type;
using rng::detail::distribution_impl;
using tarn_test::cpu_queue;
using tarn_test::draw;
using tarn_test::draw_into_buffer;
using tarn_test::host_run_gpu_queue;

const float next_to_one = std::nextafter(1.0f, 0.0f);
constexpr float least_word = 0x1p-32f;

/// The kernel functor of a public distribution.
template <typename Distr>
auto functor_of(const Distr& distr) {
  return distribution_impl<typename Distr::result_type, Distr, device_type::gpu>(distr).kernel;
}

template <typename T>
struct trial_functors : testing::Test {};
using result_types = testing::Types<std::int32_t, std::uint32_t>;
TYPED_TEST_SUITE(trial_functors, result_types);

TYPED_TEST(trial_functors, records_are_the_range_and_the_probability_in_float) {
  using T = TypeParam;
  const auto check = [](const auto& functor) {
    static_assert(std::is_trivially_copyable_v<std::decay_t<decltype(functor)>>);
    const auto& [r0, r1, p] = functor;
    static_assert(std::is_same_v<std::decay_t<decltype(p)>, float>);
    EXPECT_EQ(r0, 0);
    EXPECT_EQ(r1, 1);
    EXPECT_EQ(p, 0.3f);
  };
  check(functor_of(rng::bernoulli<T>(0.3)));
  check(functor_of(rng::geometric<T>(0.3)));
}

TYPED_TEST(trial_functors, bernoulli_is_1_below_its_probability) {
  const auto functor = functor_of(rng::bernoulli<TypeParam>(0.25));
  EXPECT_EQ(functor.one(0), 1);
  EXPECT_EQ(functor.one(std::nextafter(0.25f, 0.0f)), 1);
  EXPECT_EQ(functor.one(0.25f), 0);
  EXPECT_EQ(functor.one(next_to_one), 0);
  EXPECT_EQ(functor.one(std::numeric_limits<float>::quiet_NaN()), 0);
  const auto values = functor(sycl::vec<float, 4>(0.5f, 0.125f, 0.0f, 0.25f));
  const TypeParam expected[] = {0, 1, 1, 0};
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(values[i], expected[i]);
  }
}

TYPED_TEST(trial_functors, bernoulli_is_constant_at_the_ends) {
  for (const float u : {0.0f, least_word, 0.5f, next_to_one, 1.0f}) {  // rounded to 1
    EXPECT_EQ(functor_of(rng::bernoulli<TypeParam>(1)).one(u), 1);
    EXPECT_EQ(functor_of(rng::bernoulli<TypeParam>(0)).one(u), 0);
  }
}

TYPED_TEST(trial_functors, bernoulli_has_its_probability_rounded_to_float) {
  using distr = rng::bernoulli<TypeParam>;
  EXPECT_EQ(functor_of(distr(0.1)).one(std::nextafter(0.1f, 0.0f)), 1);
  EXPECT_EQ(functor_of(distr(0.1)).one(0.1f), 0);
  EXPECT_GT(0.1f, 0.1);                                           // rounded up
  EXPECT_EQ(functor_of(distr(1 - 0x1p-26)).one(next_to_one), 1);  // to 1
  EXPECT_EQ(functor_of(distr(1 - 0x1p-24)).one(next_to_one), 0);
  EXPECT_EQ(functor_of(distr(1e-50)).one(0), 0);  // to 0
}

TYPED_TEST(trial_functors, geometric_counts_the_failures_in_a_uniform) {
  using T = TypeParam;
  for (const double p : {0.01, 0.25, 0.5, 0.9}) {
    const auto functor = functor_of(rng::geometric<T>(p));
    const float rounded = static_cast<float>(p);
    const long double rate = std::log(static_cast<long double>(1 - rounded));
    for (int k = 1; k < 4000; ++k) {
      const float u = static_cast<float>(k) / 4000;
      const long double quotient = std::log(static_cast<long double>(u)) / rate;
      // Two logarithms, a reciprocal and a product: below 4 units in the last place.
      const long double error = quotient * 0x1p-22L;
      const T value = functor.one(u);
      ASSERT_GE(value, std::floor(quotient - error)) << p << ' ' << u;
      ASSERT_LE(value, std::floor(quotient + error)) << p << ' ' << u;
    }
  }
}

TYPED_TEST(trial_functors, geometric_is_the_same_for_four_and_for_one) {
  const auto functor = functor_of(rng::geometric<TypeParam>(0.001));
  const float u[] = {0.0f, least_word, 0.3f, next_to_one};
  const auto values = functor(sycl::vec<float, 4>(u[0], u[1], u[2], u[3]));
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(values[i], functor.one(u[i]));
  }
  EXPECT_GT(values[1], 20000u);
  EXPECT_EQ(values[3], 0u);
}

TYPED_TEST(trial_functors, geometric_of_0_takes_the_stand_in_of_its_logarithm) {
  EXPECT_EQ(functor_of(rng::geometric<TypeParam>(0.5)).one(0), 149);  // 103.28 / 0.693
  // The greatest probability below 1: 103.28 / 16.6.
  EXPECT_EQ(functor_of(rng::geometric<TypeParam>(1 - 0x1p-24)).one(0), 6);
}

// Probabilities that round to 1 have the stand-in as their own logarithm; over itself it is next
// below 1.
TYPED_TEST(trial_functors, geometric_of_probability_1_in_float) {
  const auto functor = functor_of(rng::geometric<TypeParam>(1 - 0x1p-30));
  EXPECT_EQ(functor.p, 1);
  for (const float u : {0.0f, least_word, 0.5f, next_to_one}) {
    EXPECT_EQ(functor.one(u), 0);
  }
}

// 1 - p is 1 up to p = 2^-25, its logarithm is 0 and every quotient minus infinity.
TYPED_TEST(trial_functors, geometric_of_probability_0_in_float_is_the_least_number) {
  constexpr TypeParam least = std::numeric_limits<TypeParam>::min();
  for (const double p : {0x1p-25, 0x1p-26, 1e-10, 1e-300}) {
    const auto functor = functor_of(rng::geometric<TypeParam>(p));
    for (const float u : {0.0f, least_word, 0.5f, next_to_one, 1.0f}) {
      EXPECT_EQ(functor.one(u), least) << p << ' ' << u;
    }
  }
  // The least probability above counts, in steps of 2^24.
  const auto functor = functor_of(rng::geometric<TypeParam>(std::nextafter(0x1p-25f, 1.0f)));
  EXPECT_EQ(functor.one(next_to_one), 1);
  EXPECT_NEAR(functor.one(0.5f), 0.6931471805599453 * 0x1p24, 4);
  EXPECT_NEAR(functor.one(0), 103.278931 * 0x1p24, 512);
}

/// Draws on a GPU, into either output, and on the host from the functor.
template <typename Engine, typename Distr>
void expect_functor_of_uniforms(const Distr& distr) {
  for (const std::int64_t n : {1, 2, 3, 5, 1003}) {
    Engine engine(host_run_gpu_queue(), 77);
    Engine same(host_run_gpu_queue(), 77);
    Engine host(cpu_queue(), 77);
    const auto values = draw(distr, engine, n);
    EXPECT_EQ(values, draw_into_buffer(distr, same, n));
    const auto uniforms = draw(rng::uniform<float>(), host, n);
    const auto functor = functor_of(distr);
    for (std::size_t i = 0; i < values.size(); ++i) {
      ASSERT_EQ(values[i], functor.one(uniforms[i])) << i << " of " << n;
    }
  }
}

TYPED_TEST(trial_functors, draw_from_an_engine) {
  using T = TypeParam;
  expect_functor_of_uniforms<rng::philox4x32x10>(rng::bernoulli<T>(0.3));
  expect_functor_of_uniforms<rng::philox4x32x10>(rng::geometric<T>(0.3));
  expect_functor_of_uniforms<rng::philox4x32x10>(rng::geometric<T>(1e-10));
  expect_functor_of_uniforms<rng::mcg59>(rng::bernoulli<T>(0.75));
  expect_functor_of_uniforms<rng::mcg59>(rng::geometric<T>(0.001));
}

TYPED_TEST(trial_functors, bernoulli_draws_a_share_of_ones) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 3);
  const std::int64_t n = 100000;
  TypeParam ones = 0;
  for (const TypeParam value : draw(rng::bernoulli<TypeParam>(0.3), engine, n)) {
    ASSERT_LE(value, TypeParam{1});
    ones += value;
  }
  EXPECT_NEAR(ones, 30000, 725);  // five deviations of 145
}

}  // namespace
