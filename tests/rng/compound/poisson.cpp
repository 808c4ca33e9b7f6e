// SPDX-License-Identifier: Apache-2.0
// poisson on GPUs: the kernel functor against its formulas in long double, the edges between the
// regimes, and through generate on every engine.
#include "distributions/poisson.hpp"

#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "every_engine.hpp"
#include "formula_support.hpp"
#include "level_calls.hpp"
#include "queues.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using real = long double;
using by_normal = rng::poisson_method::gaussian_icdf_based;
using rng::detail::device_type;
using tarn_test::canonical_reals;
using tarn_test::draw;
using tarn_test::host_run_gpu_queue;

template <typename T>
gpu::poisson_gaussian_icdf_based<T> functor_of(double lambda) {
  using distr = rng::poisson<T, by_normal>;
  return rng::detail::distribution_impl<T, distr, device_type::gpu>(distr(lambda)).kernel;
}

/// c[0] x^(terms - 1) + ... + c[terms - 1].
real horner(std::initializer_list<real> c, real x) {
  real sum = 0;
  for (const real term : c) {
    sum = sum * x + term;
  }
  return sum;
}

/// A result is the integer below a real, which the model has up to `slack`.
struct plain_result {
  real value;
  real slack;
};

/// The units are those of float at the greatest of the terms that are added up; a dozen roundings
/// of them and of the factors before them.
real slack_of(real a, real x) {
  return 12 * 0x1p-24L * (std::fabs(a) + std::fabs(x - a) + 1);
}

plain_result plain_large(real lambda, float u) {
  const real i = 1 / lambda;
  const real a =
      lambda + horner({0.00164515374L, -0.00128871936L, -0.0194102079L, -0.666695714L}, i);
  const real b = std::sqrt(
      lambda + horner({0.00519830827L, -0.00553485425L, -0.000975814823L, -0.0558066778L}, i));
  const real c =
      i * horner({2.02847028L, -3.85841203L, 2.29098272L, -0.443911403L, 0.00774710532L}, i);
  const real d =
      i * horner({-0.185436428L, 0.35864222L, -0.228162378L, 0.0472242348L, 0.168577015L}, i);
  const real e =
      i *
      horner({0.0143892644L, -0.029111309L, 0.0232257955L, -0.0126559986L, -0.000114586554L}, i);
  const real distance = b * std::sqrt(2.0L) * gpu::erfinv_wrapper(u);
  const real x = a + horner({e, d, c + 1, 0}, distance);
  return {x + 1, slack_of(a, x)};
}

plain_result plain_medium(real lambda, float u) {
  const int e = std::ilogb(lambda);
  const real t = std::ldexp(lambda, -e) - 1;
  const float* c = gpu::medium_lambda_table_32 + 23 * e;
  const auto cubic = [&](int k) { return horner({c[k + 3], c[k + 2], c[k + 1], c[k]}, t); };
  const real a = horner({c[2], c[1], c[0]}, t);
  const real z = std::sqrt(2.0L) * gpu::erfinv_wrapper(u);
  const real x = a + cubic(3) * horner({cubic(19), cubic(15), cubic(11), cubic(7), 0}, z);
  return {x + 1, slack_of(a, x)};
}

/// The count of sums that w exceeds, found from above; the slack is one of w here.
std::pair<int, int> plain_small(real lambda, float u) {
  const real total = horner({0.000335164164L, 0.00113698049L, 0.00856593065L, 0.041548796L,
                             0.166699171L, 0.499995559L, 1.00000024L, 1},
                            lambda);
  const real w = (static_cast<real>(u) + 1) * total / 2;
  const real slack = 16 * 0x1p-24L * total;
  const auto count = [&](real x) {
    real sum = 0;
    int k = 0;
    for (real term = 1; k <= 10; ++k, term *= lambda / k) {
      sum += term;
      if (x <= sum) {
        break;
      }
    }
    return k;
  };
  return {count(w - slack), count(w + slack)};
}

