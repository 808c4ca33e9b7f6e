// SPDX-License-Identifier: Apache-2.0
// Poisson by rejection against a plain model of algorithm PTPE that works word by word and compares
// with factorials in long double. The model also checks what the algorithm rests on: the triangle
// lies below the law and the hat above it.
#include <cmath>

#include <boost/math/distributions/chi_squared.hpp>
#include <boost/math/distributions/poisson.hpp>

#include "every_engine.hpp"
#include "support.hpp"

namespace {

using ptpe = support::on_simd_target;
using wide = long double;

constexpr std::int32_t greatest = 2147483647;

// The next uniform number of philox.
double uniform(plain::stream& words) {
  return static_cast<std::int32_t>(words.next()) * 0x1p-32 + 0.5;
}

struct model {
  double mu, m, p1, p2, p3, p4, xm, xl, xr, c, cl, ll, lr;

  explicit model(double rate) : mu(rate), m(std::floor(rate)) {
    p1 = std::floor(2.195 * std::sqrt(m) - 2.2) + 0.5;
    c = 0.133 + 8.56 / (6.83 + m);
    cl = 0.109 + 8.25 / (10.86 + m);
    xm = m + 0.5;
    xl = xm - p1;
    xr = xm + p1;
    double a = (mu - xl) / mu;
    ll = a * (1 + a / 2);
    a = (xr - mu) / xr;
    lr = a * (1 + a / 2);
    p2 = p1 * (1 + 2 * c);
    p3 = p2 + cl / ll;
    p4 = p3 + c / lr;
  }

  // ln f(y) / f(m)
  wide log_ratio(wide y) const {
    return (y - m) * std::log(static_cast<wide>(mu)) - std::lgamma(y + 1) +
           std::lgamma(static_cast<wide>(m) + 1);
  }

  std::int32_t next(plain::stream& words) const {
    for (;;) {
      const double u = uniform(words) * p4;
      double v = uniform(words);
      double y;
      if (u <= p1)
        return deliver(std::floor(xm - p1 * v + u));
      if (u <= p2) {
        const double x = xl + (u - p1) / c;
        v = v * c + 1 - std::fabs(xm - x) / p1;
        if (v > 1)
          continue;
        y = std::floor(x);
      } else if (u <= p3) {
        y = std::floor(xl + std::log(v) / ll);
        v = v * (u - p2) * ll;
      } else {
        y = std::floor(xr - std::log(v) / lr);
        v = v * (u - p3) * lr;
      }
      if (y >= 0 && v > 0 && std::log(static_cast<wide>(v)) <= log_ratio(y))
        return deliver(y);
    }
  }

  static std::int32_t deliver(double y) {
    return y < greatest ? static_cast<std::int32_t>(y) : greatest;
  }

