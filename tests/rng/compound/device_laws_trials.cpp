// SPDX-License-Identifier: Apache-2.0
// binomial, hypergeometric and negative_binomial on a GPU queue, on both sides of every change of
// method.
#include <algorithm>
#include <cmath>

#include "device_laws.hpp"

namespace {

using namespace tarn_test;

template <typename Engine>
class trial_laws : public device_laws<Engine> {};
TYPED_TEST_SUITE(trial_laws, engines_of_laws, name_of_engine);

struct trials {
  std::int32_t ntrial;
  double p;
};

// Means on both sides of 30. Behind it, probabilities up to one half: above, the record of the
// rejection keeps the greater one of the two, and the law is another (below).
TYPED_TEST(trial_laws, of_binomial_hold) {
  for (const auto& [ntrial, p] :
       {trials{1, 0.3}, trials{20, 0.3}, trials{20, 0.7}, trials{59, 0.5}, trials{100, 0.2999},
        trials{100, 0.3}, trials{1000, 0.02999}, trials{1000, 0.03}, trials{100, 0.7001},
        trials{100, 0.71}, trials{1000, 0.98}, trials{60, 0.5}, trials{1000, 0.5},
        trials{100, 0.45}, trials{10000, 0.01}, trials{1000000, 0.3}, trials{2147483647, 1e-6},
        trials{2147483647, 0.4}}) {
    this->expect_laws(text_of("binomial", ntrial, p), rng::binomial<>(ntrial, p),
                      {law_of_integers(laws::binomial(ntrial, p))});
  }
}

TYPED_TEST(trial_laws, of_hypergeometric_hold) {
  const std::int32_t sets[][3] = {{10, 5, 5},
                                  {50, 5, 10},
                                  {50, 40, 10},
                                  {50, 5, 40},
                                  {50, 45, 40},
                                  {1000, 130, 300},  // most likely value 39
                                  {1000, 134, 300},  // 40
                                  {1000, 870, 300},
                                  {1000, 866, 300},
                                  {1000, 130, 700},
                                  {1000, 134, 700},
                                  {1000, 866, 700},
                                  {1000, 500, 500},
                                  {100000, 5000, 40000},
                                  {100000, 95000, 40000},
                                  {100000, 5000, 60000},
                                  {2000000, 1000000, 999999},
                                  {2147483647, 1000, 1000000},
                                  {2147483647, 100000, 2000000}};
  for (const auto& [l, s, m] : sets) {
    this->expect_laws(text_of("hypergeometric", l, s, m), rng::hypergeometric<>(l, s, m),
                      {law_of_integers(laws::hypergeometric(l, s, m))});
  }
}

// (a - 1) (1 - p) / p on both sides of 100. Behind it, laws whose most likely value m is so many
// deviations above m - 64, or above 150, that the walk between them is out of sight (below).
TYPED_TEST(trial_laws, of_negative_binomial_hold) {
  const double sets[][2] = {{0.5, 0.2},  {1, 0.5},       {5, 0.3},       {60.5, 0.9},
                            {2, 0.0156}, {1.01, 0.01},   {100.999, 0.5}, {101, 0.5},
                            {899, 0.9},  {902, 0.9},     {200, 0.5},     {1e4, 0.9},
                            {1e4, 0.99}, {300.25, 0.05}, {1e6, 0.3},     {1e8, 0.999}};
  for (const auto& [a, p] : sets) {
    this->expect_laws(text_of("negative_binomial", a, p), rng::negative_binomial<>(a, p),
                      {law_of_integers(laws::negative_binomial(a, p))});
  }
}

/// Mean of a sample, in deviations of a law above that law's mean.
template <typename T>
double shift(const std::vector<T>& values, double mean, double variance) {
  double sum = 0;
  for (const T value : values) {
    sum += static_cast<double>(value);
  }
  return (sum / static_cast<double>(values.size()) - mean) / std::sqrt(variance);
}

// Kept: results depend on it. By rejection, probabilities above one half stand in the record as
// they are, though mean and deviation are those of failures: m is up to 1/2 too high, and the
// ratios of neighbours are those of one half. Results are then too low. The shifts are those of a
// million results of philox4x32x10; 0.03 deviations are five errors of a mean of 20000.
TEST(binomial_above_one_half, is_no_binomial_law_by_rejection) {
  struct shifted {
    trials of;
    double by;
  };
  for (const auto& [of, by] :
       {shifted{{100, 0.51}, -0.199}, shifted{{100, 0.6}, -0.537}, shifted{{100, 0.7}, -0.630},
        shifted{{1000, 0.51}, -0.142}, shifted{{1000, 0.7}, -0.171}, shifted{{1000, 0.9}, -0.370},
        shifted{{10000, 0.7}, -0.051}, shifted{{10000, 0.99}, -0.365}}) {
    SCOPED_TRACE(text_of("binomial", of.ntrial, of.p));
    rng::mcg59 engine(gpu_queue(), 2024);
    const auto values = draw(rng::binomial<>(of.ntrial, of.p), engine, 20'000);
    EXPECT_NEAR(shift(values, of.ntrial * of.p, of.ntrial * of.p * (1 - of.p)), by, 0.03);
  }
}

// Kept: results depend on it. Below 150, rejection ends 64 under the most likely value, as the walk
// further down rejects at its first step: here 0.15 per cent of the law are missing.
TEST(negative_binomial_with_a_long_left_tail, ends_64_below_the_most_likely_value) {
  const double a = 12.2, p = 0.1;  // most likely value 100
  const laws::law whole = laws::negative_binomial(a, p);
  constexpr std::int64_t n = 200'000;
  EXPECT_GT(whole.cdf(35) * n, 250);
  rng::mcg59 engine(gpu_queue(), 2024);
  const auto values = draw(rng::negative_binomial<>(a, p), engine, n);
  EXPECT_GE(*std::min_element(values.begin(), values.end()), 36);
  // What remains is the law's, to the part that is missing.
  laws::view seen = law_of_approximation(whole);
  laws::examination examined(seen.expected, seen.resolution, values.size());
  for (const std::int32_t value : values) {
    examined.add(value);
  }
  const auto findings = examined.findings();
  ASSERT_EQ(findings[1].test, "Kolmogorov-Smirnov distance");
  EXPECT_FALSE(findings[1].failed()) << findings[1].statistic;
}

TARN_REPORTS_CUDA(trial_laws)

}  // namespace