/// Counts the results that lie so close to a step that two are right.
template <typename T>
void expect_between(T got, real low, real high, int* close) {
  const real least = std::floor(std::fmax(low, 0.0L));
  const real most = std::floor(std::fmax(high, 0.0L));
  ASSERT_GE(static_cast<real>(got), least);
  ASSERT_LE(static_cast<real>(got), most);
  *close += least != most ? 1 : 0;
}

template <typename T>
struct poisson_functor : testing::Test {};
using result_types = testing::Types<std::int32_t, std::uint32_t>;
TYPED_TEST_SUITE(poisson_functor, result_types);

TYPED_TEST(poisson_functor, is_its_formula_for_large_rates) {
  int close = 0;
  const auto reals = canonical_reals<float>(-1, 1);
  for (const float lambda : {100.0f, 127.5f, 1000.0f, 12345.678f, 1e5f}) {
    const auto functor = functor_of<TypeParam>(lambda);
    for (const float u : reals) {
      const plain_result plain = plain_large(lambda, u);
      ASSERT_NO_FATAL_FAILURE(expect_between(functor.one(u), plain.value - plain.slack,
                                             plain.value + plain.slack, &close));
    }
  }
  EXPECT_LT(close, 10000);  // of fifty thousand, nearly all at the greatest rate
}

TYPED_TEST(poisson_functor, is_its_formula_for_medium_rates) {
  int close = 0;
  const auto reals = canonical_reals<float>(-1, 1);
  for (const float lambda : {1.0f, 1.5f, std::nextafter(2.0f, 0.0f), 2.0f, 4.7f, 8.0f, 15.0f, 31.9f,
                             32.0f, 63.0f, 64.0f, 99.999f}) {
    const auto functor = functor_of<TypeParam>(lambda);
    for (const float u : reals) {
      const plain_result plain = plain_medium(lambda, u);
      ASSERT_NO_FATAL_FAILURE(expect_between(functor.one(u), plain.value - plain.slack,
                                             plain.value + plain.slack, &close));
    }
  }
  EXPECT_LT(close, 100);
}

TYPED_TEST(poisson_functor, is_its_formula_for_small_rates) {
  int close = 0;
  const auto reals = canonical_reals<float>(-1, 1);
  for (const float lambda : {1e-30f, 1e-6f, 0.01f, 0.5f, 0.99f, std::nextafter(1.0f, 0.0f)}) {
    const auto functor = functor_of<TypeParam>(lambda);
    for (const float u : reals) {
      const auto [low, high] = plain_small(lambda, u);
      ASSERT_NO_FATAL_FAILURE(expect_between(functor.one(u), low, high, &close));
    }
  }
  EXPECT_LT(close, 100);
}

TYPED_TEST(poisson_functor, the_median_is_exact) {
  // u = 0 gives x = A, the solution of Q(A + 1, lambda) = 1/2: 0.31, 63.33, 99.33, 999.33.
  EXPECT_EQ(functor_of<TypeParam>(1).one(0), 1u);
  EXPECT_EQ(functor_of<TypeParam>(64).one(0), 64u);
  EXPECT_EQ(functor_of<TypeParam>(100).one(0), 100u);
  EXPECT_EQ(functor_of<TypeParam>(1000).one(0), 1000u);
  EXPECT_EQ(functor_of<TypeParam>(0.5).one(0), 0u);
}

/// How many of the uniforms another regime has other results for.
template <typename T, typename Other>
int differences(const gpu::poisson_gaussian_icdf_based<T>& functor, const Other& other) {
  int count = 0;
  for (int i = -(1 << 19); i < 1 << 19; ++i) {
    const float u = static_cast<float>(i) * 0x1p-19f;
    count += functor.one(u) != other.one(u) ? 1 : 0;
  }
  return count;
}

TYPED_TEST(poisson_functor, a_rate_of_100_is_large) {
  const auto functor = functor_of<TypeParam>(100.0);
  EXPECT_EQ(differences(functor, gpu::poisson_large_rate<TypeParam>(100)), 0);
  EXPECT_GT(differences(functor, gpu::poisson_medium_rate<TypeParam>(100)), 0);
}

