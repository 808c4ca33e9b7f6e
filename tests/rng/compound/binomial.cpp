// SPDX-License-Identifier: Apache-2.0
// binomial on GPUs: the choice between fill, table and rejection, the table and the walk behind it,
// and the law. "Kept" marks what departs from it.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/binomial_gpu_dispatch.hpp"
#include "level_calls.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using table_functor = gpu::functors::binomial<gpu::binomial_algorithm::icdf>;
using kestrel::tarn::service::_bcdf_params;
using tarn_test::both_forms;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::host_run_gpu_queue;

constexpr std::int32_t greatest = std::numeric_limits<std::int32_t>::max();
constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr double below_one = 1 - 0x1p-53;

double before(double x) {
  return std::nextafter(x, -HUGE_VAL);
}

/// ln of the probability of y in n trials.
long double log_law(double n, double p, double y) {
  const auto log_binomial = [](long double total, long double part) {
    return std::lgamma(total + 1) - std::lgamma(part + 1) - std::lgamma(total - part + 1);
  };
  return log_binomial(n, y) + y * std::log(static_cast<long double>(p)) +
         (n - y) * std::log1p(-static_cast<long double>(p));
}

table_functor on_table(const _bcdf_params& table, bool flip = false) {
  return {0.0, 1.0, &table, flip};
}

TEST(binomial_table, records_its_parameters_with_p_as_given) {
  const _bcdf_params rare = gpu::bcdf_record(20, 0.25);
  EXPECT_EQ(rare.n, 20);
  EXPECT_EQ(rare.p, 0.25);
  EXPECT_EQ(rare.s, 0.25 / 0.75);
  EXPECT_EQ(rare.a, 21 * (0.25 / 0.75));
  // Flipped properly, unlike the record of BTPE.
  const _bcdf_params common = gpu::bcdf_record(20, 0.75);
  EXPECT_EQ(common.p, 0.75);
  EXPECT_EQ(common.s, rare.s);
  EXPECT_EQ(common.a, rare.a);
  for (int k = 0; k < 64; ++k) {
    EXPECT_EQ(common.cdf[k], rare.cdf[k]);
  }
}

// All 64 entries, those behind the made end too.
TEST(binomial_table, holds_the_sums_of_the_law) {
  for (const auto& [n, p] : {std::pair{1, 0.5},
                             {1, 0.01},
                             {59, 0.5},
                             {100, 0.2999},
                             {100, 0.7001},
                             {2147483647, 1e-10},
                             {2147483647, 29.99 / 2147483647}}) {
    const _bcdf_params table = gpu::bcdf_record(n, p);
    const double r = p < 0.5 ? p : 1 - p;
    long double sum = 0;
    for (int k = 0; k < 64; ++k) {
      sum += k <= n ? std::exp(log_law(n, r, k)) : 0;
      // The rounding of 1 - p is raised to the power n; 59 ratios and as many sums.
      ASSERT_NEAR(table.cdf[k], static_cast<double>(sum), 1e-13 + n * 0x1p-54) << n << ' ' << p;
    }
  }
}

TEST(binomial_table, gives_the_first_count_whose_sum_is_above_the_uniform) {
  const _bcdf_params table = gpu::bcdf_record(100, 0.25);
  const table_functor functor = on_table(table);
  const table_functor flipped = on_table(table, true);
  EXPECT_EQ(functor.one(0), 0);
  EXPECT_EQ(flipped.one(0), 100);
  EXPECT_EQ(functor.one(before(table.cdf[0])), 0);
  for (int k = 1; k < 56; ++k) {
    ASSERT_LT(table.cdf[k - 1], table.cdf[k]);
    EXPECT_EQ(functor.one(table.cdf[k - 1]), k);
    EXPECT_EQ(functor.one(before(table.cdf[k])), k);
    EXPECT_EQ(flipped.one(before(table.cdf[k])), 100 - k);
  }
  const auto values = functor(sycl::vec<double, 4>(0, table.cdf[0], table.cdf[20], table.cdf[6]));
  const std::int32_t expected[] = {0, 1, 21, 7};
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(values[i], expected[i]);
  }
}

// The made entries end at 60 here, where more than 1e-7 is left; from 64 on the law is walked.
TEST(binomial_table, goes_on_behind_its_end_by_the_ratio_of_terms) {
  const std::int32_t n = 3000;
  const double p = 29.99 / n;
  const _bcdf_params table = gpu::bcdf_record(n, p);
  const table_functor functor = on_table(table);
  long double behind = 0;  // more than k, summed from the far end
  for (int k = 110; k >= 58; --k) {
    const long double term = std::exp(log_law(n, p, k));
    if (term > 1e-11L) {  // the rounding of 1 - p is raised to the power n
      EXPECT_EQ(functor.one(static_cast<double>(1 - (behind + term / 2))), k);
    }
    behind += term;
  }
  EXPECT_GT(behind, 1e-7L);
}

// Terms that vanish next to the sum never bring it past the uniform: the law's last count then.
TEST(binomial_table, ends_where_its_sum_stands_still) {
  for (const std::int32_t n : {1, 2, 5, 31, 40, 59, 60, 64, 100, 3000, greatest}) {
    for (const double mean : {1e-9, 0.3, 3.0, 15.0, 29.49, 29.99}) {
      const double p = mean / n;
      if (p < 0.5) {
        const _bcdf_params table = gpu::bcdf_record(n, p);
        for (const double u : {below_one, 1.0, 2.0}) {
          const std::int32_t k = on_table(table).one(u);
          EXPECT_LE(k, n) << n << ' ' << p;
          EXPECT_LT(k, 120);
          EXPECT_GT(log_law(n, p, k), std::log(0x1p-56)) << n << ' ' << p;
          EXPECT_GE(on_table(table, true).one(u), 0);
        }
      }
    }
  }
  const _bcdf_params half = gpu::bcdf_record(1, 0.5);
  EXPECT_EQ(on_table(half, true).one(below_one), 0);
  EXPECT_EQ(on_table(half, true).one(1), 0);
}

