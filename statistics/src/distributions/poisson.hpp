// SPDX-License-Identifier: Apache-2.0
// Poisson variates by inversion, one word each: from a table for small rates, through the normal
// law above them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "blocks.hpp"
#include "distributions/guide_table.hpp"

namespace tarn::statistics {

// Rates below this one are inverted from a table of about 20 to 90 probabilities, exactly, by every
// method: above, the inverse through the normal law is close enough, and rejection is quicker.
inline constexpr double table_rates = 32;

// From this rate on all values exceed the greatest integer, with a probability that differs from 1
// by less than exp(-2^38). Larger rates are taken as this one.
inline constexpr double greatest_rate = 0x1p40;

// More than the values of such a rate that count in a double.
inline constexpr int most_small_values = 128;

// The cdf of a rate below table_rates, step by step.
class poisson_steps {
 public:
  explicit poisson_steps(double lambda);

  // P(X <= 0) at first; 1 or next to it when no further probability counts.
  double next();

 private:
  // In long double, so that the cdf is right to the last bit of double but for rare ties.
  long double lambda_, term_, sum_;
  int k_ = 0;
};

// The cdf of a rate below table_rates, for `uses` look-ups.
guide_table poisson_table(double lambda, std::size_t uses);

// Fewer numbers than this are done sooner without that table (measured).
inline constexpr std::size_t worth_poisson_table = 128;
static_assert(worth_poisson_table <= block_words);

// The same values for fewer numbers than that, from no more steps than they reach.
void poisson_by_steps(const double* u, std::size_t n, double lambda, std::int32_t* out);

// The inverse through the normal law: floor(x(z)) of the normal deviate z that belongs to the same
// probability, with Temme's uniform expansion (The asymptotic expansion of the incomplete gamma
// functions, SIAM J. Math. Anal. 10, 1979) turned round. With s = z / sqrt(lambda)
//
//   x = lambda r(s) + c0(s) + c1(s) / lambda,   r(s) = 1 + s + s^2 g(s),
//
// where r solves s^2 / 2 = 1 - r + r ln r, and c0 = ln(s sqrt(r) / (r - 1)) / ln r. g, c0 and c1
// are polynomials interpolated at the Chebyshev points of |s| <= 1.12, which holds the normal
// deviates of 32-bit words for all rates of table_rates and more. Errors there: g 1.5e-7, c0 1e-6.
struct poisson_expansion {
  static constexpr int g_terms = 11, c0_terms = 11, c1_terms = 7;
  static constexpr int terms = g_terms + 2;
  static const double g[g_terms], c0[c0_terms], c1[c1_terms];

  // x for one rate as a polynomial in e = z / sqrt(2), constant term first.
  double coefficient[terms];
  explicit poisson_expansion(double lambda);
};

// out[i] = the value of u[i], uniform on [-1, 1).
void poisson_by_normal(const double* u, std::size_t n, const poisson_expansion& x,
                       std::int32_t* out);

// The same values for many numbers. Cells of [-1, 1) that lie between two steps tell them at once,
// where that pays.
class poisson_quantiles {
 public:
  poisson_quantiles(double lambda, std::size_t uses);

  // For at most block_words numbers.
  void operator()(const double* u, std::size_t n, std::int32_t* out) const;

 private:
  poisson_expansion x_;
  std::vector<std::int32_t> guides_;  // the value of a cell, or -1; empty where they do not pay
};

// The value of u[i] for a rate lambda[i] of its own; rates below table_rates add up their
// probabilities.
void poisson_v_by_normal(const double* u, std::size_t n, const double* lambda, std::int32_t* out);

}  // namespace tarn::statistics
