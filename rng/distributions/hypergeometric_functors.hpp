// SPDX-License-Identifier: Apache-2.0
// Kernel functors of hypergeometric: inversion of a table, and candidates by the algorithm H2PE of
// V. Kachitvichyanukul and B. W. Schmeiser (Computer generation of hypergeometric random variates,
// J. Stat. Comput. Simul. 22, 1985), from under a hat of a rectangle and two exponential tails. All
// heights are relative to the law at its mode.
//
// Both draw the count y of the rarer kind in the smaller of sample and rest: y of `n1`, with `k`
// taken, and `n2` of the other kind.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"
#include "distributions/uniform.hpp"

namespace kestrel::tarn::service {

/// The hat of H2PE and the law next to its mode. The names p1 to p3, xl and xr are those of the
/// paper.
struct _h2pe_params {
  std::int32_t lot;  // as given
  std::int32_t marked;
  std::int32_t sample;
  double p1;  // width of the rectangle; its area
  double p2;  // areas up to and with the left tail,
  double p3;  // the right tail
  double xl;  // left and right end of the rectangle
  double xr;
  double c1;  // arguments of the law's four factorials at the mode, plus 1/2
  double c2;
  double c3;
  double c4;
  double ll;  // rates of the tails
  double lr;
  double inv_ll;
  double inv_lr;
  double a;         // logarithm of the product of these factorials
  double down[64];  // the law at mode - 1, mode - 2, ...
  double up[64];    // and at mode + 1, mode + 2, ...
};
static_assert(sizeof(_h2pe_params) == 1152);

}  // namespace kestrel::tarn::service

namespace kestrel::tarn::rng::detail::gpu {

namespace hypergeometric_algorithm {
struct h2pe {};
struct icdf {};
}  // namespace hypergeometric_algorithm

/// ln(x!) for a count x: from a table up to 15, then by Stirling's formula with two terms of its
/// series, whose error is below 1 / 1260x^5 + 5e-12, the latter from ten digits of ln(2 pi) / 2.
SYCL_EXTERNAL inline double log_factorial(double x) {
  static constexpr double flLogFact[16] = {0.0,
                                           0.0,
                                           0.6931471805599453,
                                           1.791759469228055,
                                           3.1780538303479458,
                                           4.787491742782046,
                                           6.579251212010101,
                                           8.525161361065415,
                                           10.60460290274525,
                                           12.801827480081469,
                                           15.104412573075516,
                                           17.502307845873887,
                                           19.987214495661885,
                                           22.552163853123425,
                                           25.19122118273868,
                                           27.89927138384089};
  if (x <= 15) {
    return flLogFact[static_cast<std::int32_t>(sycl::fmax(x, 0.0))];
  }
  const double i = 1.0 / x;
  return (-0.0027777777777777779 * i * i + 0.083333333333333329) * i +
         (sycl::log(x) * (0.5 + x) - x + 0.91893853319999996);
}

/// ln(y! (n1 - y)! (k - y)! (y + n2_k)!), where n2_k is n2 - k. Where no factorial comes from the
/// table the four formulas are added term by term, of which the last, the sum of the counts, is
/// `lot`.
SYCL_EXTERNAL inline double log_factorials(double y, double n1, double k, double n2_k, double lot) {
  const double x[4] = {y, n1 - y, k - y, y + n2_k};
  if (!(x[0] >= 16 && x[1] >= 16 && x[2] >= 16 && x[3] >= 16)) {
    return log_factorial(x[0]) + log_factorial(x[1]) + log_factorial(x[2]) + log_factorial(x[3]);
  }
  double t = 3.6757541327999999;  // 2 ln(2 pi)
  double sum = 0;
  double sum_of_cubes = 0;
  for (int i = 0; i < 4; ++i) {
    t = sycl::fma(sycl::log(x[i]), x[i] + 0.5, t);
    const double inverse = 1.0 / x[i];
    sum += inverse;
    sum_of_cubes += inverse * inverse * inverse;
  }
  t = sycl::fma(sum, 0.083333333333333329, t);
  return t - sycl::fma(sum_of_cubes, 0.0027777777777777779, lot);
}

/// Whether the sample is the smaller part of the lot.
SYCL_EXTERNAL inline bool is_sample_smaller(std::int32_t l, std::int32_t s) {
  return 2 * std::int64_t{s} < l;
}

namespace functors {

template <typename Algorithm>
struct hypergeometric;

/// From y to the marked ones in the sample.
struct hypergeometric_post {
  std::int32_t l;
  std::int32_t m;
  std::int32_t s;
  std::int32_t n1;

