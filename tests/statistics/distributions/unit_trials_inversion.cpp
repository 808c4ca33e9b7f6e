// SPDX-License-Identifier: Apache-2.0
// Bernoulli and geometric variates, word by word, against their laws in 100 digits and more.
#include <cmath>

#include <boost/multiprecision/cpp_bin_float.hpp>

#include "distributions/scripted_words.hpp"
#include "every_engine.hpp"

namespace {

using trials_law = support::on_simd_target;
using real = boost::multiprecision::cpp_bin_float_100;
// Products of 40 doubles are exact.
using exact = boost::multiprecision::number<
    boost::multiprecision::cpp_bin_float<2300, boost::multiprecision::digit_base_2>>;

constexpr std::int32_t greatest = 2147483647;

support::routine bernoulli(double p) {
  return [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
    return rvxiRngBernoulli(0, s, n, r, p);
  };
}
support::routine geometric(double p) {
  return [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
    return rvxiRngGeometric(0, s, n, r, p);
  };
}

// 1 where i / 2^32 < p.
TEST_F(trials_law, bernoulli_counts_the_numbers_below_p) {
  for (const double p : {0.0, 5e-324, 0x1p-32, 0x1.8p-32, 0x1p-31, 1e-6, 0.1, 1.0 / 3, 0.5, 0.75,
                         0.999999, 1 - 0x1p-32, 1 - 0x1p-33, std::nextafter(1.0, 0.0), 1.0}) {
    const auto ones = static_cast<std::uint64_t>(ceil(real(p) * support::word_count));
    support::scripted at(bernoulli(p));
    for (const std::uint64_t i : {std::uint64_t{0}, std::uint64_t{1}, ones / 2, ones - 1, ones,
                                  ones + 1, support::word_count - 1}) {
      if (i < support::word_count) {
        EXPECT_EQ(at.value(i), i < ones) << i << " of " << p;
      }
    }
  }
}

// At least k where i / 2^32 <= (1 - p)^k.
TEST_F(trials_law, geometric_values_begin_where_the_powers_are) {
  std::size_t ties = 0;
  for (const double p : {0.5, 0.25, 0.75, 0.875, 0.3, 0.9, 0.999, 1 - 0x1p-20, 1 - 0x1p-40, 0.01,
                         1e-3, 1e-5, 1e-7, 3e-9, 1e-9}) {
    const real log_q = log1p(-real(p));
    support::scripted at(geometric(p));
    const auto most = static_cast<double>(-22.2 / log_q);  // 2^-32 lies there
    support::test_data data(17);
    for (int round = 0; round < 400; ++round) {
      const double k =
          round < 40 ? round + 1
                     : std::floor(most * static_cast<double>(data.below(1u << 20)) / (1u << 20));
      // Beyond 40 no power is a number of 32 bits, which the last digit of exp would decide.
      if (k < 1 || (round >= 40 && k <= 40) || k > std::min(most, 2147483646.0))
        continue;
      std::uint64_t last;
      if (round < 40) {
        exact scaled = support::word_count;
        for (int factor = 0; factor < static_cast<int>(k); ++factor)
          scaled *= 1 - exact(p);
        last = static_cast<std::uint64_t>(floor(scaled));
        ties += scaled == floor(scaled);
      } else {
        last = static_cast<std::uint64_t>(floor(exp(real(k) * log_q) * support::word_count));
      }
      if (last == 0 || last + 1 >= support::word_count)
        continue;
      ASSERT_GE(at.value(last), k) << p;
      ASSERT_LT(at.value(last + 1), k) << p;
    }
    EXPECT_EQ(at.value(support::word_count - 1),
              static_cast<std::int32_t>(floor(log1p(-real(0x1p-32)) / log_q)));
  }
  EXPECT_GT(ties, 30u) << "no power falls on a number";
}

TEST_F(trials_law, geometric_at_the_ends) {
  // u = 0 counts as exp(-744.44...).
  EXPECT_EQ(support::scripted(geometric(0.5)).value(0),
            static_cast<std::int32_t>(744.44007192138122 / std::log(2.0)));
  for (const std::uint64_t i :
       {std::uint64_t{0}, std::uint64_t{1}, support::word_count / 2, support::word_count - 1}) {
    EXPECT_EQ(support::scripted(geometric(1)).value(i), 0);
    if (i != support::word_count - 1) {
      EXPECT_EQ(support::scripted(geometric(1e-12)).value(i), greatest);
    }
    for (const double p : {1e-30, 1e-300, 5e-324})
      EXPECT_EQ(support::scripted(geometric(p)).value(i), greatest) << p << " at " << i;
  }
  // The last value that fits, and the first that does not: u = 2^-32 has 32 ln 2 / p.
  const double fits = 32 * std::log(2.0) / 2147483000.0;
  EXPECT_NEAR(support::scripted(geometric(fits)).value(1), 32 * std::log(2.0) / -std::log1p(-fits),
              1);
  EXPECT_EQ(support::scripted(geometric(fits * 0.999)).value(1), greatest);
}

class certain_outcomes : public trials_law,
                         public testing::WithParamInterface<support::engine_case> {};

// Words of some engines become 1.0 or 0.0 exactly.
TEST_P(certain_outcomes, of_every_engine) {
  constexpr std::size_t n = 5000;
  support::any_stream s = GetParam().make();
  support::results<std::int32_t> r(n);
  ASSERT_EQ(rvxiRngBernoulli(0, s, n, r.data(), 1), 0);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(r[i], 1);
  ASSERT_EQ(rvxiRngBernoulli(0, s, n, r.data(), 0), 0);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(r[i], 0);
  ASSERT_EQ(rvxiRngGeometric(0, s, n, r.data(), 1), 0);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(r[i], 0);
  EXPECT_TRUE(r.guards_intact());
}

INSTANTIATE_TEST_SUITE_P(each, certain_outcomes, testing::ValuesIn(support::every_engine()),
                         support::engine_name<support::engine_case>);

}  // namespace
