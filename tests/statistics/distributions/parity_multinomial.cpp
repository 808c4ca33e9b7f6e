// SPDX-License-Identifier: Apache-2.0
// Multinomial counts: few trials against draw-and-count on the stream's words, many by the law of
// their categories, and what holds for both: rows sum to the trials and impossible categories stay
// empty.
#include <cmath>
#include <numeric>

#include <boost/math/distributions/binomial.hpp>
#include <boost/math/distributions/chi_squared.hpp>

#include "every_engine.hpp"
#include "support.hpp"

namespace {

using multinomial = support::on_simd_target;
using probabilities = std::vector<double>;

int draw(rvx_stream s, std::size_t n, std::int32_t* r, std::int32_t ntrial,
         const probabilities& p) {
  return rvxiRngMultinomial(0, s, static_cast<std::int64_t>(n), r, ntrial,
                            static_cast<std::int32_t>(p.size()), p.data());
}

double uniform(plain::stream& words) {
  return static_cast<std::int32_t>(words.next()) * 0x1p-32 + 0.5;
}

// The category whose part of [0, 1) holds the next number.
std::size_t category(plain::stream& words, const probabilities& p) {
  const double u = uniform(words);
  long double reached = 0;
  for (std::size_t j = 0;; ++j) {
    reached += p[j];
    if (u < static_cast<double>(reached) || j + 1 == p.size())
      return j;
  }
}

// Whole multiples of 2^-40, so that every sum is exact.
probabilities binary_law(std::size_t categories, std::uint64_t seed) {
  support::test_data data(seed);
  constexpr std::size_t whole = std::size_t{1} << 40;
  std::vector<std::size_t> cuts{0, whole};
  while (cuts.size() < categories + 1)
    cuts.push_back(data.below(whole));
  std::sort(cuts.begin(), cuts.end());
  probabilities p;
  for (std::size_t j = 0; j < categories; ++j)
    p.push_back(std::ldexp(static_cast<double>(cuts[j + 1] - cuts[j]), -40));
  return p;
}

TEST_F(multinomial, few_trials_are_drawn_and_counted) {
  for (const std::size_t k : {2u, 3u, 10u, 257u, 5000u})
    for (const std::int32_t ntrial : {1, 2, 16, 17, 399}) {
      const probabilities p = binary_law(k, k + static_cast<std::size_t>(ntrial));
      constexpr std::size_t n = 30;
      support::stream s(4);
      plain::stream words = s.position();
      support::results<std::int32_t> r(n * k);
      ASSERT_EQ(draw(s, n, r.data(), ntrial, p), 0);
      for (std::size_t row = 0; row < n; ++row) {
        std::vector<std::int32_t> expected(k, 0);
        for (std::int32_t t = 0; t < ntrial; ++t)
          ++expected[category(words, p)];
        for (std::size_t j = 0; j < k; ++j)
          ASSERT_EQ(r[row * k + j], expected[j]) << ntrial << " trials of " << k;
      }
      EXPECT_TRUE(r.guards_intact());
      EXPECT_TRUE(support::same_position(s, words)) << "a word for each trial";
    }
}

void check_rows(const support::results<std::int32_t>& r, std::size_t n, std::int32_t ntrial,
                const probabilities& p) {
  for (std::size_t row = 0; row < n; ++row) {
    std::int64_t sum = 0;
    for (std::size_t j = 0; j < p.size(); ++j) {
      const std::int32_t count = r[row * p.size() + j];
      ASSERT_GE(count, 0);
      if (p[j] == 0) {
        ASSERT_EQ(count, 0);
      }
      sum += count;
    }
    ASSERT_EQ(sum, ntrial);
  }
  EXPECT_TRUE(r.guards_intact());
}

TEST_F(multinomial, rows_sum_to_the_trials_and_impossible_categories_stay_empty) {
  const probabilities laws[] = {{1, 0},
                                {0, 1},
                                {0, 0, 1, 0},
                                {0.5, 0, 0.5, 0, 0},
                                {0, 1e-300, 1, 0},
                                {1, 1e-17, 0},
                                {0.1, 0.1, 0.1, 0.1, 0.1, 0.1, 0.1, 0.1, 0.1, 0.1},
                                {1.0 / 3, 1.0 / 3, 1.0 / 3},
                                {1e-9, 1 - 1e-9}};
  for (const probabilities& p : laws)
    for (const std::int32_t ntrial : {1, 2, 100, 399, 800, 10000, 1000000, 2147483647}) {
      // Trials beyond 200 for each category go by binomials.
      constexpr std::size_t n = 50;
      support::stream s(8);
      support::results<std::int32_t> r(n * p.size());
      ASSERT_EQ(draw(s, n, r.data(), ntrial, p), 0);
      ASSERT_NO_FATAL_FAILURE(check_rows(r, n, ntrial, p));
    }
  // At both ends of [0, 1).
  for (const std::uint32_t word : {0x80000000u, 0x7FFFFFFFu})
    for (const probabilities& p : laws) {
      support::stream s;
      s.set({1, 2}, plain::counter_of({word, word, word, word}, {1, 2}), 0);
      support::results<std::int32_t> r(p.size());
      ASSERT_EQ(draw(s, 1, r.data(), 4, p), 0);
      ASSERT_NO_FATAL_FAILURE(check_rows(r, 1, 4, p));
    }
}

TEST_F(multinomial, certain_outcomes_take_no_words) {
  support::stream s(8);
  const plain::stream before = s.position();
  support::results<std::int32_t> zeros(30), one(10);
  ASSERT_EQ(draw(s, 10, zeros.data(), 0, {0.2, 0.3, 0.5}), 0);
  for (std::size_t i = 0; i < 30; ++i)
    EXPECT_EQ(zeros[i], 0);
  ASSERT_EQ(draw(s, 10, one.data(), 77, {1}), 0);
  for (std::size_t i = 0; i < 10; ++i)
    EXPECT_EQ(one[i], 77);
  EXPECT_TRUE(zeros.guards_intact() && one.guards_intact());
  EXPECT_TRUE(support::same_position(s, before));
  // Runs a kernel, as each case here shall.
  ASSERT_EQ(draw(s, 10, zeros.data(), 5, {0.2, 0.3, 0.5}), 0);
}

TEST_F(multinomial, pieces_join) {
  const probabilities p = {0.2, 0.3, 0.5};
  for (const std::int32_t ntrial : {7, 600, 800, 100000}) {
    constexpr std::size_t n = 30000;
    const std::size_t rows = ntrial == 7 ? n : 300;  // the former enough for threads
    support::stream whole(6), parts(6);
    support::results<std::int32_t> a(3 * rows), b(3 * rows);
    ASSERT_EQ(draw(whole, rows, a.data(), ntrial, p), 0);
    ASSERT_EQ(draw(parts, 101, b.data(), ntrial, p), 0);
    ASSERT_EQ(draw(parts, rows - 101, b.data() + 303, ntrial, p), 0);
    EXPECT_TRUE(a == b);
    EXPECT_TRUE(support::same_position(whole, parts.position()));
  }
}

// A fixed seed. Each category alone is binomial; neighbours have the covariance -n p q.
TEST_F(multinomial, counts_have_their_law) {
  const probabilities p = {0.1, 0.25, 0.05, 0.6};
  for (const std::int32_t ntrial : {40, 900, 100000}) {
    constexpr std::size_t n = 20000;
    support::stream s(77);
    support::results<std::int32_t> r(4 * n);
    ASSERT_EQ(draw(s, n, r.data(), ntrial, p), 0);
    double covariance = 0;
    for (std::size_t j = 0; j < 4; ++j) {
      const boost::math::binomial_distribution<double> law(ntrial, p[j]);
      constexpr std::size_t classes = 16;
      std::vector<double> seen(classes, 0);
      for (std::size_t row = 0; row < n; ++row) {
        // Half of the count's own probability: the middle of its part of [0, 1].
        const double x = r[row * 4 + j];
        const double at = cdf(law, x) - pdf(law, x) / 2;
        ++seen[std::min(static_cast<std::size_t>(at * classes), classes - 1)];
        if (j == 1)
          covariance += (r[row * 4] - ntrial * p[0]) * (x - ntrial * p[1]) / n;
      }
      // Probability of each class, by the same rule.
      std::vector<double> expected(classes, 0);
      const double reach = 12 * std::sqrt(ntrial * p[j]) + 20;
      for (double x = std::max(0.0, std::floor(ntrial * p[j] - reach));
           x <= std::min<double>(ntrial, ntrial * p[j] + reach); ++x)
        expected[std::min(static_cast<std::size_t>((cdf(law, x) - pdf(law, x) / 2) * classes),
                          classes - 1)] += n * pdf(law, x);
      double statistic = 0, used = 0;
      for (std::size_t i = 0; i < classes; ++i) {
        if (expected[i] < 5)
          continue;
        statistic += (seen[i] - expected[i]) * (seen[i] - expected[i]) / expected[i];
        ++used;
      }
      ASSERT_GT(used, 2);
      const boost::math::chi_squared_distribution<double> reference(used - 1);
      EXPECT_GT(cdf(complement(reference, statistic)), 1e-4) << ntrial << " trials, " << j;
    }
    // Deviation of the estimate below sqrt(2 / n) of the product of the deviations: six of them.
    const double product = ntrial * std::sqrt(p[0] * (1 - p[0]) * p[1] * (1 - p[1]));
    EXPECT_NEAR(covariance, -ntrial * p[0] * p[1], 6 * product * std::sqrt(2.0 / n));
  }
}

}  // namespace
