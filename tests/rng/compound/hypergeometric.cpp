// SPDX-License-Identifier: Apache-2.0
// hypergeometric on GPUs: the canonical form, the choice between fill, table and rejection, and the
// table. "Kept" marks what departs from the law.
#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/hypergeometric_gpu_dispatch.hpp"
#include "level_calls.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using table_functor = gpu::functors::hypergeometric<gpu::hypergeometric_algorithm::icdf>;
using post = gpu::functors::hypergeometric_post;
using tarn_test::both_forms;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::host_run_gpu_queue;

constexpr std::int32_t greatest = std::numeric_limits<std::int32_t>::max();

/// Items drawn, and marked ones among them: ln of the probability.
long double log_law(std::int32_t lot, std::int32_t sample, std::int32_t marked, std::int32_t x) {
  const auto log_binomial = [](long double total, long double part) {
    return std::lgamma(total + 1) - std::lgamma(part + 1) - std::lgamma(total - part + 1);
  };
  return log_binomial(marked, x) + log_binomial(lot - marked, sample - x) -
         log_binomial(lot, sample);
}

table_functor on_table(const gpu::canonical_hypergeometric& law, const std::vector<double>& cdf) {
  const auto len = static_cast<std::int32_t>(cdf.size());
  return {0.0, 1.0, cdf.data(), law.low, law.lot, law.marked, law.sample, len, law.n1};
}

TEST(hypergeometric_form, counts_the_rarer_kind_in_the_smaller_part) {
  for (const std::int32_t sample : {30, 70}) {
    for (const std::int32_t marked : {20, 80}) {
      const auto law = gpu::canonical_form(100, sample, marked);
      EXPECT_EQ(law.lot, 100);
      EXPECT_EQ(law.sample, sample);
      EXPECT_EQ(law.marked, marked);
      EXPECT_EQ(law.n1, 20);
      EXPECT_EQ(law.n2, 80);
      EXPECT_EQ(law.k, 30);
      EXPECT_EQ(law.low, 0);
      EXPECT_EQ(law.high, 20);
      EXPECT_EQ(law.mode, 21 * 31 / 102);
    }
  }
  EXPECT_EQ(gpu::canonical_form(0, 0, 0).high, 0);
}

TEST(hypergeometric_form, does_not_overflow) {
  EXPECT_TRUE(gpu::is_sample_smaller(greatest, 1073741823));
  EXPECT_FALSE(gpu::is_sample_smaller(greatest, 1073741824));
  EXPECT_FALSE(gpu::is_sample_smaller(2147483646, 1073741823));
  EXPECT_FALSE(gpu::is_sample_smaller(greatest, greatest));
  for (const std::int32_t half : {1073741823, 1073741824}) {
    const auto law = gpu::canonical_form(greatest, half, half);
    EXPECT_EQ(law.n1, 1073741823);
    EXPECT_EQ(law.n2, 1073741824);
    EXPECT_EQ(law.k, 1073741823);
    EXPECT_EQ(law.low, 0);
    EXPECT_EQ(law.high, 1073741823);
    EXPECT_EQ(law.mode, 536870911);  // 2^60 / (2^31 + 1)
  }
  const auto all = gpu::canonical_form(greatest, greatest, greatest);
  EXPECT_EQ(all.high, 0);
  EXPECT_EQ(gpu::hypergeometric_constant(all), greatest);
}

TEST(hypergeometric_form, has_0_for_its_least_value) {
  for (std::int32_t lot = 0; lot <= 20; ++lot) {
    for (std::int32_t sample = 0; sample <= lot; ++sample) {
      for (std::int32_t marked = 0; marked <= lot; ++marked) {
        EXPECT_EQ(gpu::canonical_form(lot, sample, marked).low, 0);
      }
    }
  }
}

std::int32_t constant(std::int32_t lot, std::int32_t sample, std::int32_t marked) {
  const auto law = gpu::canonical_form(lot, sample, marked);
  EXPECT_EQ(law.high, law.low);
  return gpu::hypergeometric_constant(law);
}

TEST(hypergeometric_fill, has_the_only_value) {
  EXPECT_EQ(constant(0, 0, 0), 0);
  for (std::int32_t marked = 0; marked <= 10; ++marked) {
    EXPECT_EQ(constant(10, 0, marked), 0);
    EXPECT_EQ(constant(10, 10, marked), marked);
  }
  for (std::int32_t sample = 0; sample <= 10; ++sample) {
    EXPECT_EQ(constant(10, sample, 10), sample);
  }
  for (std::int32_t sample = 5; sample <= 10; ++sample) {
    EXPECT_EQ(constant(10, sample, 0), 0);
  }
}

TEST(hypergeometric_fill, is_the_sample_where_none_is_marked_which_is_kept) {
  for (std::int32_t sample = 0; sample < 5; ++sample) {
    EXPECT_EQ(constant(10, sample, 0), sample);
  }
}

