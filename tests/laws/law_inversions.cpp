// SPDX-License-Identifier: Apache-2.0
// The exact law of a routine that turns one word into one value: the words of a one-dimensional
// net, whose first 2^k points split [0, 1) evenly, show each probability to 2^-k, without chance.
// So the whole error of the law is seen: of closed formulas, none, and of the Poisson method by a
// corrected normal, the distance that it states.
#include <cmath>
#include <map>

#include "reference.hpp"
#include "sampling.hpp"

namespace {

using laws::law;
using laws::specimen;

// The values of n points, sorted. Points are numbered from 0 or from 1: one of them may be another
// than those that split evenly.
std::vector<double> values_of(const specimen& s, std::size_t n) {
  laws::owned_stream net(RVX_BRNG_SOBOL, 1);
  std::vector<std::uint64_t> r(n);
  EXPECT_EQ(s.draw(net, n, r.data()), 0);
  std::vector<double> values(n);
  for (std::size_t i = 0; i < n; ++i)
    values[i] = s.value(r.data(), i);
  std::sort(values.begin(), values.end());
  return values;
}

// The greatest difference between the share of values and the probability, at 4096 of the values.
double distance(const specimen& s, const std::vector<double>& sorted) {
  const std::size_t n = sorted.size();
  const laws::view& v = s.views[0];
  double greatest = 0;
  for (std::size_t i = 0; i < n; i += n / 4096) {
    const double x = sorted[i], r = v.expected.discrete ? 0 : v.resolution.at(x);
    const auto upto = std::upper_bound(sorted.begin(), sorted.end(), x) - sorted.begin();
    const double share = static_cast<double>(upto) / static_cast<double>(n);
    greatest = std::max({greatest, share - v.expected.cdf(x + r), v.expected.cdf(x - r) - share});
  }
  return greatest;
}

bool one_word_for_one_value(const specimen& s) {
  for (const char* name : {"RngUniform", "RngExponential", "RngWeibull", "RngRayleigh", "RngGumbel",
                           "RngCauchy", "RngBernoulli", "RngGeometric"}) {
    if (s.routine.substr(1) == name)
      return true;
  }
  return (s.routine.substr(1) == "RngGaussian" && s.method == RVX_RNG_METHOD_GAUSSIAN_ICDF) ||
         (s.routine.substr(1) == "RngLognormal" && (s.method & 1) == RVX_RNG_METHOD_LOGNORMAL_ICDF);
}

TEST(inversions, are_exact_to_the_points_of_a_net) {
  constexpr std::size_t n = 1 << 15;
  std::size_t seen = 0;
  for (const specimen& s : laws::every_case()) {
    if (!one_word_for_one_value(s))
      continue;
    // One point more or less on either side, the first point, and a float's 24 bits.
    EXPECT_LE(distance(s, values_of(s, n)), 3.0 / n + 0x1p-23) << s.name();
    ++seen;
  }
  EXPECT_GE(seen, 300u);
}

// The total variation between the values and the law, over all integers that occur; what does not
// occur has the rest.
double total_variation(const law& expected, const std::vector<double>& sorted) {
  const std::size_t n = sorted.size();
  double sum = 0, covered = 0;
  for (std::size_t i = 0; i < n;) {
    std::size_t end = i;
    while (end < n && sorted[end] == sorted[i])
      ++end;
    const double p = expected.pmf(sorted[i]);
    sum += std::fabs(static_cast<double>(end - i) / static_cast<double>(n) - p);
    covered += p;
    i = end;
  }
  return (sum + (1 - covered)) / 2;
}

TEST(inversions, corrected_normals_are_poisson_to_the_stated_distance) {
  constexpr std::size_t n = 1 << 18;
  // For rates up to 10^6 (docs/distributions/poisson.md); greater ones have too many values to
  // count.
  constexpr double stated = 1e-6;
  std::size_t seen = 0;
  for (const specimen& s : laws::every_case()) {
    if (s.routine != "iRngPoisson" || s.method != RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF)
      continue;
    const auto values = values_of(s, n);
    const laws::view& v = s.views[0];
    const double cells = values.back() - values.front() + 1;
    // Each count is right to one point.
    if (cells < n / 64.0) {
      const double apart = total_variation(v.expected, values);
      EXPECT_LE(apart, stated + cells / n) << s.name();
      RecordProperty("distance_" + s.parameters, std::to_string(apart));
    }
    EXPECT_LE(distance(s, values), stated + 3.0 / n) << s.name();
    ++seen;
  }
  EXPECT_GE(seen, 12u);
}

}  // namespace
