// SPDX-License-Identifier: Apache-2.0
// Candidates of negative_binomial on chosen uniforms: every decision, on records that are made up
// for it.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
#include <utility>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/negbinomial_gpu_dispatch.hpp"

namespace {

namespace gpu = kestrel::tarn::rng::detail::gpu;
using candidate_functor = gpu::functors::negative_binomial<gpu::negative_binomial_algorithm::nbar>;
using kestrel::tarn::service::_nbar_params;

constexpr double infinity = std::numeric_limits<double>::infinity();
constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr std::int32_t rejected = -1;

// The record, as kernels are given it.
static_assert(offsetof(_nbar_params, m) == 16);
static_assert(offsetof(_nbar_params, P) == 24);
static_assert(offsetof(_nbar_params, down) == 64);
static_assert(offsetof(_nbar_params, up) == 576);
static_assert(offsetof(_nbar_params, tm) == 1088);
static_assert(offsetof(_nbar_params, r0s) == 1096);
static_assert(offsetof(_nbar_params, or_) == 1120);
static_assert(offsetof(_nbar_params, ol) == 1136);
static_assert(offsetof(_nbar_params, b1s) == 1144);
static_assert(offsetof(_nbar_params, b2s) == 1200);
static_assert(offsetof(_nbar_params, e1s) == 1256);
static_assert(offsetof(_nbar_params, e2w) == 1296);

/// Candidates of a record that is filled in by hand: nothing of it is as the law has it.
struct probe {
  _nbar_params hat{};
  double a1 = 100;
  double q = 0.5;

