// SPDX-License-Identifier: Apache-2.0
// The candidates of BTPE with uniforms of the test's choice: the hat, its regions, the squeeze and
// the walk. "Kept" marks what departs from the paper.
#include <cmath>
#include <cstdint>
#include <limits>
#include <utility>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/binomial_gpu_dispatch.hpp"

namespace {

namespace gpu = kestrel::tarn::rng::detail::gpu;
using btpe = gpu::functors::binomial<gpu::binomial_algorithm::btpe>;
using kestrel::tarn::service::_btpe_params;

constexpr std::int32_t rejected = -1;
constexpr std::int32_t greatest = std::numeric_limits<std::int32_t>::max();
constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr double below_one = 1 - 0x1p-53;

double after(double x) {
  return std::nextafter(x, HUGE_VAL);
}
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

// A record that takes uniforms as they are, for the choice of a region.
_btpe_params record_of(std::int32_t n, double p) {
  _btpe_params hat = gpu::btpe_record(n, p);
  hat.p4 = 1;
  return hat;
}

std::int32_t candidate(const _btpe_params& hat, double u, double v, std::int32_t ntrial) {
  std::int32_t y = 12345;
  btpe{0.0, 1.0, &hat, ntrial}.pair(u, v, &y);
  return y;
}
std::int32_t candidate(const _btpe_params& hat, double u, double v) {
  return candidate(hat, u, v, static_cast<std::int32_t>(hat.n));
}

/// Whether y is accepted at height v: by a right tail that begins at y and has no length.
bool accepts(_btpe_params hat, double y, double v) {
  hat.p1 = hat.p2 = hat.p3 = hat.inv_lr = 0;
  hat.p4 = hat.lr = 1;
  hat.xr = y;
  const std::int32_t result = candidate(hat, 1, v);
  EXPECT_TRUE(result == rejected || result == y);
  return result != rejected;
}

TEST(btpe_record, is_the_hat_of_the_paper_up_to_one_half) {
  for (const double p : {0.03, 0.3, 0.5}) {
    const _btpe_params hat = gpu::btpe_record(1000, p);
    const double q = 1 - p;
    EXPECT_EQ(hat.n, 1000);
    EXPECT_EQ(hat.p, p);
    EXPECT_EQ(hat.npq, 1000 * p * q);
    EXPECT_EQ(hat.fm, p + 1000 * p);
    EXPECT_EQ(hat.m, std::floor(1001 * p));
    EXPECT_EQ(hat.s, p / q);
    EXPECT_EQ(hat.p1, std::floor(2.195 * std::sqrt(hat.npq) - 4.6 * q) + 0.5);
    EXPECT_EQ(hat.xm, hat.m + 0.5);
    EXPECT_EQ(hat.xl, hat.xm - hat.p1);
    EXPECT_EQ(hat.xr, hat.xm + hat.p1);
    EXPECT_EQ(hat.c, 0.134 + 20.5 / (15.3 + hat.m));
    const double al = (hat.fm - hat.xl) / (hat.fm - p * hat.xl);
    const double ar = (hat.xr - hat.fm) / (q * hat.xr);
    EXPECT_DOUBLE_EQ(hat.ll, al * (1 + al / 2));
    EXPECT_DOUBLE_EQ(hat.lr, ar * (1 + ar / 2));
    EXPECT_DOUBLE_EQ(hat.p2, hat.p1 * (1 + 2 * hat.c));
    EXPECT_DOUBLE_EQ(hat.p3, hat.p2 + hat.c / hat.ll);
    EXPECT_DOUBLE_EQ(hat.p4, hat.p3 + hat.c / hat.lr);
    for (const auto& [x, inverse] : {std::pair{hat.ll, hat.inv_ll},
                                     {hat.lr, hat.inv_lr},
                                     {hat.c, hat.inv_c},
                                     {hat.p1, hat.inv_p1},
                                     {hat.npq, hat.inv_npq}}) {
      EXPECT_EQ(inverse, 1 / x);
    }
    const auto at = [&](double y) {
      return y < 0 ? 0
                   : static_cast<double>(std::exp(log_law(1000, p, y) - log_law(1000, p, hat.m)));
    };
    for (int k = 0; k < 32; ++k) {
      EXPECT_NEAR(hat.down[k], at(hat.m - 1 - k), 1e-12) << p << ' ' << k;
      EXPECT_NEAR(hat.up[k], at(hat.m + 1 + k), 1e-12) << p << ' ' << k;
    }
  }
}

// 1002 trials at 3/4: mean 250.5 of failures, mode 250 of the law, 251 of the record.
TEST(btpe_record, has_p_as_given_above_one_half_which_is_kept) {
  const _btpe_params hat = gpu::btpe_record(1002, 0.75);
  EXPECT_EQ(hat.p, 0.75);
  EXPECT_EQ(hat.npq, 250.5 * 0.75);
  EXPECT_EQ(hat.fm, 251.25);
  EXPECT_EQ(hat.m, 251);
  EXPECT_EQ(hat.s, 1);
  EXPECT_EQ(hat.p1, std::floor(2.195 * std::sqrt(hat.npq) - 4.6 * 0.75) + 0.5);
  const double al = (251.25 - hat.xl) / (251.25 - 0.75 * hat.xl);
  EXPECT_DOUBLE_EQ(hat.ll, al * (1 + al / 2));
  EXPECT_DOUBLE_EQ(hat.up[0], 1003.0 / 252 - 1);
  EXPECT_DOUBLE_EQ(hat.down[0], 251.0 / (1003 - 251));
}

TEST(btpe_candidate, regions_end_where_the_next_begins) {
  const _btpe_params hat = record_of(100, 0.4);
  ASSERT_EQ(hat.m, 40);
  const auto at = [&](double y) { return hat.down[static_cast<int>(hat.m - y) - 1]; };
  // The triangle: its candidates are not tested. At p1 the parallelogram begins, on its left.
  EXPECT_EQ(candidate(hat, before(hat.p1), 0.5), std::floor(hat.xm + hat.p1 / 2));
  const double height = 0.9 * hat.c;
  ASSERT_GT(height, at(std::floor(hat.xl)));
  EXPECT_EQ(candidate(hat, hat.p1, 0.9), rejected);
  EXPECT_EQ(candidate(hat, hat.p1, 0.0), std::floor(hat.xl));
  // It ends with p2, at height v c; the left tail begins at height 0.
  EXPECT_EQ(candidate(hat, hat.p2, below_one), rejected);
  EXPECT_EQ(candidate(hat, after(hat.p2), below_one), std::floor(hat.xl));
  // The left tail ends with p3, at height v c, and the right one begins at height 0.
  ASSERT_GT(hat.c, at(std::floor(hat.xl)));
  EXPECT_EQ(candidate(hat, hat.p3, below_one), rejected);
  EXPECT_EQ(candidate(hat, after(hat.p3), below_one), std::floor(hat.xr));
}

// The product 2^60 + 2^31 + 1 would be rounded to a multiple of 256.
TEST(btpe_candidate, of_the_triangle_comes_from_a_fused_product) {
  _btpe_params hat = record_of(100, 0.4);
  hat.p1 = 0x1p30 + 1;
  hat.xm = 0x1p60 + 0x1p31 + 512;
  EXPECT_EQ(candidate(hat, 0, 0x1p30 + 1), 511);
}

TEST(btpe_candidate, of_the_triangle_may_exceed_the_trials) {
  const _btpe_params hat = record_of(100, 0.4);
  EXPECT_EQ(candidate(hat, hat.p1 / 2, 0.0, 30), std::floor(hat.xm + hat.p1 / 2));
  EXPECT_GT(candidate(hat, hat.p1 / 2, 0.0, 30), 30);
  EXPECT_EQ((gpu::functors::binomial_post{30, 1}(42)), -12);
}

TEST(btpe_candidate, of_a_tail_stays_among_the_trials) {
  _btpe_params hat = record_of(100, 0.4);
  const auto v = [&](double rate, double distance) { return std::exp(-rate * distance); };
  const double left_end = v(hat.ll, hat.xl + 0.5);
  const double behind_left_end = v(hat.ll, hat.xl + 1.5);
  const double at_70 = v(hat.lr, 70.5 - hat.xr);
  const double at_71 = v(hat.lr, 71.5 - hat.xr);
  hat.ll = hat.lr = 0;  // heights of 0
  const double left = after(hat.p2);
  const double right = after(hat.p3);
  EXPECT_EQ(candidate(hat, left, left_end), 0);
  EXPECT_EQ(candidate(hat, left, behind_left_end), rejected);
  EXPECT_EQ(candidate(hat, left, 0.0), rejected);
  EXPECT_EQ(candidate(hat, right, at_70, 70), 70);
  EXPECT_EQ(candidate(hat, right, at_71, 71), 71);
  EXPECT_EQ(candidate(hat, right, at_71, 70), rejected);
  EXPECT_EQ(candidate(hat, right, 0.0), rejected);
}

// So wide a law has room for it, and so narrow a one walks there.
TEST(btpe_candidate, takes_a_stand_in_for_the_logarithm_of_zero) {
  const _btpe_params hat = record_of(1000000, 0.4);
  const double log_zero = -744.44007192138122;
  EXPECT_EQ(candidate(hat, after(hat.p3), 0.0), std::trunc(hat.xr - log_zero * hat.inv_lr));
  EXPECT_EQ(candidate(hat, hat.p3, 0.0), std::trunc(log_zero * hat.inv_ll + hat.xl));
}

TEST(btpe_candidate, of_the_parallelogram_is_rejected_above_one) {
  _btpe_params hat = record_of(100, 0.4);
  hat.c = hat.inv_c = 1;
  hat.p2 = hat.p3 = 3 * hat.p1;
  const double middle = 2 * hat.p1;  // with c = 1 this is the mode's place, where heights are 1 + v
  EXPECT_EQ(candidate(hat, middle, 0.0), hat.m);
  EXPECT_EQ(candidate(hat, middle, 1e-300), hat.m);
  EXPECT_EQ(candidate(hat, middle, 1e-10), rejected);
  // What is no number passes both tests.
  EXPECT_EQ(candidate(hat, middle + 5, nan), hat.m + 5);
  EXPECT_EQ(candidate(hat, middle - 5, nan), hat.m - 5);
}

TEST(btpe_candidate, is_defined_for_any_number) {
  _btpe_params hat = record_of(100, 0.4);
  EXPECT_LT(candidate(hat, nan, 0.5), 0);
  EXPECT_LT(candidate(hat, nan, nan), 0);
  hat.xm = 1e300;
  EXPECT_EQ(candidate(hat, 0, 0.5), greatest);
}

TEST(btpe_test, walks_up_to_20_from_the_mode_and_squeezes_behind) {
  _btpe_params hat = record_of(10000, 0.4);
  for (int k = 0; k < 32; ++k) {
    hat.up[k] = hat.down[k] = 0;  // what is looked up is rejected
  }
  for (const double side : {-1.0, 1.0}) {
    EXPECT_TRUE(accepts(hat, hat.m, 0.5));
    EXPECT_FALSE(accepts(hat, hat.m + side * 20, 0.5));
    EXPECT_TRUE(accepts(hat, hat.m + side * 21, 0.5));
  }
  hat.npq = 2 * (30 + 1);  // the squeeze is for distances below npq / 2 - 1
  for (const double side : {-1.0, 1.0}) {
    EXPECT_TRUE(accepts(hat, hat.m + side * 29, 0.5));
    EXPECT_FALSE(accepts(hat, hat.m + side * 30, 0.5));
  }
}

// Mode 50, and no squeeze at all.
TEST(btpe_test, looks_up_the_first_32_on_either_side) {
  const _btpe_params hat = record_of(200, 0.25);
  ASSERT_EQ(hat.m, 50);
  for (int i = 1; i <= 32; ++i) {
    if (i <= 20 || i >= hat.npq * 0.5 - 1) {
      EXPECT_TRUE(accepts(hat, 50 - i, hat.down[i - 1])) << i;
      EXPECT_FALSE(accepts(hat, 50 - i, after(hat.down[i - 1]))) << i;
      EXPECT_TRUE(accepts(hat, 50 + i, hat.up[i - 1])) << i;
      EXPECT_FALSE(accepts(hat, 50 + i, after(hat.up[i - 1]))) << i;
    }
  }
  EXPECT_TRUE(accepts(hat, 50, 1e300));
}

TEST(btpe_test, walks_down_from_33_with_the_factor_of_m_less_33_which_is_kept) {
  const _btpe_params hat = record_of(200, 0.25);
  const double w = 201 * hat.s;
  const auto factor = [&](double j) { return j / (-hat.s * j + w); };
  const double at_33 = hat.down[31] * factor(50 - 33);
  const double at_34 = at_33 * factor(50 - 34);
  const double in_the_paper = hat.down[31] * factor(50 - 32);
  ASSERT_LT(at_33, in_the_paper);
  EXPECT_TRUE(accepts(hat, 50 - 33, at_33));
  EXPECT_FALSE(accepts(hat, 50 - 33, after(at_33)));
  EXPECT_TRUE(accepts(hat, 50 - 34, at_34));
  EXPECT_FALSE(accepts(hat, 50 - 34, after(at_34)));
  EXPECT_TRUE(accepts(hat, 0, 0));
  EXPECT_FALSE(accepts(hat, 0, 1e-30));
}

TEST(btpe_test, walks_up_from_33) {
  const _btpe_params hat = record_of(200, 0.25);
  const double w = 201 * hat.s;
  const double at_33 = hat.up[31] * (w / (50 + 33) - hat.s);
  const double at_34 = at_33 * (w / (50 + 34) - hat.s);
  EXPECT_TRUE(accepts(hat, 50 + 33, at_33));
  EXPECT_FALSE(accepts(hat, 50 + 33, after(at_33)));
  EXPECT_TRUE(accepts(hat, 50 + 34, at_34));
  EXPECT_FALSE(accepts(hat, 50 + 34, after(at_34)));
}

// Above one half the kept ratios rise, so that the end of the table can reject before the walk.
TEST(btpe_test, compares_with_the_end_of_the_table_before_it_walks) {
  const _btpe_params hat = record_of(200, 0.75);
  ASSERT_EQ(hat.m, 50);
  ASSERT_GT(201.0 / 83 - 1, 1.4);
  EXPECT_TRUE(accepts(hat, 83, hat.up[31]));
  EXPECT_FALSE(accepts(hat, 83, hat.up[31] * 1.2));
}

/// The greatest height that is accepted at y.
double acceptance(const _btpe_params& hat, double y) {
  double accepted = 0;
  double refused = 2;
  while (after(accepted) < refused) {
    const double v = accepted + (refused - accepted) / 2;
    (accepts(hat, y, v) ? accepted : refused) = v;
  }
  return accepted;
}

TEST(btpe_test, adds_all_four_corrections_which_is_kept) {
  const double n = 10000;
  const double p = 0.4;
  const _btpe_params hat = record_of(10000, p);
  const auto correction = [](double x) { return 1 / (12 * x) - 1 / (360 * x * x * x); };
  for (const double k : {-70.0, -21.0, 21.0, 50.0}) {
    const double y = hat.m + k;
    const double law = static_cast<double>(log_law(n, p, y) - log_law(n, p, hat.m));
    const double kept = 2 * (correction(y + 1) + correction(n - y + 1));
    ASSERT_GT(kept, 6e-5);
    EXPECT_NEAR(std::log(acceptance(hat, y)), law + kept, 1e-10) << k;
  }
}

}  // namespace