TYPED_TEST(poisson_functor, a_rate_of_99_999_is_medium) {
  const auto functor = functor_of<TypeParam>(99.999);
  EXPECT_EQ(differences(functor, gpu::poisson_medium_rate<TypeParam>(99.999f)), 0);
  EXPECT_GT(differences(functor, gpu::poisson_large_rate<TypeParam>(99.999f)), 0);
}

TYPED_TEST(poisson_functor, a_rate_of_1_is_medium_and_takes_the_first_row) {
  const auto functor = functor_of<TypeParam>(1.0);
  EXPECT_EQ(differences(functor, gpu::poisson_medium_rate<TypeParam>(1)), 0);
  EXPECT_GT(differences(functor, gpu::poisson_small_rate<TypeParam>(1)), 0);
}

TYPED_TEST(poisson_functor, a_rate_of_0_99_is_small) {
  const auto functor = functor_of<TypeParam>(0.99);
  EXPECT_EQ(differences(functor, gpu::poisson_small_rate<TypeParam>(0.99f)), 0);
}

TYPED_TEST(poisson_functor, small_rates_never_give_more_than_11) {
  for (const float lambda : {0.1f, 0.5f, 0.99f, std::nextafter(1.0f, 0.0f)}) {
    const auto functor = functor_of<TypeParam>(lambda);
    TypeParam most = 0;
    for (int i = 0; i < 1 << 16; ++i) {
      most = std::max(most, functor.one(1 - static_cast<float>(i) * 0x1p-24f));
    }
    EXPECT_LE(most, 11u) << lambda;
    EXPECT_GE(most, 5u) << lambda;
  }
  // What exceeds all sums ends at 11, and so does a rate that is no number.
  EXPECT_EQ(functor_of<TypeParam>(0.99).one(3), 11u);
  EXPECT_EQ(functor_of<TypeParam>(std::numeric_limits<double>::quiet_NaN()).one(0), 11u);
}

TYPED_TEST(poisson_functor, the_least_uniform_gives_0_for_small_rates) {
  for (const double lambda : {1e-300, 1e-3, 0.99}) {
    EXPECT_EQ(functor_of<TypeParam>(lambda).one(-1), 0u);
  }
}

TYPED_TEST(poisson_functor, the_ends_are_5_42_deviations_from_the_median) {
  const auto ends = [](double lambda) {
    const auto functor = functor_of<TypeParam>(lambda);
    return std::pair<real, real>(functor.one(-1), functor.one(1));
  };
  for (const double lambda : {1.0, 2.0, 64.0}) {
    const auto [low, high] = ends(lambda);
    EXPECT_EQ(low, std::floor(std::fmax(plain_medium(lambda, -1).value, 0.0L))) << lambda;
    EXPECT_EQ(high, std::floor(plain_medium(lambda, 1).value)) << lambda;
  }
  for (const double lambda : {100.0, 1000.0}) {
    const auto [low, high] = ends(lambda);
    EXPECT_EQ(low, std::floor(plain_large(lambda, -1).value)) << lambda;
    EXPECT_EQ(high, std::floor(plain_large(lambda, 1).value)) << lambda;
  }
  // Phi(-5.42) is 3.0e-8, so that these are about the ends of thirty million values of the law.
  EXPECT_EQ(ends(1).first, 0);
  EXPECT_EQ(ends(1).second, 10);
  EXPECT_EQ(ends(64).first, 26);
  EXPECT_EQ(ends(64).second, 112);
}

TYPED_TEST(poisson_functor, the_rate_goes_to_float_before_the_regime_is_chosen) {
  const double below_100 = std::nextafter(100.0, 0.0);
  EXPECT_EQ(functor_of<TypeParam>(below_100).lambda, 100.0f);
  EXPECT_EQ(differences(functor_of<TypeParam>(below_100), gpu::poisson_large_rate<TypeParam>(100)),
            0);
  const double below_1 = std::nextafter(1.0, 0.0);
  EXPECT_EQ(functor_of<TypeParam>(below_1).lambda, 1.0f);
  EXPECT_EQ(differences(functor_of<TypeParam>(below_1), gpu::poisson_medium_rate<TypeParam>(1)), 0);
  EXPECT_EQ(functor_of<TypeParam>(0.1).lambda, 0.1f);
  EXPECT_EQ(functor_of<TypeParam>(1e-60).one(1), 0u);  // a rate of 0
}