TEST(hypergeometric_post, maps_by_the_halves_of_sample_and_kinds) {
  EXPECT_EQ((post{100, 20, 30, 20}(7)), 7);
  EXPECT_EQ((post{100, 50, 30, 50}(7)), 7);  // half of the lot is not the greater part
  EXPECT_EQ((post{100, 80, 30, 20}(7)), 30 - 7);
  EXPECT_EQ((post{100, 20, 70, 20}(7)), 20 - 7);
  EXPECT_EQ((post{100, 20, 50, 20}(7)), 20 - 7);  // nor is it the smaller one
  EXPECT_EQ((post{100, 80, 70, 20}(7)), 70 - 20 + 7);
  EXPECT_EQ((post{greatest, greatest, greatest, 0}(0)), greatest);
}

// Every law of small lots: the steps of the table, at the values that they are mapped to.
TEST(hypergeometric_table, holds_the_sums_of_every_small_law) {
  int laws = 0;
  for (std::int32_t lot = 2; lot <= 14; ++lot) {
    for (std::int32_t sample = 0; sample <= lot; ++sample) {
      for (std::int32_t marked = 0; marked <= lot; ++marked) {
        const auto law = gpu::canonical_form(lot, sample, marked);
        if (law.high > law.low) {
          const auto cdf = gpu::hypergeometric_table(law);
          const post result{lot, marked, sample, law.n1};
          ASSERT_EQ(cdf.size(), static_cast<std::size_t>(law.high - law.low + 1));
          double before = 0;
          for (std::int32_t y = law.low; y <= law.high; ++y) {
            const double sum = cdf[static_cast<std::size_t>(y - law.low)];
            const auto expected = std::exp(log_law(lot, sample, marked, result(y)));
            EXPECT_NEAR(sum - before, static_cast<double>(expected), 1e-14);
            before = sum;
          }
          EXPECT_EQ(before, 1);
          laws += 1;
        }
      }
    }
  }
  EXPECT_EQ(laws, 819);  // 1 + 4 + ... + 169: neither none nor all
}

// From the first probability up to the mode, and from 1 down behind it.
TEST(hypergeometric_table, is_summed_from_both_ends) {
  const auto law = gpu::canonical_form(1000, 130, 300);
  ASSERT_EQ(law.mode, 39);
  const auto cdf = gpu::hypergeometric_table(law);
  long double sum = 0;
  long double behind = 1;
  for (std::size_t y = 0; y < cdf.size(); ++y) {
    const auto probability = std::exp(log_law(1000, 130, 300, static_cast<std::int32_t>(y)));
    sum += probability;
    behind -= probability;
    // Logarithms of factorials of about 6000 have a rounding error of 1e-12, each sum once.
    EXPECT_NEAR(cdf[y], static_cast<double>(sum), 1e-11) << y;
    if (y <= 39) {
      EXPECT_NEAR(cdf[y] / static_cast<double>(sum), 1, 1e-11) << y;
    }
  }
  EXPECT_EQ(cdf.back(), 1);
  // It ends before the first probability behind the mode that is below 2^-52.
  const auto end = static_cast<std::int32_t>(cdf.size());
  EXPECT_GT(std::exp(log_law(1000, 130, 300, end - 1)), 0x1p-52L);
  EXPECT_LT(std::exp(log_law(1000, 130, 300, end)), 0x1p-52L);
}

TEST(hypergeometric_table, gives_the_first_value_whose_sum_is_above_the_uniform) {
  const auto law = gpu::canonical_form(1000, 130, 300);
  const auto cdf = gpu::hypergeometric_table(law);
  const table_functor functor = on_table(law, cdf);
  EXPECT_EQ(functor.one(0), 0);
  EXPECT_EQ(functor.one(std::nextafter(cdf[0], 0)), 0);
  for (std::size_t y = 1; y < cdf.size(); ++y) {
    if (cdf[y - 1] < cdf[y]) {
      const auto value = static_cast<std::int32_t>(y);
      EXPECT_EQ(functor.one(cdf[y - 1]), value);
      EXPECT_EQ(functor.one(std::nextafter(cdf[y], 0)), value);
    }
  }
  const auto values = functor(sycl::vec<double, 4>(0, cdf[0], cdf[20], cdf[6]));
  const std::int32_t expected[] = {0, 1, 21, 7};
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(values[i], expected[i]);
  }
}

TEST(hypergeometric_table, gives_its_length_for_what_is_not_below_its_end) {
  const auto law = gpu::canonical_form(11, 5, 5);
  const auto cdf = gpu::hypergeometric_table(law);
  const table_functor functor = on_table(law, cdf);
  EXPECT_EQ(functor.one(std::nextafter(1, 0)), 5);
  EXPECT_EQ(functor.one(1), 6);
  EXPECT_EQ(functor.one(std::numeric_limits<double>::quiet_NaN()), 6);
}

TEST(hypergeometric_table, counts_from_0_but_for_the_least_value) {
  const auto law = gpu::canonical_form(11, 5, 5);
  const auto cdf = gpu::hypergeometric_table(law);
  table_functor functor = on_table(law, cdf);
  functor.low = 3;  // no parameters give one above 0
  EXPECT_EQ(functor.one(0), 3);
  EXPECT_EQ(functor.one(cdf[0]), 1);
}

