// SPDX-License-Identifier: Apache-2.0
// The reference laws as these tests parametrise them reproduce quantiles and moments that were
// computed elsewhere, and are laws at all.
#include <cmath>
#include <map>
#include <sstream>

#include <boost/math/distributions/hypergeometric.hpp>
#include <gtest/gtest.h>

#include "../kat/kat_file.hpp"
#include "clamped_moments.hpp"
#include "reference.hpp"

namespace {

using laws::law;

using parameters = std::map<std::string, double>;

struct answer {
  std::size_t line;
  std::string distribution;
  parameters given;
  std::vector<double> values;
};

std::vector<std::string> split(const std::string& text, char separator) {
  std::vector<std::string> parts;
  std::istringstream in(text);
  for (std::string part; std::getline(in, part, separator);)
    parts.push_back(part);
  return parts;
}

std::vector<answer> read(const std::string& file) {
  std::vector<answer> all;
  for (const auto& line : tarn::kat::read_file(TARN_KAT_FOLDER, file)) {
    const auto cells = split(line.fields.at(0), ',');
    if (cells.at(0) == "distribution")
      continue;
    answer next{line.number, cells[0], {}, {}};
    for (const std::string& setting : split(cells.at(1), ';')) {
      const auto sides = split(setting, '=');
      next.given[sides.at(0)] = std::stod(sides.at(1));
    }
    for (std::size_t i = 2; i < cells.size(); ++i)
      next.values.push_back(std::stod(cells[i]));
    all.push_back(next);
  }
  return all;
}

law law_of(const answer& a) {
  const auto g = [&](const char* name) { return a.given.at(name); };
  const auto whole = [&](const char* name) { return static_cast<int>(a.given.at(name)); };
  const std::string& d = a.distribution;
  if (d == "uniform")
    return laws::uniform(g("a"), g("b"));
  if (d == "gaussian")
    return laws::gaussian(g("mean"), g("sigma"));
  if (d == "exponential")
    return laws::exponential(g("displacement"), g("scale"));
  if (d == "lognormal")
    return laws::lognormal(g("m"), g("s"), g("displacement"), g("scale"));
  if (d == "gamma")
    return laws::gamma(g("alpha"), g("displacement"), g("scale"));
  if (d == "chi_square")
    return laws::chi_square(whole("n"));
  if (d == "beta")
    return laws::beta(g("p"), g("q"), g("displacement"), g("scale"));
  if (d == "weibull")
    return laws::weibull(g("alpha"), g("displacement"), g("scale"));
  if (d == "gumbel_min")
    return laws::gumbel(g("a"), g("scale"));
  if (d == "laplace")
    return laws::laplace(g("mean"), g("scale"));
  if (d == "cauchy")
    return laws::cauchy(g("a"), g("scale"));
  if (d == "rayleigh")
    return laws::rayleigh(g("displacement"), g("sigma") * std::sqrt(2));
  if (d == "poisson")
    return laws::poisson(g("lambda"));
  if (d == "binomial")
    return laws::binomial(whole("n"), g("p"));
  if (d == "negative_binomial")
    return laws::negative_binomial(g("r"), g("p"));
  if (d == "geometric")
    return laws::geometric(g("p"));
  if (d == "hypergeometric")
    return laws::hypergeometric(whole("population"), whole("sample"), whole("marked"));
  throw std::runtime_error("no law " + d);
}

// The form of a maximum is not among the routines.
bool offered(const answer& a) {
  return a.distribution != "gumbel_max";
}

TEST(reference, quantiles) {
  std::size_t compared = 0;
  for (const answer& a : read("dist_quantiles")) {
    if (!offered(a))
      continue;
    const law of = law_of(a);
    const double p = a.values.at(0), x = a.values.at(1);
    // The answers were checked to 4e-12 of their value, near zero to that of the law's width.
    const double width = of.above(0.25) - of.below(0.25);
    const double close = 1e-11 * std::max(std::fabs(x), width);
    EXPECT_NEAR(of.below(p), x, close) << "line " << a.line;
    EXPECT_NEAR(of.above(1 - p), x, close) << "line " << a.line;
    EXPECT_NEAR(of.cdf(x), p, 1e-12) << "line " << a.line;
    ++compared;
  }
  EXPECT_GE(compared, 700u);
}

TEST(reference, moments) {
  std::size_t compared = 0;
  for (const answer& a : read("dist_moments")) {
    if (!offered(a) || std::isnan(a.values.at(0)))
      continue;
    // So far out that nothing is missing: the heaviest tail here, a lognormal of s = 1, has
    // 1e-28 of its fourth moment beyond.
    const auto m = laws::clamp(law_of(a), 1e-60);
    const double close = 1e-10;
    EXPECT_NEAR(m.centre, a.values[0], close * std::max(std::fabs(a.values[0]), m.spread));
    EXPECT_NEAR(m.spread * m.spread / a.values.at(1), 1, close) << "line " << a.line;
    EXPECT_NEAR(m.mean[0], 0, close) << "line " << a.line;
    EXPECT_NEAR(m.mean[1], 1, close) << "line " << a.line;
    EXPECT_NEAR(m.mean[2], a.values.at(2), close * std::max(1.0, a.values[2]));
    EXPECT_NEAR(m.mean[3], a.values.at(3) + 3, close * std::max(1.0, a.values[3]))
        << "line " << a.line;
    ++compared;
  }
  EXPECT_GE(compared, 45u);
}

// Quantiles are those of the definition, and the probabilities add up.
TEST(reference, integer_laws_are_consistent) {
  for (const law& of :
       {laws::integers(-3, 9), laws::bernoulli(0.3), laws::geometric(0.05), laws::poisson(0.5),
        laws::poisson(1000), laws::binomial(60, 0.499), laws::binomial(10000, 0.999),
        laws::negative_binomial(0.5, 0.2), laws::negative_binomial(60.5, 0.9),
        laws::hypergeometric(1000, 134, 700), laws::hypergeometric(50, 45, 40),
        laws::hypergeometric(2147483647, 100000, 2000000)}) {
    for (const double p : {1e-9, 1e-3, 0.2, 0.5, 0.77, 0.999}) {
      const double k = of.below(p), up = of.above(p);
      EXPECT_TRUE(of.cdf(k) >= p && of.cdf(k - 1) < p) << k;
      EXPECT_TRUE(1 - of.cdf(up) <= p && 1 - of.cdf(up - 1) > p) << up;
    }
    double sum = of.cdf(of.below(1e-9) - 1);
    for (double k = of.below(1e-9); k <= of.above(1e-9); ++k) {
      sum += of.pmf(k);
      ASSERT_NEAR(of.cdf(k), sum, 1e-12) << k;
    }
    EXPECT_EQ(of.cdf(of.lower - 1), 0);
    EXPECT_EQ(of.pmf(of.lower - 1), 0);
  }
}

TEST(reference, hypergeometric_is_that_of_boost) {
  for (const auto& [l, s, m] : {std::array<int, 3>{50, 5, 10},
                                {50, 40, 10},
                                {1000, 134, 700},
                                {100000, 5000, 40000},
                                {100000, 95000, 60000},
                                {2000000, 1000000, 999999}}) {
    const auto unsigned_of = [](int x) { return static_cast<unsigned>(x); };
    const boost::math::hypergeometric boost_law(unsigned_of(m), unsigned_of(s), unsigned_of(l));
    const law of = laws::hypergeometric(l, s, m);
    for (const double p : {1e-12, 1e-6, 0.01, 0.3, 0.5}) {
      for (const double k : {of.below(p), of.above(p)}) {
        // Lots beyond Boost's table of primes go through products of gamma functions.
        EXPECT_NEAR(of.pmf(k) / pdf(boost_law, k), 1, l <= 104723 ? 1e-11 : 1e-8) << l << " " << k;
      }
    }
  }
}

}  // namespace