  SYCL_EXTERNAL std::int32_t operator()(std::int32_t y) const {
    if (is_sample_smaller(l, s)) {
      return m > l - m ? s - y : y;
    }
    return m > l - m ? s - n1 + y : m - y;
  }
};

/// A candidate from two uniforms: the first chooses a piece of the hat and a place in it, the
/// second a height, or the place in a tail.
template <>
struct hypergeometric<hypergeometric_algorithm::h2pe> {
  using source = double;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 2;
  static constexpr int pair_results = 1;
  static constexpr std::int32_t rejected = -1;

  double a;
  double b;
  double mode;
  double n1;
  double n2;
  double k;
  double lot;
  double low;   // least value of y
  double high;  // greatest value
  std::int32_t int_mode;
  std::int32_t int_n1;
  std::int32_t int_k;
  std::int32_t n2_k;
  std::int32_t l;
  std::int32_t m;
  std::int32_t s;
  const service::_h2pe_params* params;

  real_range<double> range() const { return {a, b}; }

  SYCL_EXTERNAL sycl::vec<std::int32_t, results> operator()(const sycl::vec<double, 4>& u) const {
    return pairs_of<std::int32_t>(*this, u);
  }

  SYCL_EXTERNAL void pair(double u0, double v, std::int32_t* out) const {
    *out = candidate(u0 * params->p3, v);
  }

  /// y as a candidate, if the law at y is at least v.
  SYCL_EXTERNAL std::int32_t h2pe_acc_rej_func(double v, double y) const {
    const std::int32_t yi = floor_to_integer<std::int32_t>(sycl::trunc(y));
    const bool accepted =
        int_mode < 100 || yi < 201 ? is_under_walk(v, y, yi) : is_under_squeeze(v, y);
    return accepted ? yi : rejected;
  }

 private:
  SYCL_EXTERNAL std::int32_t candidate(double u, double v) const {
    const service::_h2pe_params& hat = *params;
    if (!(u > hat.p1)) {
      return h2pe_acc_rej_func(v, sycl::trunc(hat.xl + u));
    }
    const double lv = guarded_log(v);
    if (!(u > hat.p2)) {
      const double y = sycl::trunc(lv * hat.inv_ll + hat.xl);
      return low <= y ? h2pe_acc_rej_func(v * ((u - hat.p1) * hat.ll), y) : rejected;
    }
    const double y = sycl::trunc(-lv * hat.inv_lr + hat.xr);
    return high >= y ? h2pe_acc_rej_func(v * ((u - hat.p2) * hat.lr), y) : rejected;
  }

  SYCL_EXTERNAL bool is_under_walk(double v, double y, std::int32_t yi) const {
    if (yi == int_mode) {
      return true;
    }
    return yi < int_mode ? is_under_walk_down(v, y, std::int64_t{int_mode} - yi)
                         : is_under_walk_up(v, y, std::int64_t{yi} - int_mode);
  }

  /// By the law's running products from the end of the table on.
  SYCL_EXTERNAL bool is_under_walk_down(double v, double y, std::int64_t steps) const {
    if (steps < 65) {
      return !(params->down[steps - 1] < v);
    }
    double f = params->down[63];
    const double c = n2_k;
    for (double t = mode - 64; t > y; t -= 1.0) {
      f = f * (t * (c + t) / ((n1 - t + 1.0) * (k - t + 1.0)));
      if (f < v) {
        return false;
      }
    }
    return true;
  }

