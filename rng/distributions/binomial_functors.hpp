// SPDX-License-Identifier: Apache-2.0
// Kernel functors of binomial: inversion of a table, and candidates by the algorithm BTPE of
// V. Kachitvichyanukul and B. W. Schmeiser (Binomial random variate generation, Comm. ACM 31,
// 1988), from under a hat of a triangle, a parallelogram and two exponential tails. All heights are
// relative to the law at its mode, and the names are those of the paper.
//
// Some steps are not what a textbook has, and are kept because results depend on them: they are
// marked so.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"
#include "distributions/uniform.hpp"

namespace kestrel::tarn::service {

/// The table of a law with a mean below 30. `r` is the smaller of p and 1 - p, `q` the other one.
struct _bcdf_params {
  double n;        // trials
  double p;        // as given
  double a;        // (n + 1) s
  double s;        // r / q
  double cdf[64];  // sums of the probabilities of 0, 1, ... at probability r
};
static_assert(sizeof(_bcdf_params) == 544);

/// The hat of BTPE and the law next to its mode.
struct _btpe_params {
  double n;    // trials
  double p;    // as given
  double npq;  // variance
  double fm;   // mean + p
  double m;    // mode
  double p1;   // half the width of the triangle; its area
  double p2;   // areas up to and with the parallelogram,
  double p3;   // the left tail,
  double p4;   // the right tail
  double xm;   // middle, left and right end of the triangle
  double xl;
  double xr;
  double ll;  // rates of the tails
  double lr;
  double inv_ll;
  double inv_lr;
  double c;  // height of the parallelogram
  double inv_c;
  double inv_p1;
  double inv_npq;
  double s;         // p / q
  double down[32];  // the law at m - 1, m - 2, ...
  double up[32];    // and at m + 1, m + 2, ...
};
static_assert(sizeof(_btpe_params) == 680);

}  // namespace kestrel::tarn::service

namespace kestrel::tarn::rng::detail::gpu {

namespace binomial_algorithm {
struct btpe {};
struct icdf {};
}  // namespace binomial_algorithm

/// sum + 1 / 12x - 1 / 360x^3 + ..., Stirling's series of a logarithm of a factorial to five terms.
SYCL_EXTERNAL inline double add_stirling_series(double sum, double x) {
  const double i = 1 / x;
  const double h = i * i;
  double e = sycl::fma(h, -0.00084175084175084171, 0.00059523809523809529);  // 1/1188, 1/1680
  e = sycl::fma(-e, h, 0.00079365079365079365);                              // 1/1260
  e = sycl::fma(-e, h, 0.0027777777777777779);                               // 1/360
  e = sycl::fma(-e, h, 0.083333333333333329);                                // 1/12
  return sycl::fma(e, i, sum);
}

namespace functors {

template <typename Algorithm>
struct binomial;

/// A candidate from two uniforms: the first chooses a region and a place in it, the second a
/// height, or the place in a tail. Candidates of the triangle are accepted untested.
template <>
struct binomial<binomial_algorithm::btpe> {
  using source = double;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 2;
  static constexpr int pair_results = 1;
  static constexpr std::int32_t rejected = -1;

  double a;
  double b;
  const service::_btpe_params* params;
  std::int32_t ntrial;

  real_range<double> range() const { return {a, b}; }

  SYCL_EXTERNAL sycl::vec<std::int32_t, results> operator()(const sycl::vec<double, 4>& u) const {
    return pairs_of<std::int32_t>(*this, u);
  }

  SYCL_EXTERNAL void pair(double u0, double v, std::int32_t* out) const {
    *out = candidate(u0 * params->p4, v);
  }

 private:
  SYCL_EXTERNAL std::int32_t candidate(double u, double v) const {
    const service::_btpe_params& hat = *params;
    if (u < hat.p1) {
      return count(sycl::fma(-hat.p1, v, hat.xm) + u);
    }
    if (u > hat.p2) {
      return u > hat.p3 ? from_right_tail(u, v) : from_left_tail(u, v);
    }
    return from_parallelogram(u, v);
  }

  SYCL_EXTERNAL std::int32_t from_right_tail(double u, double v) const {
    const service::_btpe_params& hat = *params;
    const double y = sycl::trunc(hat.xr - guarded_log(v) * hat.inv_lr);
    return ntrial < y ? rejected : tested(y, v * ((u - hat.p3) * hat.lr));
  }

  SYCL_EXTERNAL std::int32_t from_left_tail(double u, double v) const {
    const service::_btpe_params& hat = *params;
    const double y = sycl::trunc(guarded_log(v) * hat.inv_ll + hat.xl);
    return y < 0 ? rejected : tested(y, v * ((u - hat.p2) * hat.ll));
  }

  SYCL_EXTERNAL std::int32_t from_parallelogram(double u, double v) const {
    const service::_btpe_params& hat = *params;
    const double x = (u - hat.p1) * hat.inv_c + hat.xl;
    const double height = -sycl::fabs(hat.xm - x) * hat.inv_p1 + (v * hat.c + 1.0);
    return height > 1.0 ? rejected : tested(sycl::trunc(x), height);
  }

  SYCL_EXTERNAL std::int32_t tested(double y, double v) const {
    return is_under_law(y, v) ? count(y) : rejected;
  }

