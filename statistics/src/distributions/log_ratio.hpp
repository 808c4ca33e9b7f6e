// SPDX-License-Identifier: Apache-2.0
// Ratios of probabilities of the laws made of factorials (binomial, hypergeometric, negative
// binomial), accurate for arguments of any size: what the last test of a rejection compares with.
//
// With R(x, c) = ln x! - ln c! - (x - c) ln c, the logarithm of P(y) / P(reference) is a sum of
// terms -+R(c +- k, c) and of k times a constant, k = y - reference; all large parts of the
// factorials have cancelled (after Loader: Fast and accurate computation of binomial probabilities,
// 2000).
//
// Error: R is a deviance, x ln(x / c) + c - x, which comes out within some 8 units of 2^-53 of
// itself, and a difference of remainders ln x! - x ln x + x, within a few units of 2^-49 each (of
// 2^-47 below 16). The deviances of a law have one sign and the slope is rounded once, so that a
// logarithm above -45 is within 2^-40 (9e-13) of the exact one, and one above -1 within 2^-43, for
// all parameters; below -45 nothing is accepted. unit_statistics_log_ratio holds it.
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
  double shift;    // ln of P(reference) relative to the value that ratios refer to
  double gap = 0;  // of the factorials of add_quotient
  std::size_t terms = 0;
  factorial_term term[most_terms];

  void add(double sign, double direction, double center);
  // (y + gap)! / y!, gap > 0: the two would lose the digits that their deviances have in common.
  void add_quotient(double gap);
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
