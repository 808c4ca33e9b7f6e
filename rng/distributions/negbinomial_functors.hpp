// SPDX-License-Identifier: Apache-2.0
// Kernel functors of negative_binomial: inversion of a table, and candidates from under a hat of
// five pieces with squeezes, in the manner of V. Kachitvichyanukul and B. W. Schmeiser (Binomial
// random variate generation, Comm. ACM 31, 1988). All heights are relative to the law at its mode.
//
// Some steps are not what a textbook has, and are kept because results depend on them: they are
// marked so.
#pragma once

#include <cstdint>
#include <limits>

#include <sycl/sycl.hpp>

#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"
#include "distributions/uniform.hpp"

namespace kestrel::tarn::service {

/// The hat of a law, its squeezes and the law next to its mode.
struct _nbar_params {
  double a;
  double p;
  double m;                                  // mode
  double P[5];                               // sums of the areas of the pieces, over the total
  double down[64];                           // the law at m - 1, m - 2, ...
  double up[64];                             // and at m + 1, m + 2, ...
  double tm;                                 // logarithm of the law at m
  double r0s, r0o;                           // centre: from a uniform to a place
  double sr, or_;                            // squeeze right of the mode; `or` is a token of C++
  double sl, ol;                             // squeeze left of it
  double b1s, b1o, b1c, b1d, b1f, b1g, b1h;  // right slope: root, place, height, squeeze
  double b2s, b2o, b2c, b2d, b2f, b2g, b2h;  // left slope
  double e1s, e1o, e1w;                      // right tail: place, height
  double e2s, e2o, e2w;                      // left tail
};
static_assert(sizeof(_nbar_params) == 1304);

}  // namespace kestrel::tarn::service

namespace kestrel::tarn::rng::detail::gpu {

namespace negative_binomial_algorithm {
struct nbar {};
struct icdf {};
}  // namespace negative_binomial_algorithm

/// Logarithm of the law at y > 0, up to a constant: ln((a1 + y)! / y!) + y ln(q) by Stirling's
/// formula with three terms of its series. Kept: both series have the opposite signs, and that of
/// a1 + y does not alternate; results depend on it.
SYCL_EXTERNAL inline double nbar_log_law(double y, double a1, double q) {
  constexpr double k1 = 0.083333333333333329;    // 1/12
  constexpr double k2 = 0.0027777777777777779;   // 1/360
  constexpr double k3 = 0.00079365079365079365;  // 1/1260
  const double i = 1 / y;
  const double j = 1 / (a1 + y);
  const double minus_i2 = -i * i;
  const double j2 = j * j;
  return (y + 0.5) * sycl::log(a1 * q * i + q) + a1 * sycl::log(a1 + y) +
         ((minus_i2 * k3 + k2) * minus_i2 + k1) * i - ((j2 * k3 + k2) * j2 + k1) * j;
}

namespace functors {

template <typename Algorithm>
struct negative_binomial;

/// A candidate from two uniforms: the first chooses a piece of the hat and a place in it, the
/// second a height, or the place in a tail.
template <>
struct negative_binomial<negative_binomial_algorithm::nbar> {
  using source = double;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 2;
  static constexpr int pair_results = 1;
  static constexpr std::int32_t rejected = -1;

  double r0;
  double r1;
  const service::_nbar_params* params;
  double a1;  // a - 1
  double q;   // 1 - p

  real_range<double> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<std::int32_t, results> operator()(const sycl::vec<double, 4>& u) const {
    return pairs_of<std::int32_t>(*this, u);
  }

  SYCL_EXTERNAL void pair(double u, double w, std::int32_t* out) const { *out = candidate(u, w); }

 private:
  SYCL_EXTERNAL std::int32_t candidate(double u, double w) const {
    const double* sums = params->P;
    if (u <= sums[0]) {
      return from_centre(u, w);
    }
    if (u <= sums[1]) {
      return from_right_slope(u, w);
    }
    if (u <= sums[2]) {
      return from_left_slope(u, w);
    }
    return u <= sums[3] ? from_right_tail(u, w) : from_left_tail(u, w);
  }

  SYCL_EXTERNAL std::int32_t from_centre(double u, double w) const {
    const service::_nbar_params& hat = *params;
    const double x = sycl::mad(hat.r0s, u, hat.r0o);
    const double y = sycl::floor(x);
    if (x > hat.m + 0.5) {
      return w > sycl::mad(x, hat.sr, hat.or_) ? tested_right(y, w) : count(y);
    }
    return w > sycl::mad(x, hat.sl, hat.ol) ? tested_left(y, w) : count(y);
  }

  SYCL_EXTERNAL std::int32_t from_right_slope(double u, double w) const {
    const service::_nbar_params& hat = *params;
    const double root = sycl::sqrt(sycl::mad(hat.b1s, u, hat.b1o));
    const double x = sycl::mad(-hat.b1d, root, hat.b1c);
    const double height = w * hat.b1f * root;
    const double y = sycl::floor(x);
    return height > sycl::mad(x, hat.b1g, hat.b1h) ? tested_right(y, height) : count(y);
  }