  /// Whether the law at y is at least v. A v that is not a number is taken for small.
  SYCL_EXTERNAL bool is_under_law(double y, double v) const {
    const service::_btpe_params& hat = *params;
    const double k = y - hat.m;
    const double ak = sycl::fabs(k);
    if (ak > 20 && ak < hat.npq * 0.5 - 1.0) {
      return is_under_squeeze(y, k, v);
    }
    if (k < 0) {
      return is_under_walk_down(y, ak, v);
    }
    return !(k > 0) || is_under_walk_up(y, ak, v);
  }

  /// By bounds of the logarithm of the law, and by Stirling's formula between them.
  SYCL_EXTERNAL bool is_under_squeeze(double y, double k, double v) const {
    const service::_btpe_params& hat = *params;
    const double ak = sycl::fabs(k);
    const double third = (ak * 0.33333333333333331 + 0.625) * ak + 0.16666666666666666;
    const double rho = (ak * hat.inv_npq) * (third * hat.inv_npq + 0.5);
    const double t = -ak * ak * hat.inv_npq * 0.5;
    const double lnv = guarded_log(v);
    if (lnv < t - rho) {
      return true;
    }
    if (lnv > t + rho) {
      return false;
    }
    return !(lnv > log_law(y, k));
  }

  /// Logarithm of the law at y. Kept: the series of y and of ntrial - y are added like the others,
  /// as they are printed in the paper, where a quotient of factorials would have them subtracted;
  /// results depend on it.
  SYCL_EXTERNAL double log_law(double y, double k) const {
    const service::_btpe_params& hat = *params;
    const double x1 = y + 1;
    const double f1 = hat.m + 1;
    const double z = hat.n + 1 - hat.m;
    const double w1 = ntrial - y + 1;
    double sum = hat.xm * guarded_log(f1 / x1) + (hat.n - hat.m + 0.5) * guarded_log(z / w1) +
                 k * guarded_log(w1 / x1 * hat.s);
    sum = add_stirling_series(sum, f1);
    sum = add_stirling_series(sum, z);
    sum = add_stirling_series(sum, x1);
    return add_stirling_series(sum, w1);
  }

  /// By the law's running products from the end of the table on; `steps` is m - y. Kept: the walk
  /// begins with the factor of m - 33, though the table ends with that of m - 31; results depend on
  /// it.
  SYCL_EXTERNAL bool is_under_walk_down(double y, double steps, double v) const {
    const service::_btpe_params& hat = *params;
    if (steps < 33) {
      return !(v > hat.down[static_cast<std::int32_t>(steps) - 1]);
    }
    double g = hat.down[31];
    if (v > g) {
      return false;
    }
    const double w = (hat.n + 1.0) * hat.s;
    double j = hat.m - 32;
    do {
      j -= 1;
      g *= j / (-hat.s * j + w);
      if (v > g) {
        return false;
      }
    } while (j > y);
    return true;
  }

  /// The same upwards; `steps` is y - m.
  SYCL_EXTERNAL bool is_under_walk_up(double y, double steps, double v) const {
    const service::_btpe_params& hat = *params;
    if (steps < 33) {
      return !(v > hat.up[static_cast<std::int32_t>(steps) - 1]);
    }
    double g = hat.up[31];
    if (v > g) {
      return false;
    }
    const double w = (hat.n + 1.0) * hat.s;
    double j = hat.m + 32;
    do {
      j += 1;
      g *= w / j - hat.s;
      if (v > g) {
        return false;
      }
    } while (j < y);
    return true;
  }

  SYCL_EXTERNAL static std::int32_t count(double y) {
    return floor_to_integer<std::int32_t>(sycl::trunc(y));
  }
};

/// The smallest count whose sum of probabilities is above a uniform.
template <>
struct binomial<binomial_algorithm::icdf> {
  using source = double;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;
  static constexpr std::int32_t last = 63;

  double a;
  double b;
  const service::_bcdf_params* params;
  std::uint8_t flip;

  real_range<double> range() const { return {a, b}; }

  SYCL_EXTERNAL sycl::vec<std::int32_t, results> operator()(const sycl::vec<double, 4>& u) const {
    return each_of<std::int32_t>(*this, u);
  }

  SYCL_EXTERNAL std::int32_t one(double u) const {
    const std::int32_t k = inverse(u);
    return flip != 0 ? static_cast<std::int32_t>(params->n) - k : k;
  }

 private:
  SYCL_EXTERNAL std::int32_t inverse(double u) const {
    for (std::int32_t k = 0; k <= last; ++k) {
      if (u < params->cdf[k]) {
        return k;
      }
    }
    return behind_table(u);
  }

  /// The same behind the table, by the law's recurrence. The count of trials is no limit: kept, as
  /// results depend on it. Behind the mode terms fall, so that when one no longer moves the sum
  /// none will, and the sum would stay at or below u for ever. The walk ends there.
  SYCL_EXTERNAL std::int32_t behind_table(double u) const {
    const service::_bcdf_params& table = *params;
    std::int32_t k = last;
    double f = last;
    double pm = table.cdf[last] - table.cdf[last - 1];
    double cum = table.cdf[last];
    double before;
    do {
      k += 1;
      f += 1.0;
      pm *= table.a / f - table.s;
      before = cum;
      cum += pm;
    } while (u >= cum && cum != before);
    if (!(u >= cum)) {
      return k;
    }
    return k - 1 > last ? k - 1 : last_in_sums(table.cdf, last);
  }
};

/// From an accepted candidate to a result.
struct binomial_post {
  std::int32_t ntrial;
  std::uint8_t flip;

  SYCL_EXTERNAL std::int32_t operator()(std::int32_t y) const { return flip != 0 ? ntrial - y : y; }
};

}  // namespace functors
}  // namespace kestrel::tarn::rng::detail::gpu
