// SPDX-License-Identifier: Apache-2.0
// Ratios of probabilities of the laws made of factorials (binomial, hypergeometric, negative
// binomial), accurate for arguments of any size: what the last test of a rejection compares with.
//
// With R(x, c) = ln x! - ln c! - (x - c) ln c, the logarithm of P(y) / P(reference) is a sum of
// terms -+R(c +- k, c) and of k times a constant, k = y - reference; all large parts of the
// factorials have cancelled (after Loader: Fast and accurate computation of binomial probabilities,
// 2000).
#pragma once

#include <cstddef>

namespace tarn::statistics {

// The factorial of center + direction * k, in the numerator (sign 1) or the denominator (-1).
struct factorial_term {
  double sign, direction;  // 1 or -1 each
  double center;
  double remainder;  // ln center! - center ln center + center
};

struct log_ratio {
  static constexpr std::size_t most_terms = 4;

  double reference;
  double slope;
  double shift;  // ln of P(reference) relative to the value that ratios refer to
  std::size_t terms = 0;
  factorial_term term[most_terms];

  void add(double sign, double direction, double center);
};

// ratios[i] = exp(log ratio of y[i]); 0 where a factorial has no argument of at least 0. The same
// bits on every SIMD target, and for each y whatever stands beside it.
void ratios_of(const log_ratio& log_ratio, const double* y, std::size_t n, double* ratios);

inline double ratio_of(const log_ratio& log_ratio, double y) {
  double ratio;
  ratios_of(log_ratio, &y, 1, &ratio);
  return ratio;
}

// ln x! - x ln x + x for n numbers x >= 0.
void factorial_remainders(const double* x, std::size_t n, double* remainders);

}  // namespace tarn::statistics
