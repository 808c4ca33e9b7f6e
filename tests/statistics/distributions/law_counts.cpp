// SPDX-License-Identifier: Apache-2.0
// Binomial, hypergeometric and negative binomial values by Pearson's chi-square against exact
// probabilities. The seed is fixed; at another one a right program fails one of these about 50
// tests with probability 50 * 10^-5.
#include "counts.hpp"

namespace {

using counts_law = support::on_simd_target;

constexpr std::size_t values = 100000;
constexpr double least_tail = 1e-5;

TEST_F(counts_law, binomial) {
  for (const std::int32_t n : {1, 20, 60, 100, 2000, 100000})
    for (const double p : {0.3, 0.5, 0.9, 0.01}) {
      const auto draw = [&](rvx_stream s, std::int64_t count, std::int32_t* r) {
        return rvxiRngBinomial(0, s, count, r, n, p);
      };
      EXPECT_GT(counts::chi_square_tail(draw, counts::binomial(n, p), values, 1), least_tail)
          << n << ", " << p;
    }
}

TEST_F(counts_law, hypergeometric) {
  constexpr std::int32_t laws[][3] = {{10, 5, 5},        {100, 30, 50},
                                      {300, 150, 150},   {300, 220, 200},
                                      {2000, 700, 1300}, {2147483647, 2000, 1000000000}};
  for (const auto& l : laws) {
    const auto draw = [&](rvx_stream s, std::int64_t count, std::int32_t* r) {
      return rvxiRngHypergeometric(0, s, count, r, l[0], l[1], l[2]);
    };
    EXPECT_GT(counts::chi_square_tail(draw, counts::hypergeometric(l[0], l[1], l[2]), values, 2),
              least_tail)
        << l[0] << ", " << l[1] << ", " << l[2];
  }
}

TEST_F(counts_law, negative_binomial) {
  constexpr double laws[][2] = {{10, 0.4},  {0.5, 0.5},   {0.02, 0.02}, {99, 0.5},    {120, 0.5},
                                {1e4, 0.9}, {1, 0.015},   {1.5, 0.005}, {2.02, 0.01}, {2.3, 0.005},
                                {5, 0.01},  {0.5, 0.005}, {0.99, 0.01}, {0.05, 0.005}};
  for (const auto& l : laws) {
    const auto draw = [&](rvx_stream s, std::int64_t count, std::int32_t* r) {
      return rvxiRngNegbinomial(0, s, count, r, l[0], l[1]);
    };
    EXPECT_GT(counts::chi_square_tail(draw, counts::negative_binomial(l[0], l[1]), values, 3),
              least_tail)
        << l[0] << ", " << l[1];
  }
}

}  // namespace