TYPED_TEST(poisson_functor, results_that_the_type_cannot_hold_are_its_greatest) {
  constexpr auto greatest = std::numeric_limits<TypeParam>::max();
  for (const double lambda : {1e10, 1e30, 1e300, std::numeric_limits<double>::infinity()}) {
    for (const float u : {-1.0f, -0.5f, 0.0f, 0.5f, 1.0f}) {
      EXPECT_EQ(functor_of<TypeParam>(lambda).one(u), greatest) << lambda << ' ' << u;
    }
  }
  const auto result = functor_of<TypeParam>(3e9).one(0);
  if (std::is_same_v<TypeParam, std::int32_t>) {
    EXPECT_EQ(result, greatest);
  } else {
    EXPECT_NEAR(static_cast<double>(result), 3e9, 512);
  }
}

TYPED_TEST(poisson_functor, four_uniforms_give_four_results_in_order) {
  const auto reals = canonical_reals<float>(-1, 1);
  for (const double lambda : {0.7, 37.5, 450.0}) {
    const auto functor = functor_of<TypeParam>(lambda);
    for (std::size_t i = 0; i + 4 <= reals.size(); i += 4) {
      const auto four =
          functor(sycl::vec<float, 4>(reals[i], reals[i + 1], reals[i + 2], reals[i + 3]));
      for (int k = 0; k < 4; ++k) {
        ASSERT_EQ(four[k], functor.one(reals[i + static_cast<std::size_t>(k)]));
      }
    }
  }
}

TYPED_TEST(poisson_functor, the_record_is_the_rate_then_the_range) {
  using functor = gpu::poisson_gaussian_icdf_based<TypeParam>;
  static_assert(std::is_trivially_copyable_v<functor> && sizeof(functor) == 3 * sizeof(float));
  const auto& [lambda, r0, r1] = functor_of<TypeParam>(2.5);
  EXPECT_EQ(lambda, 2.5f);
  EXPECT_EQ(r0, -1);
  EXPECT_EQ(r1, 1);
  EXPECT_EQ(functor_of<TypeParam>(2.5).range().lo, -1);
  EXPECT_EQ(functor_of<TypeParam>(2.5).range().hi, 1);
}

template <typename Case>
class poisson_on : public testing::Test {};
TYPED_TEST_SUITE(poisson_on, tarn_test::device_cases, tarn_test::case_name);

/// One word each: what the functor makes of the engine's own uniforms, and the engine goes on
/// behind them.
template <typename Case, typename T>
void expect_functor_of_uniforms(double lambda, std::int64_t n) {
  auto uniforms = Case::make(host_run_gpu_queue());
  auto engine = Case::make(host_run_gpu_queue());
  auto same = Case::make(host_run_gpu_queue());
  const auto functor = functor_of<T>(lambda);
  std::vector<T> expected;
  for (const float u : draw(rng::uniform<float>(-1.0f, 1.0f), uniforms, n)) {
    expected.push_back(functor.one(u));
  }
  const rng::poisson<T, by_normal> distr(lambda);
  ASSERT_EQ(draw(distr, engine, n), expected) << lambda << ' ' << n;
  ASSERT_EQ(tarn_test::draw_into_buffer(distr, same, n), expected) << lambda << ' ' << n;
  tarn_test::expect_next<Case>(engine, n, 5);
}

TYPED_TEST(poisson_on, takes_one_word_for_a_result) {
  for (const double lambda : {0.3, 20.0, 5000.0}) {
    for (const std::int64_t n : {1, 3, 250, 1001}) {
      expect_functor_of_uniforms<TypeParam, std::int32_t>(lambda, n);
      expect_functor_of_uniforms<TypeParam, std::uint32_t>(lambda, n);
    }
  }
}

}  // namespace