  SYCL_EXTERNAL std::int32_t from_left_slope(double u, double w) const {
    const service::_nbar_params& hat = *params;
    const double root = sycl::sqrt(sycl::mad(hat.b2s, u, hat.b2o));
    const double x = sycl::mad(-hat.b2d, root, hat.b2c);
    const double height = w * hat.b2f * root;
    const double y = sycl::floor(x);
    return height > sycl::mad(x, hat.b2g, hat.b2h) ? tested_left(y, height) : count(y);
  }

  SYCL_EXTERNAL std::int32_t from_right_tail(double u, double w) const {
    const service::_nbar_params& hat = *params;
    const double x = sycl::mad(hat.e1s, guarded_log(w), hat.e1o);
    return tested_right(sycl::floor(x), (u - hat.P[2]) * w * hat.e1w);
  }

  SYCL_EXTERNAL std::int32_t from_left_tail(double u, double w) const {
    const service::_nbar_params& hat = *params;
    const double x = sycl::mad(hat.e2s, guarded_log(w), hat.e2o);
    const double y = sycl::floor(x);
    return y >= 0 ? tested_left(y, (u - hat.P[3]) * w * hat.e2w) : rejected;
  }

  /// y, if the height w at it is not above the law.
  SYCL_EXTERNAL std::int32_t tested_right(double y, double w) const {
    if (y <= params->m + 64) {
      return params->up[place(y - params->m)] < w ? rejected : count(y);
    }
    return is_above_law(y, w) ? rejected : count(y);
  }

  /// The same on the left. Below 150 the law is walked to from the end of the table.
  SYCL_EXTERNAL std::int32_t tested_left(double y, double w) const {
    if (y >= params->m - 64) {
      return params->down[place(params->m - y)] < w ? rejected : count(y);
    }
    return (y < 150 ? walk_ends_below(y, w) : is_above_law(y, w)) ? rejected : count(y);
  }

  /// The entry for a distance from the mode, at most 64. Kept: the mode itself reads the last one;
  /// results depend on it.
  SYCL_EXTERNAL static std::int32_t place(double distance) {
    return (floor_to_integer<std::int32_t>(sycl::trunc(distance)) + 63) & 63;
  }

  /// Kept: the factor has w in its denominator, and a1 where the law has q; the walk is given up
  /// when it falls below q, where the law is compared with w. Results depend on it: in every law
  /// that has a hat a1 is above 1 / q, so that the first step ends the walk.
  SYCL_EXTERNAL bool walk_ends_below(double y, double w) const {
    double g = params->down[63];
    for (double j = params->m - 64; j > y; j -= 1) {
      g = g * (j / ((j + w) * a1));
      if (g < q) {
        return true;
      }
    }
    return false;
  }

  SYCL_EXTERNAL bool is_above_law(double y, double w) const {
    return guarded_log(w) > nbar_log_law(y, a1, q) - params->tm;
  }

  /// y as a result, and the ceiling of results for what is above it. What is no number is the least
  /// integer, which counts as rejected.
  SYCL_EXTERNAL static std::int32_t count(double y) {
    constexpr std::int32_t ceiling = 2147483520;
    return y > ceiling ? ceiling : floor_to_integer<std::int32_t>(y);
  }
};

/// Candidates are results.
struct negative_binomial_post {
  SYCL_EXTERNAL std::int32_t operator()(std::int32_t y) const { return y; }
};

/// The first count whose sum of probabilities is above a uniform.
template <>
struct negative_binomial<negative_binomial_algorithm::icdf> {
  using source = double;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  double r0;
  double r1;
  const double* cdf;
  double a;
  double p;
  double q;           // 1 - p
  std::int32_t size;  // of the table, 128 or more

  real_range<double> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<std::int32_t, results> operator()(const sycl::vec<double, 4>& u) const {
    return each_of<std::int32_t>(*this, u);
  }

  SYCL_EXTERNAL std::int32_t one(double u) const {
    for (std::int32_t k = 0; k < size; ++k) {
      if (u < cdf[k]) {
        return k;
      }
    }
    const std::int32_t last = size - 1;
    const std::int32_t k = behind_table(u, last, cdf[last] - cdf[last - 1], cdf[last]);
    return k > last ? k : last_in_sums(cdf, last);
  }

  /// The same behind count k, which has the probability `term`, with `sum` up to it. The mode is in
  /// the table, so that terms fall: when one no longer moves the sum, none will, and the walk ends
  /// with the one before. Where it would leave the type, it ends at the greatest integer.
  SYCL_EXTERNAL std::int32_t behind_table(double u, std::int32_t k, double term, double sum) const {
    double f = k;
    double before;
    do {
      ++k;
      term *= q * (f + a);
      f += 1;
      term /= f;
      before = sum;
      sum += term;
    } while (u >= sum && sum != before && k < std::numeric_limits<std::int32_t>::max());
    return u >= sum && sum == before ? k - 1 : k;
  }
};

}  // namespace functors
}  // namespace kestrel::tarn::rng::detail::gpu
