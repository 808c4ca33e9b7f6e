// SPDX-License-Identifier: Apache-2.0
// The law of poisson by inversion, measured word by word: exact for rates below 32, and close to
// the true one above, against cdfs in 50 digits.
#include <cmath>

#include <boost/math/distributions/poisson.hpp>
#include <boost/multiprecision/cpp_bin_float.hpp>

#include "distributions/scripted_words.hpp"

namespace {

using poisson_law = support::on_simd_target;
using real = boost::multiprecision::cpp_bin_float_50;

support::routine poisson(std::int64_t method, double lambda) {
  return [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
    return rvxiRngPoisson(method, s, n, r, lambda);
  };
}
support::routine poisson_v(double lambda) {
  return [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
    const std::vector<double> rates(static_cast<std::size_t>(n), lambda);
    return rvxiRngPoissonV(0, s, n, r, rates.data());
  };
}

// The values begin where the cdf of the value before ends: at the least i / 2^32 not below it.
void compare_exact(const support::routine& draw, double lambda) {
  const auto last = static_cast<std::int32_t>(lambda + 12 * std::sqrt(lambda) + 30);
  const auto steps = support::scripted(draw).steps(1, last);
  real term = exp(-real(lambda)), sum = term;
  for (std::int32_t k = 1; k <= last; ++k) {
    // The digits of the sum may take it past 1.
    const real end = ceil(sum * support::word_count);
    const auto expected = std::min(static_cast<std::uint64_t>(end), support::word_count);
    ASSERT_EQ(steps[static_cast<std::size_t>(k - 1)], expected)
        << "value " << k << " of rate " << lambda;
    term *= real(lambda) / k;
    sum += term;
  }
  EXPECT_EQ(steps.back(), support::word_count);
}

const double small_rates[] = {5e-324,
                              1e-300,
                              1e-12,
                              1e-9,
                              3e-8,
                              0.01,
                              0.0625,
                              0.1,
                              0.5,
                              0.99,
                              1,
                              1.7,
                              3.1,
                              7.5,
                              10,
                              15.9,
                              20.25,
                              31.5,
                              std::nextafter(32.0, 0.0)};

TEST_F(poisson_law, rates_below_32_are_inverted_exactly_by_every_method) {
  for (const double lambda : small_rates) {
    ASSERT_NO_FATAL_FAILURE(compare_exact(poisson(RVX_RNG_METHOD_POISSON_PTPE, lambda), lambda));
    ASSERT_NO_FATAL_FAILURE(
        compare_exact(poisson(RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF, lambda), lambda));
    ASSERT_NO_FATAL_FAILURE(compare_exact(poisson_v(lambda), lambda));
  }
}

// The values that come: beyond 9 deviations, and 40 more for skewness, lies less than 1e-17.
struct values {
  explicit values(double lambda)
      : first(static_cast<std::int32_t>(std::max(lambda - 9 * std::sqrt(lambda) - 40, 0.0))),
        last(static_cast<std::int32_t>(lambda + 9 * std::sqrt(lambda) + 40)) {
    const boost::math::poisson_distribution<long double> law(static_cast<long double>(lambda));
    for (std::int32_t k = first; k <= last; ++k)
      words.push_back(pdf(law, static_cast<long double>(k)) * support::word_count);
  }
  std::int32_t first, last;
  std::vector<long double> words;  // that each should have
};

// Half the sum of |measured - true probability| over all values.
double total_variation(const support::routine& draw, const values& all) {
  const auto steps = support::scripted(draw).steps(all.first, all.last + 1);
  long double distance = static_cast<long double>(steps.front());  // words below the first value
  distance += static_cast<long double>(support::word_count - steps.back());
  for (std::size_t i = 0; i < all.words.size(); ++i) {
    EXPECT_LE(steps[i], steps[i + 1]);
    distance += std::fabs(static_cast<long double>(steps[i + 1] - steps[i]) - all.words[i]);
  }
  return static_cast<double>(distance / 2 / support::word_count);
}

// The same of a faultless inversion: what the rounding to whole words leaves.
double words_alone(const values& all) {
  long double end = 0, distance = 0;
  for (const long double words : all.words) {
    const long double begin = end;
    end += words;
    distance += std::fabs(std::ceil(end) - std::ceil(begin) - words);
  }
  return static_cast<double>(distance / 2 / support::word_count);
}

constexpr double close = 1e-6;

// Two hundred rates, evenly spread in logarithm from 0.1 to 10000. The expansion is worst at the
// least rate that it serves, where what it leaves out is of the order 1 / lambda^2.
TEST_F(poisson_law, the_inverse_through_the_normal_law_is_close) {
  constexpr int rates = 200;
  double worst = 0, worst_v = 0, worst_rate = 0;
  for (int i = 0; i < rates; ++i) {
    const double lambda = 0.1 * std::pow(10.0, 5.0 * i / (rates - 1));
    const values all(lambda);
    const double distance =
        total_variation(poisson(RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF, lambda), all);
    if (distance > worst) {
      worst = distance;
      worst_rate = lambda;
    }
    worst_v = std::max(worst_v, total_variation(poisson_v(lambda), all));
  }
  RecordProperty("worst", std::to_string(worst * 1e9));
  std::printf("greatest total variation: %.3g at rate %g; poisson_v %.3g\n", worst, worst_rate,
              worst_v);
  EXPECT_LT(worst, close);
  EXPECT_LT(worst_v, close);
}

// The table of docs/distributions/poisson.md. Whole words are too coarse where a law has very many
// values: a faultless inversion passes 1e-6 between the last two rates.
TEST_F(poisson_law, distances_over_the_rates) {
  for (const double lambda :
       {10.0, 31.9, 32.0, 33.0, 50.0, 100.0, 500.0, 1e3, 1e4, 1e5, 1e6, 1e7}) {
    const values all(lambda);
    const double distance =
        total_variation(poisson(RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF, lambda), all);
    const double distance_v = total_variation(poisson_v(lambda), all);
    const double faultless = words_alone(all);
    std::printf("| %g | %.1e | %.1e | %.1e |\n", lambda, distance, distance_v, faultless);
    const double bound = lambda > 1e6 ? faultless + close : close;
    EXPECT_LT(distance, bound) << "rate " << lambda;
    EXPECT_LT(distance_v, bound) << "rate " << lambda;
  }
}

TEST_F(poisson_law, results_stay_in_range_whatever_the_words) {
  for (const double lambda : {32.0, 33.3, 100.0, 1e6, 2.1e9, 2147483647.0, 1e10, 1e15, 1e300}) {
    for (const auto& draw : {poisson(1, lambda), poisson_v(lambda)}) {
      support::scripted at(draw);
      std::int32_t before = 0;
      for (const std::uint64_t i : {std::uint64_t{0}, std::uint64_t{1}, support::word_count / 2,
                                    support::word_count - 2, support::word_count - 1}) {
        const std::int32_t value = at.value(i);
        EXPECT_GE(value, before) << "rate " << lambda << " at " << i;
        before = value;
      }
    }
  }
  for (const double lambda : {1e10, 1e300})
    for (const std::uint64_t i : {std::uint64_t{0}, support::word_count - 1})
      for (const auto& draw : {poisson(1, lambda), poisson_v(lambda)})
        EXPECT_EQ(support::scripted(draw).value(i), 2147483647);
}

}  // namespace