  std::int32_t operator()(double u, double w) const {
    std::int32_t value = 0;
    candidate_functor{0, 1, &hat, a1, q}.pair(u, w, &value);
    return value;
  }
  /// What the test on the right says to y and a height: the tail goes nowhere.
  std::int32_t right(double y, double height) {
    set_sums(-1, -1, -1, 1);
    hat.e1s = 0;
    hat.e1o = y;
    hat.e1w = 1;
    return (*this)(0, height);
  }
  std::int32_t left(double y, double height) {
    set_sums(-1, -1, -1, -1);
    hat.e2s = 0;
    hat.e2o = y;
    hat.e2w = 1;
    return (*this)(0, height);
  }
  /// What the pieces say to w at x.
  std::int32_t centre(double x, double w) {
    set_sums(1, 1, 1, 1);
    hat.r0s = 0;
    hat.r0o = x;
    return (*this)(0, w);
  }
  void set_sums(double centre, double right_slope, double left_slope, double right_tail) {
    const double sums[] = {centre, right_slope, left_slope, right_tail, 1};
    std::memcpy(hat.P, sums, sizeof sums);
  }
  void fill_tables(double value) {
    for (int j = 0; j < 64; ++j) {
      hat.down[j] = value;
      hat.up[j] = value;
    }
  }
};

/// A probe at mode m whose tables are below or above every height, and whose logarithm of the law
/// is so as well.
probe probe_at(double m, bool table_accepts, bool logarithm_accepts) {
  probe it;
  it.hat.m = m;
  it.fill_tables(table_accepts ? 1e300 : 0.0);
  it.hat.tm = logarithm_accepts ? -1e300 : 1e300;
  return it;
}

TEST(nbar, mode_plus_64_is_the_last_place_of_the_table_on_the_right) {
  EXPECT_EQ(probe_at(1000, true, false).right(1064, 0.5), 1064);
  EXPECT_EQ(probe_at(1000, false, true).right(1064, 0.5), rejected);
  EXPECT_EQ(probe_at(1000, true, false).right(1065, 0.5), rejected);
  EXPECT_EQ(probe_at(1000, false, true).right(1065, 0.5), 1065);
}

TEST(nbar, mode_minus_64_is_the_last_place_of_the_table_on_the_left) {
  EXPECT_EQ(probe_at(1000, true, false).left(936, 0.5), 936);
  EXPECT_EQ(probe_at(1000, false, true).left(936, 0.5), rejected);
  EXPECT_EQ(probe_at(1000, true, false).left(935, 0.5), rejected);
  EXPECT_EQ(probe_at(1000, false, true).left(935, 0.5), 935);
}

TEST(nbar, each_place_has_its_entry_and_the_mode_reads_the_last_one) {
  for (int distance = 0; distance <= 64; ++distance) {
    probe it = probe_at(1000, false, false);
    const int entry = distance == 0 ? 63 : distance - 1;
    it.hat.up[entry] = 0.5;
    EXPECT_EQ(it.right(1000 + distance, 0.5), 1000 + distance);  // reaches it: not above
    EXPECT_EQ(it.right(1000 + distance, std::nextafter(0.5, 1)), rejected);
    it.fill_tables(0);
    it.hat.down[entry] = 0.5;
    EXPECT_EQ(it.left(1000 - distance, 0.5), 1000 - distance);
    EXPECT_EQ(it.left(1000 - distance, std::nextafter(0.5, 1)), rejected);
  }
}

TEST(nbar, logarithms_decide_beyond_the_tables) {
  const double height = 0.25;
  for (const double y : {2000.0, 300.0, 150.0}) {
    probe it = probe_at(1000, false, false);
    const auto test = [&] { return y > 1000 ? it.right(y, height) : it.left(y, height); };
    it.hat.tm = gpu::nbar_log_law(y, it.a1, it.q) - std::log(height);
    const double step = std::fabs(it.hat.tm) * 1e-12;
    it.hat.tm -= step;
    EXPECT_EQ(test(), static_cast<std::int32_t>(y));
    it.hat.tm += 2 * step;
    EXPECT_EQ(test(), rejected);
  }
}

// ln((a1 + y)! / y!) + y ln(q), and what the signs of the series add. With s(x) = 1/12 x^-1 -
// 1/360 x^-3 + ... those terms are s(y) and minus s(a1 + y), whose second term is added as well,
// where the law has them the other way round.
TEST(nbar, logarithm_of_the_law_has_its_series_turned_round) {
  const auto exact = [](long double y, long double a1, long double q) {
    return std::lgamma(a1 + y + 1) - std::lgamma(y + 1) + y * std::log(q);
  };
  for (const double a1 : {2.0, 100.0}) {
    const double q = 0.75;
    const auto turned = [&](long double y) {
      return (1 / y - 1 / (a1 + y)) / 6 - 1 / (180 * y * y * y);
    };
    for (const double y : {6.0, 40.0, 150.0}) {
      const auto from_1000 = [&](const auto& f) { return static_cast<double>(f(y) - f(1000)); };
      const double difference = from_1000([&](double z) { return gpu::nbar_log_law(z, a1, q); });
      const double law = from_1000([&](long double z) { return exact(z, a1, q); });
      // The third terms, 1/630 y^-5, are 2e-7 at 6.
      EXPECT_NEAR(difference - law, from_1000(turned), 1e-6) << a1 << ' ' << y;
    }
    EXPECT_GT(turned(6), 5e-3);
  }
}

// Heights lie in the denominator of the walk, a1 where q would stand, and q where the height would:
// from m - 64 = 100 on, factors j / ((j + w) a1) with j = 100, 99, ...
TEST(nbar, left_walk_has_the_height_in_its_denominator_and_ends_at_q) {
  probe it = probe_at(164, false, false);
  it.hat.down[63] = 0.75;
  it.a1 = 0.5;
  const double w = 25;
  const double one = 0.75 * (100 / ((100 + w) * 0.5));  // 1.2
  const double two = one * (99 / ((99 + w) * 0.5));
  EXPECT_GT(two, one);
  it.q = one;  // falls below it, not to it
  EXPECT_EQ(it.left(99, w), 99);
  EXPECT_EQ(it.left(98, w), 98);
  it.q = std::nextafter(one, 2);
  EXPECT_EQ(it.left(99, w), rejected);
  EXPECT_EQ(it.left(98, w), rejected);  // at the first step, although the second is above
  it.a1 = 0.875;
  const double first = 0.75 * (100 / ((100 + w) * 0.875));
  const double second = first * (99 / ((99 + w) * 0.875));
  EXPECT_LT(second, first);
  it.q = first;
  EXPECT_EQ(it.left(99, w), 99);
  EXPECT_EQ(it.left(98, w), rejected);
  it.q = second;
  EXPECT_EQ(it.left(98, w), 98);
  it.q = 0;
  EXPECT_EQ(it.left(0, w), 0);
}

TEST(nbar, left_walk_is_for_places_below_150) {
  EXPECT_EQ(probe_at(1000, false, true).left(150, 0.5), 150);
  EXPECT_EQ(probe_at(1000, false, true).left(149, 0.5), rejected);  // 0 < q at the first step
}

// In every law that has a hat a1 is above 1 / q.
TEST(nbar, left_walk_ends_at_its_first_step_in_laws_that_have_a_hat) {
  for (const auto& [a, p] : {std::pair{101.0, 0.5}, {2.3, 0.01}, {5.0, 0.03}, {2.01, 1e-5}}) {
    const _nbar_params hat = gpu::nbar_record(a, p);
    const double q = 1 - p;
    const double a1 = a - 1;
    EXPECT_LT(hat.down[63] / a1, q);
    EXPECT_LT(1 / a1, q);
  }
}

TEST(nbar, results_have_a_ceiling) {
  for (const double y : {2147483521.0, 2147483647.0, 2147483648.0, 1e18, 1e300}) {
    EXPECT_EQ(probe_at(1000, false, true).right(y, 0.5), 2147483520);
    EXPECT_EQ(probe_at(1e301, false, true).left(y, 0.5), 2147483520);
    EXPECT_EQ(probe_at(y, true, false).right(y, 0.5), 2147483520);
  }
  EXPECT_EQ(probe_at(1000, false, true).right(2147483520.0, 0.5), 2147483520);
  EXPECT_EQ(probe_at(1000, false, true).right(2147483519.0, 0.5), 2147483519);
  EXPECT_EQ(probe_at(1000, false, false).right(1e300, 0.5), rejected);
}

TEST(nbar, what_is_no_number_is_never_a_result) {
  EXPECT_LT(probe_at(1000, true, true).right(nan, 0.5), 0);
  EXPECT_EQ(probe_at(1000, true, true).left(nan, 0.5), rejected);
  EXPECT_LT(probe_at(1000, true, true).centre(nan, 0.5), 0);
  EXPECT_EQ(probe_at(1000, true, true).left(-infinity, 0.5), rejected);
  EXPECT_EQ(probe_at(1000, true, true).right(infinity, 0.5), 2147483520);
}

TEST(nbar, tails_have_their_heights_from_both_uniforms) {
  probe it = probe_at(1000, false, false);
  it.set_sums(0.125, 0.25, 0.5, 0.75);
  it.hat.e1o = 1001.5;
  it.hat.e1w = 8;
  it.hat.up[0] = 0.5;
  EXPECT_EQ(it(0.625, 0.5), 1001);  // 0.125 * 0.5 * 8
  EXPECT_EQ(it(std::nextafter(0.625, 1), 0.5), rejected);
  EXPECT_EQ(it(0.625, std::nextafter(0.5, 1)), rejected);
  it.hat.e2o = 998.5;
  it.hat.e2w = 4;
  it.hat.down[1] = 0.25;
  EXPECT_EQ(it(0.875, 0.5), 998);  // 0.125 * 0.5 * 4
  EXPECT_EQ(it(std::nextafter(0.875, 1), 0.5), rejected);
  EXPECT_EQ(it(0.875, std::nextafter(0.5, 1)), rejected);
}

TEST(nbar, left_tail_ends_at_0) {
  probe it = probe_at(60, true, true);  // 0 is in reach of the table
  EXPECT_EQ(it.left(0, 0.5), 0);
  EXPECT_EQ(it.left(-0.25, 0.5), rejected);
}

TEST(nbar, centre_is_tested_above_its_squeezes) {
  probe it = probe_at(1000, false, false);
  it.hat.sr = -0.0625;
  it.hat.or_ = 63.25;  // 0.625 at 1002
  EXPECT_EQ(it.centre(1002, 0.625), 1002);
  EXPECT_EQ(it.centre(1002, std::nextafter(0.625, 1)), rejected);
  it.hat.sl = 0.0625;
  it.hat.ol = -61.75;  // 0.625 at 998
  EXPECT_EQ(it.centre(998, 0.625), 998);
  EXPECT_EQ(it.centre(998, std::nextafter(0.625, 1)), rejected);
  it = probe_at(1000, true, false);
  it.hat.sr = it.hat.sl = it.hat.or_ = it.hat.ol = 0;
  EXPECT_EQ(it.centre(1002.75, 0.5), 1002);
  EXPECT_EQ(it.centre(997.25, 0.5), 997);
}

TEST(nbar, centre_turns_to_the_right_above_the_middle_of_the_mode) {
  probe it = probe_at(1000, false, false);
  it.fill_tables(0);
  it.hat.up[63] = 1e300;  // the mode is accepted on the right alone
  EXPECT_EQ(it.centre(1000.5, 0.5), rejected);
  EXPECT_EQ(it.centre(std::nextafter(1000.5, 2000), 0.5), 1000);
}

/// A slope at x: the root is 2 everywhere, so that a height of w f is 2 w f.
struct slope {
  double root = 4;
  double f = 0.25;
  double squeeze = 0.125;
};

TEST(nbar, slopes_are_tested_above_their_squeezes) {
  const slope at;
  probe it = probe_at(1000, false, false);
  it.set_sums(-1, 1, 1, 1);
  it.hat.b1o = at.root;
  it.hat.b1d = 3;
  it.hat.b1c = 1016.5;  // less 2 * 3
  it.hat.b1f = at.f;
  it.hat.b1h = at.squeeze;
  EXPECT_EQ(it(0, 0.25), 1010);  // 0.25 * 0.25 * 2 is not above 0.125
  EXPECT_EQ(it(0, std::nextafter(0.25, 1)), rejected);
  it.hat.up[9] = 0.25;
  EXPECT_EQ(it(0, 0.5), 1010);  // the height, not w, is compared with the law
  EXPECT_EQ(it(0, std::nextafter(0.5, 1)), rejected);
  it.set_sums(-1, -1, 1, 1);
  it.hat.b2o = at.root;
  it.hat.b2d = -3;
  it.hat.b2c = 984.5;
  it.hat.b2f = at.f;
  it.hat.b2h = at.squeeze;
  EXPECT_EQ(it(0, 0.25), 990);
  EXPECT_EQ(it(0, std::nextafter(0.25, 1)), rejected);
  it.hat.down[9] = 0.25;
  EXPECT_EQ(it(0, 0.5), 990);
  EXPECT_EQ(it(0, std::nextafter(0.5, 1)), rejected);
}

TEST(nbar, pieces_end_with_their_sums) {
  probe it = probe_at(1000, true, true);
  it.set_sums(0.125, 0.25, 0.5, 0.75);
  it.hat.r0o = 1001.5;
  it.hat.b1c = 1002.5;
  it.hat.b2c = 998.5;
  it.hat.e1o = 1003.5;
  it.hat.e2o = 996.5;
  const double above[] = {std::nextafter(0.125, 1), std::nextafter(0.25, 1), std::nextafter(0.5, 1),
                          std::nextafter(0.75, 1)};
  EXPECT_EQ(it(0, 0.5), 1001);
  EXPECT_EQ(it(0.125, 0.5), 1001);
  EXPECT_EQ(it(above[0], 0.5), 1002);
  EXPECT_EQ(it(0.25, 0.5), 1002);
  EXPECT_EQ(it(above[1], 0.5), 998);
  EXPECT_EQ(it(0.5, 0.5), 998);
  EXPECT_EQ(it(above[2], 0.5), 1003);
  EXPECT_EQ(it(0.75, 0.5), 1003);
  EXPECT_EQ(it(above[3], 0.5), 996);
}

TEST(nbar, tails_of_height_0_take_the_stand_in_of_its_logarithm) {
  probe it = probe_at(1000, true, true);
  it.set_sums(-1, -1, -1, 1);
  it.hat.e1s = -1;
  it.hat.e1o = 1000;
  EXPECT_EQ(it(0, 0), 1744);  // 744.44
  it.set_sums(-1, -1, -1, -1);
  it.hat.e2s = 1;
  it.hat.e2o = 1000;
  it.hat.m = 300;
  EXPECT_EQ(it(0, 0), 255);
  // In the test as well: ln(0) is not below a logarithm that is below its stand-in.
  const double law = gpu::nbar_log_law(5000, it.a1, it.q);
  it = probe_at(1000, false, false);
  it.hat.tm = law + 744.25;
  EXPECT_EQ(it.right(5000, 0), 5000);
  it.hat.tm = law + 744.5;
  EXPECT_EQ(it.right(5000, 0), rejected);
}

TEST(nbar, uniforms_make_candidates_in_pairs) {
  probe it = probe_at(1000, true, true);
  it.set_sums(0.5, 0.5, 0.5, 1);
  it.hat.r0s = 8;
  it.hat.r0o = 1000.75;
  it.hat.e1o = 1003.5;
  const auto values =
      candidate_functor{0, 1, &it.hat, 1, 0.5}(sycl::vec<double, 4>(0.25, 0.5, 0.75, 0.5));
  static_assert(decltype(values)::size() == 2);
  EXPECT_EQ(values[0], 1002);
  EXPECT_EQ(values[1], 1003);
}

}  // namespace