  // The height of the hat over x, and of the triangle below the law.
  double hat(double x) const {
    if (x < xl)
      return cl * std::exp(ll * (x - xl));
    if (x > xr)
      return c * std::exp(-lr * (x - xr));
    return std::min(1.0, triangle(x) + c);
  }
  double triangle(double x) const { return std::max(0.0, 1 - std::fabs(x - xm) / p1); }
};

const double rates[] = {32, 32.7, 33, 47.3, 99.99, 100, 500, 1234.5, 1e4, 1e6 + 0.25};

TEST_F(ptpe, values_and_words_are_the_models) {
  for (const double rate : rates) {
    const model expected(rate);
    for (const std::size_t n : {1u, 2u, 3u, 17u, 255u, 256u, 511u, 512u, 513u, 30000u}) {
      support::stream s;
      s.set({1, static_cast<std::uint32_t>(n)}, 99, 0);
      plain::stream words = s.position();
      support::results<std::int32_t> r(n);
      ASSERT_EQ(rvxiRngPoisson(RVX_RNG_METHOD_POISSON_PTPE, s, static_cast<std::int64_t>(n),
                               r.data(), rate),
                0);
      for (std::size_t i = 0; i < n; ++i)
        ASSERT_EQ(r[i], expected.next(words)) << "value " << i << " of rate " << rate;
      ASSERT_TRUE(r.guards_intact());
      ASSERT_TRUE(support::same_position(s, words)) << "two words a candidate";
    }
  }
}

TEST_F(ptpe, the_hat_lies_above_the_law_and_the_triangle_below) {
  std::size_t checked = 0;
  for (double rate = 32; rate < 1e6; rate *= 1.07) {
    const model at(rate);
    const double reach = 12 * std::sqrt(rate);
    const double step = std::max(1.0, std::floor(reach / 300));
    for (double y = std::max(0.0, std::floor(rate - reach)); y < rate + reach; y += step) {
      const auto ratio = static_cast<double>(std::exp(at.log_ratio(y)));
      for (const double x : {y, y + 0.5, y + 0.999}) {
        ASSERT_GE(at.hat(x), ratio * (1 - 1e-12)) << x << " of rate " << rate;
        ASSERT_LE(at.triangle(x), ratio * (1 + 1e-12)) << x << " of rate " << rate;
        ++checked;
      }
    }
  }
  EXPECT_GT(checked, 50000u);
  // Runs a kernel, as each case here shall.
  support::stream s;
  std::int32_t one = 0;
  EXPECT_EQ(rvxiRngPoisson(0, s, 1, &one, 500), 0);
}

TEST_F(ptpe, pieces_join) {
  for (const double rate : {40.5, 3000.0}) {
    support::stream whole(5), parts(5);
    constexpr std::size_t n = 3000;
    support::results<std::int32_t> a(n), b(n);
    ASSERT_EQ(rvxiRngPoisson(0, whole, n, a.data(), rate), 0);
    std::size_t done = 0;
    for (const std::size_t count : {1u, 7u, 600u, 255u, 257u, 1024u, 856u}) {
      ASSERT_EQ(rvxiRngPoisson(0, parts, static_cast<std::int64_t>(count), b.data() + done, rate),
                0);
      done += count;
    }
    ASSERT_EQ(done, n);
    EXPECT_TRUE(a == b);
    EXPECT_TRUE(support::same_position(whole, parts.position()));
  }
}

// Words of zeros, ones and single bits: finite, in range, and the end is reached.
TEST_F(ptpe, extreme_words) {
  support::stream s;
  for (const double rate : {32.0, 500.0, 2147483647.0, 1e300})
    for (const std::uint32_t u : {0u, 0x80000000u, 0x7FFFFFFFu, 0xFFFFFFFFu, 0x7FFFFFFEu})
      for (const std::uint32_t v : {0u, 0x80000000u, 0x7FFFFFFFu, 0x80000001u}) {
        s.set({3, 4}, plain::counter_of({u, v, u, v}, {3, 4}), 0);
        plain::stream words = s.position();
        std::int32_t one = -1;
        ASSERT_EQ(rvxiRngPoisson(0, s, 1, &one, rate), 0);
        EXPECT_GE(one, 0);
        if (rate <= 500) {
          EXPECT_EQ(one, model(rate).next(words)) << u << ' ' << v << " of rate " << rate;
          EXPECT_TRUE(support::same_position(s, words));
        }
      }
  std::int32_t many[100];
  ASSERT_EQ(rvxiRngPoisson(0, s, 100, many, 1e300), 0);
  for (const std::int32_t x : many)
    EXPECT_EQ(x, greatest);
}

// A fixed seed: the statistic either passes for good or tells of a change.
TEST_F(ptpe, chi_square) {
  for (const double rate : {32.0, 77.7, 500.0}) {
    constexpr std::size_t n = 400000;
    support::stream s(2026);
    std::vector<std::int32_t> r(n);
    ASSERT_EQ(rvxiRngPoisson(0, s, n, r.data(), rate), 0);
    const boost::math::poisson_distribution<double> law(rate);
    const auto first = static_cast<std::int32_t>(rate - 3 * std::sqrt(rate));
    const auto last = static_cast<std::int32_t>(rate + 3 * std::sqrt(rate));
    // One class below, one for each value, one above.
    std::vector<double> seen(static_cast<std::size_t>(last - first + 3), 0);
    for (const std::int32_t x : r)
      ++seen[static_cast<std::size_t>(std::clamp(x, first - 1, last + 1) - (first - 1))];
    double statistic = 0;
    for (std::size_t i = 0; i < seen.size(); ++i) {
      const double y = first - 1 + static_cast<double>(i);
      const double p = i == 0                 ? cdf(law, first - 1)
                       : i + 1 == seen.size() ? cdf(complement(law, last))
                                              : pdf(law, y);
      statistic += (seen[i] - n * p) * (seen[i] - n * p) / (n * p);
    }
    const boost::math::chi_squared_distribution<double> reference(
        static_cast<double>(seen.size() - 1));
    EXPECT_GT(cdf(complement(reference, statistic)), 1e-4) << rate;
    EXPECT_GT(cdf(reference, statistic), 1e-4) << rate;
  }
}

}  // namespace
