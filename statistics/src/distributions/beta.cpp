// SPDX-License-Identifier: Apache-2.0
// Set-up of the beta methods, in long double: its range holds products of any two shapes, and
// differences of shapes close to 1 keep their digits.
#include "distributions/beta.hpp"

#include <algorithm>
#include <cmath>
#include <iterator>

namespace tarn::statistics {

namespace {

using wide = long double;

// Above this lesser shape the test of Cheng's method is a series: its plain form has an absolute
// error of some a 2^-51, here 2^-34, where a uniform of 32 bits has steps of 2^-32.
constexpr double greatest_plain = 0x1p17;

}  // namespace

// The test compares ln(u1^2 u2) with
//   a V + L - ln 4 - s ln(1 + (a / s) (e^V - 1)).
// For small V the terms with s nearly cancel: they are -s times the logarithm of the moment
// generating function of a Bernoulli variable about its mean, a series of its cumulants k_j V^j /
// j! from j = 2 on. Where it is used V is below 0.06 (|L| < 42 and lambda < 1 / sqrt(a)), and below
// 0.02 for all L that have a chance: what follows the sixth term is below 2^-34.
cheng_bb::cheng_bb(double p, double q)
    : a(std::min(p, q)), ratio(std::max(p, q) / a), first_is_a(p <= q), narrow(a > greatest_plain) {
  const wide lesser = a, greater = std::max(p, q), s = lesser + greater;
  const wide spread = std::sqrt((s - 2) / (2 * lesser * greater - s));
  const wide share = lesser / s, product = share * (greater / s), skew = (greater - lesser) / s;
  sum = static_cast<double>(s);
  part = static_cast<double>(share);
  lambda = static_cast<double>(spread);
  const wide cumulant_parts[] = {1 / 2.0L, skew / 6, (1 - 6 * product) / 24,
                                 skew * (1 - 12 * product) / 120,
                                 (1 - product * (30 - 120 * product)) / 720};
  wide power = s * product * spread * spread;  // s k_2 lambda^j
  for (std::size_t j = 0; j < std::size(cumulant_parts); ++j) {
    series[j] = static_cast<double>(cumulant_parts[j] * power);
    power *= spread;
  }
}

johnk::johnk(double p, double q)
    : greater(std::max(p, q)), first(p / greater), second(q / greater) {}

atkinson::atkinson(double first, double second)
    : p(first > 1 ? second : first),
      q(first > 1 ? first : second),
      left_bound(0),
      mirrored(first > 1) {
  const wide wp = p, wq = q;
  const bool both_below = q < 1;
  wide t, rest;
  if (both_below) {
    const wide root_p = std::sqrt(wp * (1 - wp)), root_q = std::sqrt(wq * (1 - wq));
    t = root_p / (root_p + root_q);
    rest = root_q / (root_p + root_q);
  } else {
    t = (1 - wp) / (1 - wp + wq);
    rest = wq / (1 - wp + wq);
  }
  const wide wide_log_rest = std::log1p(-t);
  log_t = static_cast<double>(std::log(t));
  log_rest = static_cast<double>(wide_log_rest);
  if (both_below)
    left_bound = log_rest;
  // The masses of both parts, up to a common factor.
  const wide below = wq * t;
  const wide above = wp * (both_below ? rest : std::exp(wq * wide_log_rest));
  left = static_cast<double>(below / (below + above));
  right = static_cast<double>(above / (below + above));
}

// Johnk's method accepts ever less as p + q grows, down to half where both shapes are 1. Up to this
// parabola it accepts more than 0.7 and is the cheaper one; beyond it Atkinson's accepts more than
// 0.84. Either is exact on both sides.
bool prefers_johnk(double p, double q) {
  return 0.8522552176537243 * p * p + q <= 0.9562409713408151;
}

}  // namespace tarn::statistics