TEST(binomial_table, is_left_for_the_walk_by_what_is_no_number) {
  const _bcdf_params table = gpu::bcdf_record(100, 0.25);
  EXPECT_EQ(on_table(table).one(nan), 64);
}

TEST(binomial_table, has_one_value_where_nothing_is_left_to_chance) {
  for (const double u : {0.0, 0.25, below_one, 1.0}) {
    EXPECT_EQ(on_table(gpu::bcdf_record(50, 0.0)).one(u), 0);
    EXPECT_EQ(on_table(gpu::bcdf_record(50, -0.0)).one(u), 0);
    EXPECT_EQ(on_table(gpu::bcdf_record(50, 1.0), true).one(u), 50);
    EXPECT_EQ(on_table(gpu::bcdf_record(greatest, 1.0), true).one(u), greatest);
  }
}

using counts = rng::binomial<std::int32_t>;
using unsigned_counts = rng::binomial<std::uint32_t>;

TEST(binomial_dispatch, takes_a_fill_a_table_or_rejection) {
  const auto consumed = [](auto form, const counts& distr) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
    return draw_at_level(form, distr, engine, 1003, 1003).consumed;
  };
  for (const auto form : both_forms) {
    EXPECT_EQ(consumed(form, counts(0, 0.3)), 0);
    EXPECT_EQ(consumed(form, counts(100, 0.2999)), 1003);   // mean 29.99
    EXPECT_GT(consumed(form, counts(100, 0.3)), 2 * 1003);  // 30
    EXPECT_EQ(consumed(form, counts(100, 0.7001)), 1003);
    EXPECT_GT(consumed(form, counts(120, 0.75)), 2 * 1003);
    EXPECT_EQ(consumed(form, counts(59, 0.5)), 1003);
    EXPECT_GT(consumed(form, counts(60, 0.5)), 2 * 1003);
    EXPECT_EQ(consumed(form, counts(greatest, 0.0)), 1003);
    EXPECT_EQ(consumed(form, counts(greatest, 1.0)), 1003);
  }
}

TEST(binomial_dispatch, fills_with_0_for_no_trials_and_leaves_the_engine) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  rng::philox4x32x10 same(host_run_gpu_queue(), 7);
  EXPECT_EQ(draw(counts(0, 0.3), engine, 1000), std::vector<std::int32_t>(1000, 0));
  EXPECT_EQ(draw(rng::bits<>(), engine, 10), draw(rng::bits<>(), same, 10));
}

TEST(binomial_dispatch, gives_one_value_where_nothing_is_left_to_chance) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  EXPECT_EQ(draw(counts(77, 0.0), engine, 1000), std::vector<std::int32_t>(1000, 0));
  EXPECT_EQ(draw(counts(77, 1.0), engine, 1000), std::vector<std::int32_t>(1000, 77));
}

TEST(binomial_dispatch, gives_either_type_the_same_bits) {
  for (const std::int32_t n : {20, 300}) {
    for (const auto form : both_forms) {
      rng::mrg32k3a engine(host_run_gpu_queue(), 7);
      rng::mrg32k3a same(host_run_gpu_queue(), 7);
      const auto values = draw_at_level(form, counts(n, 0.5), engine, 1001, 1001);
      const auto others = draw_at_level(form, unsigned_counts(n, 0.5), same, 1001, 1001);
      EXPECT_EQ(values.consumed, others.consumed);
      EXPECT_EQ(std::vector<std::uint32_t>(values.values.begin(), values.values.end()),
                others.values);
    }
  }
}

/// Mean and variance of 1e5 draws, each within five of its standard errors.
void expect_moments(std::int32_t n, double p) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  const auto values = draw(counts(n, p), engine, 100000);
  const double mean = n * p;
  const double variance = mean * (1 - p);
  const double size = static_cast<double>(values.size());
  double first = 0;
  double second = 0;
  for (const std::int32_t y : values) {
    EXPECT_TRUE(0 <= y && y <= n);
    first += (y - mean) / size;
    second += (y - mean) * (y - mean) / size;
  }
  const double fourth = 3 + (1 - 6 * p * (1 - p)) / variance;  // of the standardised law
  EXPECT_NEAR(first, 0, 5 * std::sqrt(variance / size)) << n << ' ' << p;
  EXPECT_NEAR(second / variance, 1, 5 * std::sqrt((fourth - 1) / size)) << n << ' ' << p;
}

TEST(binomial_dispatch, draws_have_the_moments_of_the_law) {
  expect_moments(20, 0.3);
  expect_moments(100, 0.7001);
  expect_moments(60, 0.5);
  expect_moments(1000, 0.3);
  expect_moments(1000000, 0.01);
  expect_moments(greatest, 0.4);
}

// Kept: outside the triangle the ratios of p = 1/2 weigh the candidates, whose right tail is
// hardly ever rejected then.
TEST(binomial_dispatch, leaves_the_law_above_one_half_which_is_kept) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  double mean = 0;
  for (const std::int32_t y : draw(counts(1000, 0.7), engine, 100000)) {
    mean += y / 1e5;
  }
  EXPECT_GT(std::fabs(mean - 700), 20 * std::sqrt(210 / 1e5));
  EXPECT_NEAR(mean, 700, 2 * std::sqrt(210));
}

}  // namespace
