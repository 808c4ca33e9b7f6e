// SPDX-License-Identifier: Apache-2.0
// The candidates of H2PE with uniforms of the test's choice: the hat, its pieces, the walk next to
// the mode and the squeeze. "Kept" marks what departs from the paper.
#include <cmath>
#include <cstdint>
#include <limits>
#include <tuple>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/hypergeometric_gpu_dispatch.hpp"

namespace {

namespace gpu = kestrel::tarn::rng::detail::gpu;
using h2pe = gpu::functors::hypergeometric<gpu::hypergeometric_algorithm::h2pe>;
using kestrel::tarn::service::_h2pe_params;

constexpr std::int32_t rejected = -1;
constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr double below_one = 1 - 0x1p-53;

double after(double x) {
  return std::nextafter(x, HUGE_VAL);
}

/// A law, its record and its functor, which takes uniforms as they are for the choice of a piece.
struct drawn_law {
  drawn_law(std::int32_t lot, std::int32_t sample, std::int32_t marked)
      : law(gpu::canonical_form(lot, sample, marked)),
        hat(gpu::h2pe_record(law)),
        functor(gpu::h2pe_functor(law, &hat)) {
    area = hat.p3;
    hat.p3 = 1;
  }
  drawn_law(const drawn_law&) = delete;
  drawn_law& operator=(const drawn_law&) = delete;

  std::int32_t candidate(double u, double v) const {
    std::int32_t y = 12345;
    functor.pair(u, v, &y);
    return y;
  }
  bool accepts(double y, double v) const {
    const std::int32_t result = functor.h2pe_acc_rej_func(v, y);
    EXPECT_TRUE(result == rejected || result == y);
    return result != rejected;
  }
  /// ln of the law at y over the law at its mode.
  double log_ratio(double y) const {
    const auto product = [this](long double at) {
      return std::lgamma(at + 1) + std::lgamma(law.n1 - at + 1) + std::lgamma(law.k - at + 1) +
             std::lgamma(law.n2 - law.k + at + 1);
    };
    return static_cast<double>(product(law.mode) - product(y));
  }
  /// The logarithm of the greatest height that is accepted at y.
  double log_acceptance(double y) const {
    double accepted = -700;
    double refused = 100;
    for (int i = 0; i < 80; ++i) {
      const double middle = accepted + (refused - accepted) / 2;
      (accepts(y, std::exp(middle)) ? accepted : refused) = middle;
    }
    return accepted;
  }

