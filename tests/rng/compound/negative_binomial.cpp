// SPDX-License-Identifier: Apache-2.0
// negative_binomial on GPUs: the choice between table and rejection, the table and the walk behind
// it, the hats of laws and the parameters that have none.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "distributions/negbinomial_gpu_dispatch.hpp"
#include "level_calls.hpp"
#include "message.hpp"

namespace {

namespace rng = kestrel::tarn::rng;
namespace gpu = kestrel::tarn::rng::detail::gpu;
using table_functor = gpu::functors::negative_binomial<gpu::negative_binomial_algorithm::icdf>;
using kestrel::tarn::invalid_argument;
using kestrel::tarn::service::_nbar_params;
using tarn_test::both_forms;
using tarn_test::draw;
using tarn_test::draw_at_level;
using tarn_test::host_run_gpu_queue;
using tarn_test::message_of;

constexpr std::int32_t greatest = std::numeric_limits<std::int32_t>::max();

std::vector<double> table_of(double a, double p) {
  const std::int32_t size = gpu::negative_binomial_table_size(a, p);
  std::vector<double> cdf(static_cast<std::size_t>(size));
  gpu::fill_negative_binomial_table(a, p, size, cdf.data());
  return cdf;
}

table_functor on_table(const std::vector<double>& cdf, double a, double p) {
  return {0, 1, cdf.data(), a, p, 1 - p, static_cast<std::int32_t>(cdf.size())};
}

TEST(negative_binomial_table, has_128_entries_behind_the_mode) {
  EXPECT_EQ(gpu::negative_binomial_table_size(100.999, 0.5), 99 + 128);
  EXPECT_EQ(gpu::negative_binomial_table_size(2, 0.5), 1 + 128);
  EXPECT_EQ(gpu::negative_binomial_table_size(1.999, 0.5), 128);
  EXPECT_EQ(gpu::negative_binomial_table_size(50, 0.9999), 128);
  EXPECT_EQ(gpu::negative_binomial_table_size(1, 1e-300), 128);
  EXPECT_EQ(gpu::negative_binomial_table_size(0.5, 1e-300), 128);  // a mode of -5e299
  EXPECT_EQ(gpu::negative_binomial_table_size(0.5, 5e-324), 128);  // of minus infinity
  EXPECT_EQ(gpu::negative_binomial_table_size(7, 1), 128);
}

TEST(negative_binomial_table, holds_the_sums_of_the_law) {
  for (const auto& [a, p] :
       {std::pair{0.25, 0.01}, {1.0, 0.3}, {5.5, 0.75}, {100.999, 0.5}, {1e6, 0.9999}}) {
    const std::vector<double> cdf = table_of(a, p);
    long double sum = 0;
    for (std::size_t k = 0; k < cdf.size(); ++k) {
      const auto count = static_cast<long double>(k);
      sum += std::exp(std::lgamma(a + count) - std::lgamma(static_cast<long double>(a)) -
                      std::lgamma(count + 1) + a * std::log(static_cast<long double>(p)) +
                      count * std::log(1 - static_cast<long double>(p)));
      // 1 - p is rounded, up to 1e-12 of it at 0.9999, in each factor of a hundred.
      ASSERT_NEAR(cdf[k], static_cast<double>(sum), 1e-10) << a << ' ' << p << ' ' << k;
    }
    EXPECT_GT(cdf.back(), a < 1 ? 0.5 : 0.99);
  }
}

TEST(negative_binomial_table, gives_the_first_count_whose_sum_is_above_the_uniform) {
  const std::vector<double> cdf = table_of(5.5, 0.25);
  const table_functor functor = on_table(cdf, 5.5, 0.25);
  EXPECT_EQ(functor.one(0), 0);
  EXPECT_EQ(functor.one(std::nextafter(cdf[0], 0)), 0);
  for (std::size_t k = 1; k < 60; ++k) {
    ASSERT_LT(cdf[k - 1], cdf[k]);
    const auto count = static_cast<std::int32_t>(k);
    EXPECT_EQ(functor.one(cdf[k - 1]), count);
    EXPECT_EQ(functor.one(std::nextafter(cdf[k], 0)), count);
  }
  const auto values = functor(sycl::vec<double, 4>(0, cdf[0], cdf[20], cdf[6]));
  const std::int32_t expected[] = {0, 1, 21, 7};
  for (int i = 0; i < 4; ++i) {
    EXPECT_EQ(values[i], expected[i]);
  }
}

// For a = 1 the probability of more than k is q^(k + 1), here with one half in exact numbers.
TEST(negative_binomial_table, goes_on_behind_its_end_by_the_ratio_of_terms) {
  std::vector<double> cdf(10);
  gpu::fill_negative_binomial_table(1, 0.5, 10, cdf.data());
  const table_functor functor = on_table(cdf, 1, 0.5);
  for (int k = 0; k < 50; ++k) {
    const double sum = 1 - std::ldexp(1.0, -k - 1);
    EXPECT_EQ(functor.one(std::nextafter(sum, 0)), k);
    EXPECT_EQ(functor.one(sum), k + 1);
  }
}

TEST(negative_binomial_table, is_walked_far_where_the_probability_is_small) {
  const double p = 1e-3;
  const std::vector<double> cdf = table_of(1, p);
  const table_functor functor = on_table(cdf, 1, p);
  for (const double u : {0.5, 0.9, 0.999, 1 - 1e-6}) {
    EXPECT_NEAR(functor.one(u), std::floor(std::log1p(-u) / std::log1p(-p)), 1) << u;
  }
}

// Terms that vanish next to the sum never bring it past the uniform: it is given the greatest count
// whose own term does not.
TEST(negative_binomial_table, ends_where_its_sum_stands_still) {
  const double last = 1 - 0x1p-53;  // the greatest uniform
  const std::vector<double> flat(128, 0.75);
  EXPECT_EQ(on_table(flat, 5, 0.5).one(last), 0);  // no term behind the first
  for (const auto& [a, p] : {std::pair{5.0, 0.999}, {50.0, 0.9999}, {1.0, 0.5}, {7.0, 1.0}}) {
    const std::vector<double> cdf = table_of(a, p);
    const auto end = std::find(cdf.begin(), cdf.end(), cdf.back());
    EXPECT_EQ(on_table(cdf, a, p).one(cdf.back()), end - cdf.begin()) << a << ' ' << p;
    EXPECT_LT(end - cdf.begin(), 100);
  }
  // From 1 - 1e-12 on, terms of one half each: the sum ends below 1 - 5e-13.
  const table_functor functor = on_table(flat, 1, 0.5);
  const std::int32_t end = functor.behind_table(last, 1000, 5e-13, 1 - 1e-12);
  EXPECT_GT(end, 1000 + 10);
  EXPECT_LT(end, 1000 + 20);
}

TEST(negative_binomial_table, ends_at_the_greatest_integer) {
  const std::vector<double> flat(128, 0.5);
  const table_functor functor = on_table(flat, 1, 1e-9);
  EXPECT_EQ(functor.behind_table(0.5, greatest - 3, 1e-9, 0.1), greatest);
  EXPECT_EQ(functor.behind_table(0.5, greatest - 1, 1e-9, 0.1), greatest);
  EXPECT_EQ(functor.behind_table(0.1, greatest - 3, 1e-9, 0.1), greatest - 2);
}

TEST(negative_binomial_table, gives_what_follows_it_for_what_is_no_number) {
  const std::vector<double> cdf = table_of(5, 0.5);
  EXPECT_EQ(on_table(cdf, 5, 0.5).one(std::numeric_limits<double>::quiet_NaN()), 132);
}

TEST(nbar_record, sums_rise_to_1_and_pieces_meet) {
  for (const auto& [a, p] : {std::pair{101.0, 0.5},
                             {2.3, 0.01},
                             {5.0, 0.03},
                             {1e6, 0.3},
                             {1e12, 0.999999},
                             {40.0, 1e-8}}) {
    const _nbar_params hat = gpu::nbar_record(a, p);
    EXPECT_EQ(hat.a, a);
    EXPECT_EQ(hat.p, p);
    EXPECT_EQ(hat.m, std::trunc((a - 1) * (1 - p) / p));
    EXPECT_GT(hat.P[0], 0);
    for (int piece = 1; piece < 5; ++piece) {
      EXPECT_GT(hat.P[piece], hat.P[piece - 1]);
    }
    EXPECT_EQ(hat.P[4], 1);
    // The centre ends where the slopes begin, in places and in heights: its squeezes reach 1 about
    // the mode and the law where the slopes begin, whose own squeezes reach it there as well.
    const double kr = hat.r0s * hat.P[0] + hat.r0o;
    const double xl0 = hat.r0o;
    const double near = 1e-9;
    EXPECT_NEAR(hat.e1o - hat.b1d, kr, kr * near);
    EXPECT_NEAR(hat.e2o - hat.b2d, xl0, xl0 * near);
    EXPECT_NEAR(hat.sr * hat.m + hat.or_, 1, near);
    EXPECT_NEAR(hat.sr * kr + hat.or_, hat.b1f, near);
    EXPECT_NEAR(hat.sl * (hat.m + 1) + hat.ol, 1, near);
    EXPECT_NEAR(hat.sl * xl0 + hat.ol, hat.b2f, near);
    EXPECT_NEAR(hat.b1g * kr + hat.b1h, hat.b1f, near);
    EXPECT_NEAR(hat.b2g * xl0 + hat.b2h, hat.b2f, near);
    // A slope's root times its height at the centre is the height: from 1 + w down to w, which is
    // the height of the tail there.
    const auto root = [](double s, double o, double u) { return std::sqrt(s * u + o); };
    const double w1 = root(hat.b1s, hat.b1o, hat.P[0]);
    EXPECT_NEAR(root(hat.b1s, hat.b1o, hat.P[1]), 1 + w1, near);
    EXPECT_NEAR(hat.b1c - hat.b1d * (1 + w1), kr, kr * near);
    EXPECT_NEAR(hat.b1c - hat.b1d * w1, hat.e1o, kr * near);
    const double w2 = root(hat.b2s, hat.b2o, hat.P[1]);
    EXPECT_NEAR(root(hat.b2s, hat.b2o, hat.P[2]), 1 + w2, near);
    EXPECT_NEAR(hat.b2c - hat.b2d * (1 + w2), xl0, kr * near);
    EXPECT_NEAR(hat.b2c - hat.b2d * w2, hat.e2o, kr * near);
    EXPECT_LT(hat.e1s, 0);
    EXPECT_GT(hat.e2s, 0);
  }
}

/// The law at y over that at the mode m.
double law_at(long double y, long double m, double a, double p) {
  const auto logarithm = [&](long double k) {
    return std::lgamma(a + k) - std::lgamma(k + 1) + k * std::log(static_cast<long double>(1 - p));
  };
  return static_cast<double>(std::exp(logarithm(y) - logarithm(m)));
}

TEST(nbar_record, tables_are_the_law_next_to_its_mode) {
  const _nbar_params hat = gpu::nbar_record(350.5, 0.4);
  for (int j = 0; j < 64; ++j) {
    EXPECT_NEAR(hat.down[j], law_at(hat.m - 1 - j, hat.m, 350.5, 0.4), 1e-12) << j;
    EXPECT_NEAR(hat.up[j], law_at(hat.m + 1 + j, hat.m, 350.5, 0.4), 1e-12) << j;
  }
}

// By tables in the first law, by logarithms in the second, whose series add up to 1e-4.
TEST(nbar_record, heights_are_those_of_the_law_and_areas_follow) {
  for (const auto& [a, p, near] :
       {std::tuple{200.5, 0.6, 1e-10}, {350.5, 0.25, 1e-4}, {20.0, 0.01, 1e-4}}) {
    const _nbar_params hat = gpu::nbar_record(a, p);
    const auto law = [&, a = a, p = p](double y) { return law_at(y, hat.m, a, p); };
    const double kr = hat.b1h / -hat.b1g - hat.b1d;
    const double xl0 = hat.r0o;
    EXPECT_NEAR(hat.b1f, law(std::round(kr)), near);
    EXPECT_NEAR(hat.b2f, law(xl0 - 1), near);
    // Slopes end in the neighbour of the count there, tails go through both.
    const double ir = std::trunc(hat.e1o);
    const double il = std::trunc(hat.e2o);
    const double w1 = std::sqrt(hat.b1s * hat.P[0] + hat.b1o);
    const double w2 = std::sqrt(hat.b2s * hat.P[1] + hat.b2o);
    EXPECT_NEAR(w1 * hat.b1f, law(ir - 1), near);
    EXPECT_NEAR(w2 * hat.b2f, law(il + 1), near);
    EXPECT_NEAR(std::exp(1 / hat.e1s), law(ir + 1) / law(ir), 1e-10);
    EXPECT_NEAR(std::exp(1 / hat.e2s), law(il) / law(il - 1), 1e-10);
    const double right_tail = hat.e1w * (hat.P[3] - hat.P[2]);
    const double left_tail = hat.e2w * (hat.P[4] - hat.P[3]);
    EXPECT_NEAR(right_tail * std::exp((ir + 1 - hat.e1o) / hat.e1s), law(ir), near);
    EXPECT_NEAR(left_tail * std::exp((il - hat.e2o) / hat.e2s), law(il), near);
    // r0s is the total.
    const double total = hat.r0s;
    const auto share = [&](double area) { return area / total; };
    EXPECT_NEAR(hat.P[1] - hat.P[0], share((0.5 + w1) * hat.b1f * hat.b1d), 1e-12);
    EXPECT_NEAR(hat.P[2] - hat.P[1], share((0.5 + w2) * hat.b2f * -hat.b2d), 1e-12);
    EXPECT_NEAR(hat.P[3] - hat.P[2], share(-right_tail * hat.e1s), 1e-12);
    EXPECT_NEAR(hat.P[4] - hat.P[3], share(left_tail * hat.e2s), 1e-12);
  }
}

constexpr const char* no_hat =
    "kestrel::tarn::rng::negative_binomial: invalid argument: these parameters are not supported "
    "on GPU";

TEST(nbar_record, is_refused_for_laws_without_a_hat) {
  const auto message = [](double a, double p) {
    return message_of<invalid_argument>([&] { gpu::nbar_record(a, p); });
  };
  EXPECT_EQ(message(1.5, 1e-3), no_hat);   // as wide as its mode: no zero on the left
  EXPECT_EQ(message(2, 1e-4), no_hat);     // the zero at 0
  EXPECT_EQ(message(2.1, 0.01), no_hat);   // the slope from the zero ends below 1
  EXPECT_EQ(message(2.02, 0.01), no_hat);  // a mode of 100.98, next to the tables
  EXPECT_EQ(message(1e16, 0.5), no_hat);   // logarithms of the law lose its heights
  EXPECT_EQ(message(3, 1e-17), no_hat);    // 1 - p is 1
  EXPECT_EQ(message(1e300, 0.5), no_hat);  // the zeros are the mode itself
  EXPECT_EQ(message(1e300, 1e-300), no_hat);
  for (const auto& [a, p] : {std::pair{2.3, 0.01}, {2.01, 1e-5}, {1e12, 0.5}, {3.0, 1e-12}}) {
    EXPECT_EQ(message(a, p), "[nothing raised]") << a << ' ' << p;
  }
}

using counts = rng::negative_binomial<std::int32_t>;
using unsigned_counts = rng::negative_binomial<std::uint32_t>;

TEST(negative_binomial_dispatch, takes_the_table_below_a_mode_of_100) {
  EXPECT_EQ(gpu::negative_binomial_mode(101, 0.5), 100);
  EXPECT_NEAR(gpu::negative_binomial_mode(100.999, 0.5), 99.999, 1e-12);
  for (const auto form : both_forms) {
    rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
    EXPECT_EQ(draw_at_level(form, counts(100.999, 0.5), engine, 1000, 1000).consumed, 1000);
    EXPECT_EQ(draw_at_level(form, counts(50, 0.9999), engine, 1003, 1003).consumed, 1003);
    EXPECT_EQ(draw_at_level(form, counts(0.5, 0.3), engine, 0, 1).consumed, 0);
    // Two words for a candidate, and more candidates than results.
    EXPECT_GT(draw_at_level(form, counts(101, 0.5), engine, 1000, 1000).consumed, 2000);
  }
}

TEST(negative_binomial_dispatch, gives_either_type_the_same_bits) {
  for (const double a : {20.0, 300.0}) {
    for (const auto form : both_forms) {
      rng::mrg32k3a engine(host_run_gpu_queue(), 7);
      rng::mrg32k3a same(host_run_gpu_queue(), 7);
      const auto values = draw_at_level(form, counts(a, 0.5), engine, 1001, 1001);
      const auto others = draw_at_level(form, unsigned_counts(a, 0.5), same, 1001, 1001);
      EXPECT_EQ(values.consumed, others.consumed);
      EXPECT_EQ(std::vector<std::uint32_t>(values.values.begin(), values.values.end()),
                others.values);
    }
  }
}

TEST(negative_binomial_dispatch, inverts_the_uniforms_of_the_engine) {
  const std::vector<double> cdf = table_of(20.5, 0.25);
  const table_functor functor = on_table(cdf, 20.5, 0.25);
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  rng::philox4x32x10 same(host_run_gpu_queue(), 7);
  const auto values = draw(counts(20.5, 0.25), engine, 5003);
  const auto uniforms = draw(rng::uniform<double>(), same, 5003);
  for (std::size_t i = 0; i < values.size(); ++i) {
    ASSERT_EQ(values[i], functor.one(uniforms[i])) << i;
  }
}

TEST(negative_binomial_dispatch, gives_0_for_certain_successes) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  EXPECT_EQ(draw(counts(7, 1), engine, 1000), std::vector<std::int32_t>(1000, 0));
}

TEST(negative_binomial_dispatch, gives_the_ceiling_where_all_counts_are_above_it) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  EXPECT_EQ(draw(counts(1e12, 0.5), engine, 500), std::vector<std::int32_t>(500, 2147483520));
}

TEST(negative_binomial_dispatch, refuses_laws_without_a_hat_and_leaves_the_engine) {
  rng::philox4x32x10 engine(host_run_gpu_queue(), 7);
  rng::philox4x32x10 same(host_run_gpu_queue(), 7);
  EXPECT_EQ(message_of<invalid_argument>([&] { draw(counts(1.5, 1e-3), engine, 10); }), no_hat);
  EXPECT_EQ(message_of<invalid_argument>([&] {
              draw_at_level(tarn_test::output_form::buffer, unsigned_counts(2, 1e-3), engine, 10,
                            10);
            }),
            no_hat);
  EXPECT_EQ(draw(rng::bits<>(), engine, 10), draw(rng::bits<>(), same, 10));
}

}  // namespace