TEST(hypergeometric_table, is_made_for_the_largest_lots) {
  const auto law = gpu::canonical_form(greatest, 290000, 290000);
  ASSERT_EQ(law.mode, 39);
  const auto cdf = gpu::hypergeometric_table(law);
  EXPECT_LT(cdf.size(), 120u);
  EXPECT_TRUE(std::is_sorted(cdf.begin(), cdf.begin() + 39));
  EXPECT_TRUE(std::is_sorted(cdf.begin() + 40, cdf.end()));
  // Four logarithms of about 4.4e10 with a rounding error of 4e-6 are in the first probability.
  EXPECT_NEAR(cdf[39], 0.5, 0.06);
  EXPECT_NEAR(cdf[40] - cdf[39],
              static_cast<double>(std::exp(log_law(greatest, 290000, 290000, 40))), 1e-4);
}

using counts = rng::hypergeometric<std::int32_t>;
using unsigned_counts = rng::hypergeometric<std::uint32_t>;

TEST(hypergeometric_dispatch, takes_a_fill_a_table_or_rejection) {
  const auto consumed = [](auto form, const counts& distr) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
    return draw_at_level(form, distr, engine, 1003, 1003).consumed;
  };
  ASSERT_EQ(gpu::canonical_form(1000, 134, 300).mode, 40);
  for (const auto form : both_forms) {
    EXPECT_EQ(consumed(form, counts(1000, 0, 300)), 0);
    EXPECT_EQ(consumed(form, counts(1000, 130, 0)), 0);
    EXPECT_EQ(consumed(form, counts(1000, 130, 300)), 1003);      // mode 39
    EXPECT_GT(consumed(form, counts(1000, 134, 300)), 2 * 1003);  // 40
    EXPECT_EQ(consumed(form, counts(1000, 870, 700)), 1003);
    EXPECT_GT(consumed(form, counts(1000, 866, 700)), 2 * 1003);
    EXPECT_EQ(consumed(form, counts(2, 1, 1)), 1003);
  }
}

TEST(hypergeometric_dispatch, fills_with_the_only_value_and_leaves_the_engine) {
  const std::int32_t cases[][4] = {{1000, 130, 0, 130},  // kept
                                   {1000, 130, 1000, 130},    {1000, 0, 300, 0},
                                   {1000, 1000, 300, 300},    {1000, 1000, 700, 700},
                                   {greatest, greatest, 7, 7}};
  for (const auto& [lot, sample, marked, value] : cases) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
    rng::philox4x32x10 same(host_run_gpu_queue(), 7);
    EXPECT_EQ(draw(counts(lot, sample, marked), engine, 1000),
              std::vector<std::int32_t>(1000, value));
    EXPECT_EQ(draw(rng::bits<>(), engine, 10), draw(rng::bits<>(), same, 10));
  }
}

TEST(hypergeometric_dispatch, gives_either_type_the_same_bits) {
  for (const std::int32_t sample : {60, 600}) {
    for (const auto form : both_forms) {
      rng::mrg32k3a engine(host_run_gpu_queue(), 7);
      rng::mrg32k3a same(host_run_gpu_queue(), 7);
      const auto values = draw_at_level(form, counts(1000, sample, 300), engine, 1001, 1001);
      const auto others = draw_at_level(form, unsigned_counts(1000, sample, 300), same, 1001, 1001);
      EXPECT_EQ(values.consumed, others.consumed);
      EXPECT_EQ(std::vector<std::uint32_t>(values.values.begin(), values.values.end()),
                others.values);
    }
  }
}

/// Mean and variance of 1e5 draws, each within five of its standard errors.
void expect_moments(std::int32_t lot, std::int32_t sample, std::int32_t marked) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  const auto values = draw(counts(lot, sample, marked), engine, 100000);
  const double l = lot;
  const double mean = sample / l * marked;
  const double variance = mean * ((l - marked) / l) * ((l - sample) / (l - 1));
  const double size = static_cast<double>(values.size());
  double first = 0;
  double second = 0;
  for (const std::int32_t y : values) {
    EXPECT_TRUE(std::max(0, sample - (lot - marked)) <= y && y <= std::min(sample, marked));
    first += (y - mean) / size;
    second += (y - mean) * (y - mean) / size;
  }
  const double fourth = 3 + 1 / variance;  // of the standardised law, at most
  EXPECT_NEAR(first, 0, 5 * std::sqrt(variance / size)) << lot << ' ' << sample << ' ' << marked;
  EXPECT_NEAR(second / variance, 1, 5 * std::sqrt((fourth - 1) / size))
      << lot << ' ' << sample << ' ' << marked;
}

TEST(hypergeometric_dispatch, draws_have_the_moments_of_the_law) {
  expect_moments(50, 40, 10);
  expect_moments(1000, 130, 300);
  expect_moments(1000, 134, 300);
  expect_moments(1000, 866, 300);
  expect_moments(1000, 134, 700);
  expect_moments(1000, 866, 700);
  expect_moments(100000, 5000, 40000);
  expect_moments(2000000, 1000000, 999999);
  expect_moments(greatest, 290000, 290000);
  expect_moments(greatest, 100000, 2000000);
}

}  // namespace