  SYCL_EXTERNAL bool is_under_walk_up(double v, double y, std::int64_t steps) const {
    if (steps < 65) {
      return !(params->up[steps - 1] < v);
    }
    double f = params->up[63];
    const double c = n2_k;
    for (double t = mode + 64; t < y;) {
      const double t1 = t + 1.0;
      f = f * ((n1 - t) * (k - t) / (t1 * (c + t + 1.0)));
      t = t1;
      if (f < v) {
        return false;
      }
    }
    return true;
  }

  /// By bounds of the logarithm of the law, and by the law itself between them. Both bounds come
  /// from ln(1 + x) for five x, one of the ratio e of neighbouring values and one for each
  /// factorial.
  SYCL_EXTERNAL bool is_under_squeeze(double v, double y) const {
    const service::_h2pe_params& hat = *params;
    const double x1 = y + 1.0;
    const double dy = y - mode;
    const double f1 = n1 + 1.0 - y;
    const double z1 = k - y + 1.0;
    const double w1 = n2_k + x1;
    const double ratios[4] = {-dy / x1, dy / f1, dy / z1, -dy / w1};
    const double weights[4] = {hat.c1, hat.c2, hat.c3, hat.c4};
    const double e = f1 * z1 / (x1 * w1) - 1.0;
    const double e2 = e * e;
    const double g1 = (e * -0.5 + (e2 * 0.33333333333333331 + 1.0)) * e;
    const double g2 = g1 - e2 * e2 * 0.25 / (e < 0 ? e + 1.0 : 1.0);
    double ub = sycl::fma(y, g1, -g2 * mode) + 0.0033999999999999998;
    for (int i = 0; i < 4; ++i) {
      const double x = ratios[i];
      const double rest = sycl::fma(sycl::fma(x, 0.33333333333333331, -0.5), x, 1.0);
      ub = sycl::fma(weights[i] * x, rest, ub);
    }
    const double lnv = guarded_log(v);
    if (lnv > ub) {
      return false;
    }
    double errors = 0;
    for (int i = 0; i < 4; ++i) {
      const double square = ratios[i] * ratios[i];
      errors += error_of(weights[i] * square * square);
    }
    const double lb = (y + mode) * (g2 - g1) + (ub - 0.25 * errors) + -0.0077999999999999996;
    return !(lnv >= lb) || !(lnv > hat.a - log_factorials(y, n1, k, n2_k, lot));
  }

  /// Kept: the weighted fourth power is itself tested and divided, where the paper takes the ratio
  /// that it is made of; so it is never below 0 and stays as it is. Results depend on it.
  SYCL_EXTERNAL static double error_of(double b) { return b < 0 ? b / (b + 1.0) : b; }
};

/// The smallest count whose sum of probabilities is above a uniform; one more than the greatest for
/// a uniform that is above all of them.
template <>
struct hypergeometric<hypergeometric_algorithm::icdf> {
  using source = double;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  double a;
  double b;
  const double* cdf;
  std::int32_t low;
  std::int32_t l;
  std::int32_t m;
  std::int32_t s;
  std::int32_t len;
  std::int32_t n1;

  real_range<double> range() const { return {a, b}; }

  SYCL_EXTERNAL sycl::vec<std::int32_t, results> operator()(const sycl::vec<double, 4>& u) const {
    return each_of<std::int32_t>(*this, u);
  }

  SYCL_EXTERNAL std::int32_t one(double u) const {
    return hypergeometric_post{l, m, s, n1}(inverse(u));
  }

 private:
  SYCL_EXTERNAL std::int32_t inverse(double u) const {
    if (u < cdf[0]) {
      return low;
    }
    std::int32_t j = 1;
    while (j < len && !(u < cdf[j])) {
      j += 1;
    }
    return j;
  }
};

}  // namespace functors
}  // namespace kestrel::tarn::rng::detail::gpu