  gpu::canonical_hypergeometric law;
  _h2pe_params hat;
  h2pe functor;
  double area;
};

TEST(log_factorial, is_tabulated_up_to_15_and_a_formula_behind) {
  for (int x = 0; x <= 15; ++x) {
    EXPECT_EQ(gpu::log_factorial(x), static_cast<double>(std::lgamma(x + 1.0L))) << x;
  }
  for (double x = 16; x < 2e9; x = std::floor(x * 1.5)) {
    const auto exact = static_cast<double>(std::lgamma(x + 1.0L));
    EXPECT_NEAR(gpu::log_factorial(x), exact, 1 / (1260 * std::pow(x, 5)) + 5e-12 + exact * 0x1p-51)
        << x;
  }
  EXPECT_NE(gpu::log_factorial(16), static_cast<double>(std::lgamma(17.0L)));
  EXPECT_EQ(gpu::log_factorial(-3), 0);  // any number has an entry
}

TEST(log_factorials, are_summed_one_by_one_unless_all_are_above_15) {
  const auto each = [](double y, double n1, double k, double n2_k) {
    return gpu::log_factorial(y) + gpu::log_factorial(n1 - y) + gpu::log_factorial(k - y) +
           gpu::log_factorial(y + n2_k);
  };
  // n2 - k = 300: the lot is n1 + k + 300.
  const auto all = [](double y, double n1, double k) {
    return gpu::log_factorials(y, n1, k, 300, n1 + k + 300);
  };
  int differing = 0;
  for (int y = 0; y <= 60; ++y) {
    EXPECT_NEAR(all(y, 75, 200), each(y, 75, 200, 300), 1e-11);
    EXPECT_NEAR(all(y, 200, 75), each(y, 200, 75, 300), 1e-11);
    if (y <= 15 || y == 60) {
      EXPECT_EQ(all(y, 75, 200), each(y, 75, 200, 300)) << y;
      EXPECT_EQ(all(y, 200, 75), each(y, 200, 75, 300)) << y;
    } else {
      differing += all(y, 75, 200) != each(y, 75, 200, 300) ? 1 : 0;
    }
  }
  EXPECT_GT(differing, 10);
}

TEST(h2pe_record, is_the_hat_of_the_paper) {
  const drawn_law at(1000, 600, 300);
  const _h2pe_params& hat = at.hat;
  EXPECT_EQ(hat.lot, 1000);
  EXPECT_EQ(hat.marked, 300);
  EXPECT_EQ(hat.sample, 600);
  ASSERT_EQ(at.law.mode, 120);
  // n1, n2, k are 300, 700 and 400; the deviation is 7.1.
  const double d = std::floor(1.5 * std::sqrt(600.0 * 400 * 300 * 700 / 999) / 1000) + 0.5;
  EXPECT_EQ(d, 10.5);
  EXPECT_EQ(hat.p1, 21);
  EXPECT_EQ(hat.xl, 110);
  EXPECT_EQ(hat.xr, 131);
  EXPECT_EQ(hat.c1, 120.5);
  EXPECT_EQ(hat.c2, 180.5);
  EXPECT_EQ(hat.c3, 280.5);
  EXPECT_EQ(hat.c4, 420.5);
  EXPECT_NEAR(hat.ll, -std::log(110.0 * 410 / (191.0 * 291)), 1e-15);
  EXPECT_NEAR(hat.lr, -std::log(170.0 * 270 / (131.0 * 431)), 1e-15);
  EXPECT_DOUBLE_EQ(hat.inv_ll, 1 / hat.ll);
  EXPECT_DOUBLE_EQ(hat.inv_lr, 1 / hat.lr);
  EXPECT_NEAR(hat.p2 - hat.p1, std::exp(at.log_ratio(110)) / hat.ll, 1e-9);
  EXPECT_NEAR(at.area - hat.p2, std::exp(at.log_ratio(130)) / hat.lr, 1e-9);
  EXPECT_NEAR(hat.a, gpu::log_factorials(120, 300, 400, 300, 1000), 0);
  for (int j = 0; j < 64; ++j) {
    EXPECT_NEAR(hat.down[j], std::exp(at.log_ratio(119 - j)), 1e-12) << j;
    EXPECT_NEAR(hat.up[j], std::exp(at.log_ratio(121 + j)), 1e-12) << j;
  }
}

TEST(h2pe_record, has_no_probability_outside_the_values) {
  const drawn_law at(1000, 500, 80);
  ASSERT_EQ(at.law.mode, 40);
  for (int j = 40; j < 64; ++j) {
    EXPECT_EQ(at.hat.down[j], 0) << j;
    EXPECT_EQ(at.hat.up[j], 0) << j;
  }
  EXPECT_GT(at.hat.down[39], 0);
  EXPECT_GT(at.hat.up[39], 0);
}

TEST(h2pe_candidate, pieces_end_where_the_next_begins) {
  const drawn_law at(1000, 300, 300);
  const _h2pe_params& hat = at.hat;
  ASSERT_EQ(at.law.mode, 90);
  // The rectangle ends with p1, at height v; the left tail begins there at height 0.
  EXPECT_EQ(at.candidate(0, 0.0), hat.xl);
  EXPECT_EQ(at.candidate(0, below_one), rejected);
  EXPECT_EQ(at.candidate(hat.p1, 0.0), hat.xr);
  EXPECT_EQ(at.candidate(hat.p1, below_one), rejected);
  EXPECT_EQ(at.candidate(after(hat.p1), below_one), hat.xl);
  // It ends with p2, where heights are those at its place; the right one begins at height 0.
  EXPECT_EQ(at.candidate(hat.p2, 0.5),
            at.functor.h2pe_acc_rej_func(0.5 * (hat.p2 - hat.p1) * hat.ll,
                                         std::trunc(std::log(0.5) * hat.inv_ll + hat.xl)));
  EXPECT_EQ(at.candidate(hat.p2, 0.0), rejected);
  EXPECT_EQ(at.candidate(after(hat.p2), below_one), hat.xr);
}

TEST(h2pe_candidate, of_a_tail_stays_among_the_values) {
  drawn_law at(1000, 134, 300);
  _h2pe_params& hat = at.hat;
  ASSERT_EQ(at.law.high, 134);
  const auto v = [](double rate, double distance) { return std::exp(-rate * distance); };
  const double left_end = v(hat.ll, hat.xl + 0.5);
  const double behind_left_end = v(hat.ll, hat.xl + 1.5);
  const double right_end = v(hat.lr, 134.5 - hat.xr);
  const double behind_right_end = v(hat.lr, 135.5 - hat.xr);
  hat.ll = hat.lr = 0;  // heights of 0
  const double left = after(hat.p1);
  const double right = after(hat.p2);
  EXPECT_EQ(at.candidate(left, left_end), 0);
  EXPECT_EQ(at.candidate(left, behind_left_end), rejected);
  EXPECT_EQ(at.candidate(left, 0.0), rejected);
  EXPECT_EQ(at.candidate(right, right_end), 134);
  EXPECT_EQ(at.candidate(right, behind_right_end), rejected);
  EXPECT_EQ(at.candidate(right, 0.0), rejected);
}

TEST(h2pe_candidate, takes_a_stand_in_for_the_logarithm_of_zero) {
  drawn_law at(1000, 134, 300);
  const double log_zero = -744.44007192138122;
  at.hat.inv_ll = at.hat.inv_lr = 0x1p-6;  // so that it stays among the values
  EXPECT_EQ(at.candidate(after(at.hat.p1), 0.0), std::trunc(at.hat.xl + log_zero / 64));
  EXPECT_EQ(at.candidate(after(at.hat.p2), 0.0), std::trunc(at.hat.xr - log_zero / 64));
}

TEST(h2pe_candidate, is_defined_for_any_number) {
  const drawn_law at(1000, 134, 300);
  EXPECT_LT(at.candidate(nan, 0.5), 0);
  EXPECT_EQ(at.candidate(after(at.hat.p1), nan), rejected);
  EXPECT_EQ(at.candidate(after(at.hat.p2), nan), rejected);
  EXPECT_EQ(at.candidate(5, nan), std::trunc(at.hat.xl + 5));
  const drawn_law wide(100000, 5000, 40000);
  EXPECT_EQ(wide.candidate(5, nan), std::trunc(wide.hat.xl + 5));
}

TEST(h2pe_test, looks_up_the_first_64_on_either_side) {
  const drawn_law at(1000, 300, 300);
  const _h2pe_params& hat = at.hat;
  EXPECT_TRUE(at.accepts(90, 1e300));
  for (int g = 1; g <= 64; ++g) {
    EXPECT_TRUE(at.accepts(90 - g, hat.down[g - 1])) << g;
    EXPECT_FALSE(at.accepts(90 - g, after(hat.down[g - 1]))) << g;
    EXPECT_TRUE(at.accepts(90 + g, hat.up[g - 1])) << g;
    EXPECT_FALSE(at.accepts(90 + g, after(hat.up[g - 1]))) << g;
  }
}

TEST(h2pe_test, walks_from_65_on) {
  const drawn_law at(1000, 300, 300);
  const auto below = [](double t) { return t * (400 + t) / ((301 - t) * (301 - t)); };
  const auto above = [](double t) { return (300 - t) * (300 - t) / ((t + 1) * (401 + t)); };
  double down = at.hat.down[63];
  double up = at.hat.up[63];
  for (int g = 65; g <= 75; ++g) {
    down *= below(90 - g + 1);
    EXPECT_TRUE(at.accepts(90 - g, down)) << g;
    EXPECT_FALSE(at.accepts(90 - g, after(down))) << g;
    EXPECT_NEAR(std::log(down), at.log_ratio(90 - g), 1e-11);
    up *= above(90 + g - 1);
    EXPECT_TRUE(at.accepts(90 + g, up)) << g;
    EXPECT_FALSE(at.accepts(90 + g, after(up))) << g;
    EXPECT_NEAR(std::log(up), at.log_ratio(90 + g), 1e-11);
  }
  EXPECT_TRUE(at.accepts(0, 0));
  EXPECT_TRUE(at.accepts(300, 0));
}

// Without a table the walk rejects all and the squeeze nothing that is low enough.
TEST(h2pe_test, walks_for_a_mode_below_100_or_a_value_below_201) {
  drawn_law mode_99(1000, 329, 300);
  drawn_law mode_100(1000, 332, 300);
  drawn_law mode_150(1000, 500, 300);
  ASSERT_EQ(mode_99.law.mode, 99);
  ASSERT_EQ(mode_100.law.mode, 100);
  ASSERT_EQ(mode_150.law.mode, 150);
  for (drawn_law* at : {&mode_99, &mode_100, &mode_150}) {
    for (int j = 0; j < 64; ++j) {
      at->hat.down[j] = at->hat.up[j] = 0;
    }
  }
  EXPECT_FALSE(mode_99.accepts(201, 1e-100));
  EXPECT_TRUE(mode_100.accepts(201, 1e-100));
  EXPECT_FALSE(mode_100.accepts(200, 1e-100));
  EXPECT_TRUE(mode_150.accepts(201, 1e-100));
  EXPECT_FALSE(mode_150.accepts(200, 1e-100));
  EXPECT_FALSE(mode_150.accepts(149, 1e-100));
}

TEST(h2pe_test, accepts_up_to_the_law) {
  for (const auto& [lot, sample, marked] : {std::tuple{100000, 5000, 40000},
                                            {1000, 500, 500},
                                            {2000000, 1000000, 999999},
                                            {2147483647, 1073741823, 1073741823}}) {
    const drawn_law at(lot, sample, marked);
    // Logarithms of factorials have a rounding error that grows with the lot.
    const double error = 1e-9 + lot * 1e-14;
    const double deviation = at.hat.p1 / 3;
    for (const double z : {-3.0, -1.5, -0.6, -0.1, 0.0, 0.2, 0.9, 2.5}) {
      const double y = at.law.mode + std::trunc(z * deviation);
      EXPECT_NEAR(at.log_acceptance(y), at.log_ratio(y), error) << lot << ' ' << z;
    }
  }
}

/// What the squeeze accepts without, and up to what it refers to, the law.
struct bounds {
  double lower;
  double upper;
};
bounds bounds_at(drawn_law& at, double y) {
  const double a = at.hat.a;
  at.hat.a = -1e12;  // the law rejects
  const double lower = at.log_acceptance(y);
  at.hat.a = 1e12;  // and accepts
  const double upper = at.log_acceptance(y);
  at.hat.a = a;
  return {lower, upper};
}

TEST(h2pe_test, squeezes_the_law_between_bounds) {
  drawn_law at(100000, 5000, 40000);
  for (int k = -80; k <= 80; k += 10) {
    const double y = at.law.mode + k;
    const bounds around = bounds_at(at, y);
    EXPECT_LT(around.lower, at.log_ratio(y)) << k;
    EXPECT_GT(around.upper, at.log_ratio(y)) << k;
    EXPECT_LT(around.upper - around.lower, 0.05) << k;
  }
}

TEST(h2pe_test, does_not_widen_its_bounds_for_falling_ratios_which_is_kept) {
  drawn_law at(1000, 500, 500);
  const double m = at.law.mode;
  ASSERT_EQ(m, 250);
  // n1, n2 and k are 500: the ratios at y have the denominators y + 1 and 501 - y, twice each.
  const double y = 300;
  const bounds around = bounds_at(at, y);
  const double falling = (m - y) / (y + 1);
  const double rising = (y - m) / (501 - y);
  const double fourth = 0.25 * 2 * 250.5 * (std::pow(falling, 4) + std::pow(rising, 4));
  const double e = (501 - y) * (501 - y) / ((y + 1) * (y + 1)) - 1;
  const double gap = 0.25 * std::pow(e, 4) / (1 + e) * (y + m);
  EXPECT_NEAR(around.upper - around.lower, fourth + gap + 0.0078, 1e-9);
  const double paper = 0.25 * 2 * 250.5 * std::pow(falling, 4) * (1 / (1 + falling) - 1);
  EXPECT_GT(paper, 1e-3);
}

}  // namespace
