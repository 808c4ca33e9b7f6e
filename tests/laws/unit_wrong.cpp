// SPDX-License-Identifier: Apache-2.0
// The tests of laws tested: samples of the right law pass, and samples of nearly the right one
// fail. The variates come from reference quantiles of uniforms, not from the routines.
#include <cmath>
#include <functional>
#include <limits>

#include "critical.hpp"
#include "reference.hpp"
#include "sampling.hpp"

namespace {

using laws::examination;
using laws::finding;
using laws::grain;
using laws::law;

constexpr std::size_t n = 200'000;
constexpr grain fine{1e-15, 0, 0, 0x1p-32, false};

// Quantiles of a law: from a table where they are integers of a moderate range.
std::function<double(double)> quantiles(const law& of) {
  const double first = of.below(1e-10), last = of.above(1e-10);
  if (!of.discrete || last - first > 1e5)
    return of.below;
  std::vector<double> cdf;
  for (double k = first; k < last; ++k)
    cdf.push_back(of.cdf(k));
  return [=](double p) {
    return first + static_cast<double>(std::lower_bound(cdf.begin(), cdf.end(), p) - cdf.begin());
  };
}

// Findings about n variates of `drawn`, changed by `change`, held against `expected`.
std::vector<finding> examine(const law& expected, const law& drawn,
                             const std::function<double(double)>& change) {
  laws::philox stream(20261121);
  std::vector<double> u(n);
  EXPECT_EQ(rvxdRngUniform(0, stream, n, u.data(), 0, 1), 0);
  examination e(expected, fine, n);
  const auto quantile = quantiles(drawn);
  for (const double p : u)
    e.add(change(quantile(p + 0x1p-33)));
  return e.findings();
}

double as_it_is(double x) {
  return x;
}

bool fails(const std::vector<finding>& all, const std::string& test) {
  for (const finding& f : all) {
    if (f.failed() && f.test.rfind(test, 0) == 0)
      return true;
  }
  return false;
}

void expect_pass(const law& right) {
  EXPECT_EQ(laws::failures(examine(right, right, as_it_is)), "");
}
void expect_fail(const law& expected, const law& drawn,
                 const std::function<double(double)>& change = as_it_is) {
  EXPECT_NE(laws::failures(examine(expected, drawn, change)), "");
}

TEST(examination, right_laws_pass) {
  for (const law& right : {laws::uniform(-1, 2),
                           laws::gaussian(3, 0.1),
                           laws::gamma(0.05, 0, 1),
                           laws::gamma(1000, -5, 2),
                           laws::beta(0.1, 0.2, 0, 1),
                           laws::beta(30, 0.5, 2, 3),
                           laws::cauchy(1, 2),
                           laws::gumbel(0, 1),
                           laws::lognormal(0, 2, 0, 1),
                           laws::rayleigh(0, 1),
                           laws::weibull(0.25, 0, 3),
                           laws::laplace(0, 1),
                           laws::poisson(0.01),
                           laws::poisson(7),
                           laws::poisson(1e4),
                           laws::binomial(100000, 0.7),
                           laws::geometric(1e-3),
                           laws::negative_binomial(0.1, 0.3),
                           laws::hypergeometric(2000000, 1000000, 999999),
                           laws::bernoulli(0.3),
                           laws::binomial(5, 1)})
    expect_pass(right);
}

// The least deviations that the headline of examination.hpp states.
TEST(examination, a_shift_fails) {
  const law g = laws::gaussian(0, 1);
  EXPECT_TRUE(fails(examine(g, g, [](double x) { return x + 0.04; }), "moment 1"));
  EXPECT_TRUE(fails(examine(g, g, [](double x) { return x - 0.04; }), "Kolmogorov"));
}
TEST(examination, a_wrong_scale_fails) {
  const law g = laws::gaussian(0, 1);
  EXPECT_TRUE(fails(examine(g, g, [](double x) { return 1.04 * x; }), "moment 2"));
  EXPECT_TRUE(fails(examine(g, g, [](double x) { return x / 1.04; }), "moment 2"));
  const law e = laws::exponential(0, 1);
  expect_fail(e, laws::exponential(0, 1.04));
}
TEST(examination, a_missing_tail_fails) {
  const law g = laws::gaussian(0, 1);
  const auto cut = [](double x) { return std::fmin(x, 3.4); };
  EXPECT_TRUE(fails(examine(g, g, cut), "values above"));
  EXPECT_TRUE(fails(examine(g, g, [](double x) { return x < -3.4 ? 0 : x; }), "values up to"));
}
TEST(examination, a_skew_of_the_right_mean_and_variance_fails) {
  // A gamma law of shape 400 has the skewness 0.1.
  const law g = laws::gaussian(0, 1), skew = laws::gamma(400, -20, 0.05);
  expect_fail(g, skew);
}
TEST(examination, a_local_error_fails) {
  // One value in 30 of a cell of 1 / 500 moved to the neighbour: too little for the distance,
  // enough for chi-square when all pairs of cells suffer it.
  const law u = laws::uniform(0, 1);
  const auto lumps = [](double x) {
    const double cell = std::floor(x * 250), inside = x * 250 - cell;
    return inside > 0.5 && inside < 0.53 ? (cell + inside - 0.5) / 250 : x;
  };
  EXPECT_TRUE(fails(examine(u, u, lumps), "chi-square"));
}
TEST(examination, neighbours_of_a_discrete_law_fail) {
  expect_fail(laws::poisson(10), laws::poisson(10.2));
  expect_fail(laws::poisson(1000), laws::binomial(20000, 0.05));
  expect_fail(laws::geometric(0.5), laws::geometric(0.5), [](double k) { return k + 1; });
  expect_fail(laws::negative_binomial(2.7, 0.1), laws::negative_binomial(2.5, 0.1));
  expect_fail(laws::hypergeometric(100, 50, 40), laws::binomial(50, 0.4));
  expect_fail(laws::bernoulli(0.3), laws::bernoulli(0.31));
}
TEST(examination, wrong_parametrisations_fail) {
  expect_fail(laws::rayleigh(0, 1), laws::rayleigh(0, std::sqrt(2)));
  expect_fail(laws::gumbel(0, 1), laws::gumbel(0, 1), [](double x) { return -x; });
  expect_fail(laws::weibull(2, 0, 1), laws::weibull(0.5, 0, 1));
  expect_fail(laws::cauchy(0, 1), laws::gaussian(0, 1));
}
TEST(examination, values_outside_the_range_fail) {
  const law e = laws::exponential(0, 1);
  const double infinity = std::numeric_limits<double>::infinity();
  for (const double bad : {-1e-9, infinity, -infinity, std::nan("")}) {
    bool once = false;
    const auto one = [&](double x) { return std::exchange(once, true) ? x : bad; };
    EXPECT_TRUE(fails(examine(e, e, one), "values outside")) << bad;
  }
}

// Chi-square sees the low bits of a 16-bit resolution; a resolution that is stated blurs no
// verdict.
TEST(examination, coarse_results_fail_unless_they_are_stated) {
  const law u = laws::uniform(0, 1);
  const auto coarse = [](double x) { return std::floor(x * 300) / 300; };
  expect_fail(u, u, coarse);
  const auto fp16 = [](double x) { return std::ldexp(std::floor(std::ldexp(x, 12)), -12); };
  grain stated = fine;
  stated.relative = 0x1p-12;
  stated.place = 1;
  laws::philox stream(7);
  examination e(u, stated, n);
  double x;
  for (std::size_t i = 0; i < n; ++i) {
    ASSERT_EQ(rvxdRngUniform(0, stream, 1, &x, 0, 1), 0);
    e.add(fp16(x));
  }
  const auto findings = e.findings();
  EXPECT_FALSE(fails(findings, "Kolmogorov"));
  EXPECT_FALSE(fails(findings, "chi-square"));
}

TEST(critical_values, are_those_of_the_budget) {
  // 2 exp(-2 n d^2) and 2 exp(-n t^2 / (2 (v + r t / 3))) are alpha there.
  const double d = laws::critical_distance(n);
  EXPECT_NEAR(2 * std::exp(-2.0 * n * d * d) / laws::alpha, 1, 1e-9);
  const double t = laws::critical_mean(n, 2, 9);
  EXPECT_NEAR(2 * std::exp(-static_cast<double>(n) * t * t / (2 * (2 + 9 * t / 3))) / laws::alpha,
              1, 1e-9);
  EXPECT_TRUE(laws::count_is_possible(50, n, 50.0 / n, 50.0 / n));
  EXPECT_TRUE(laws::count_is_possible(20, n, 50.0 / n, 50.0 / n));
  EXPECT_FALSE(laws::count_is_possible(8, n, 50.0 / n, 50.0 / n));
  EXPECT_FALSE(laws::count_is_possible(120, n, 50.0 / n, 50.0 / n));
  EXPECT_TRUE(laws::count_is_possible(0, n, 0, 0));
  EXPECT_FALSE(laws::count_is_possible(1, n, 0, 0));
}

}  // namespace
