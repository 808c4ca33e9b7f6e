// SPDX-License-Identifier: Apache-2.0
// A serial model of hypergeometric on GPU queues: a constant where only one value can come, a table
// of the cdf where the mode is below 40, otherwise H2PE (Kachitvichyanukul and Schmeiser, J. Stat.
// Comput. Simul. 22, 1985) one candidate at a time. All on the smaller class and the smaller part
// of the lot, so that 0 is the least value; the result is mapped back.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include <sycl/sycl.hpp>

#include "rejection_model.hpp"
#include "table_models.hpp"

namespace tarn_test {

/// The constants of H2PE in the order in which the device reads them.
struct h2pe_constants {
  std::int32_t lot, marked, sample;
  double p1, p2, p3, xl, xr, c1, c2, c3, c4, ll, lr, inv_ll, inv_lr, a;
  double down[64], up[64];
};

class h2pe_model {
 public:
  using source = double;
  using value = std::int32_t;
  static constexpr bool whole = false;

  h2pe_model(std::int32_t l, std::int32_t s, std::int32_t m, step_counts& seen)
      : seen_(seen), small_(2 * std::int64_t{s} < l), few_(m <= l - m) {
    c_.lot = l;
    c_.marked = m;
    c_.sample = s;
    n1_ = std::min(m, l - m);
    n2_ = std::max(m, l - m);
    k_ = small_ ? s : l - s;
    high_ = std::min(n1_, k_);
    mode_ = std::trunc((n1_ + 1) * (k_ + 1) / (static_cast<double>(l) + 2));
    if (road() == model_road::each) {
      cdf_ = hypergeometric_cdf(n1_, n2_, k_, static_cast<std::size_t>(mode_));
    } else if (road() == model_road::rejection) {
      fill_constants();
    }
  }

  model_road road() const {
    if (high_ == 0) {
      return model_road::constant;
    }
    return mode_ < 40 ? model_road::each : model_road::rejection;
  }

  /// Without marked elements, and for a small sample, the sample's size: what the library does.
  value constant() const {
    if (small_) {
      return c_.sample;
    }
    return few_ ? c_.marked : c_.sample - static_cast<value>(n1_);
  }

  value each(double u) {
    const std::size_t y = first_above(cdf_, u);
    seen_(y == 0 ? "table first" : "table later");
    return post(static_cast<value>(y));
  }

  value candidate(double u0, double v) {
    const double u = u0 * c_.p3;
    double y = 0;
    if (!(u > c_.p1)) {
      seen_("body");
      y = std::trunc(c_.xl + u);
    } else if (!(u > c_.p2)) {
      y = std::trunc(finite_log(v) * c_.inv_ll + c_.xl);
      if (!(0 <= y)) {
        seen_("left of all");
        return -1;
      }
      seen_("left tail");
      v = v * ((u - c_.p1) * c_.ll);
    } else {
      y = std::trunc((-finite_log(v)) * c_.inv_lr + c_.xr);
      if (!(high_ >= y)) {
        seen_("right of all");
        return -1;
      }
      seen_("right tail");
      v = v * ((u - c_.p2) * c_.lr);
    }
    return below_curve(y, v) ? static_cast<value>(y) : -1;
  }

  value post(value y) const {
    const auto n1 = static_cast<value>(n1_);
    if (few_) {
      return small_ ? y : c_.marked - y;
    }
    return small_ ? c_.sample - y : c_.sample - n1 + y;
  }

  const h2pe_constants& constants() const { return c_; }
  const std::vector<double>& cdf() const { return cdf_; }

 private:
  bool below_curve(double y, double v) {
    if (mode_ >= 100 && y >= 201) {
      return by_logarithms(y, v);
    }
    if (y == mode_) {
      return seen_.accept("at mode");
    }
    return y < mode_ ? by_ratios_below(y, v) : by_ratios_above(y, v);
  }

  bool by_ratios_below(double y, double v) {
    const int g = static_cast<int>(mode_ - y);
    if (g < 65) {
      return seen_.decide(!(c_.down[g - 1] < v), "table below accepts", "table below rejects");
    }
    const double c = n2_ - k_;
    double f = c_.down[63];
    for (double t = mode_ - 64; !(t <= y); t -= 1.0) {
      f = f * (t * (c + t) / (((n1_ - t) + 1.0) * ((k_ - t) + 1.0)));
      if (f < v) {
        return seen_.reject("walk below rejects");
      }
    }
    return seen_.accept("walk below accepts");
  }

  bool by_ratios_above(double y, double v) {
    const int g = static_cast<int>(y - mode_);
    if (g < 65) {
      return seen_.decide(!(c_.up[g - 1] < v), "table above accepts", "table above rejects");
    }
    const double c = n2_ - k_;
    double f = c_.up[63];
    for (double t = mode_ + 64; !(t >= y); t += 1.0) {
      f = f * (((n1_ - t) * (k_ - t)) / ((t + 1.0) * ((c + t) + 1.0)));
      if (f < v) {
        return seen_.reject("walk above rejects");
      }
    }
    return seen_.accept("walk above accepts");
  }

  bool by_logarithms(double y, double v) {
    const double x1 = y + 1.0;
    const double dy = y - mode_;
    const double f1 = (n1_ + 1.0) - y;
    const double z1 = (k_ - y) + 1.0;
    const double w1 = (n2_ - k_) + x1;
    const double c[4] = {c_.c1, c_.c2, c_.c3, c_.c4};
    const double a[4] = {-dy / x1, dy / f1, dy / z1, -dy / w1};
    const double e = f1 * z1 / (x1 * w1) - 1.0;
    const double e2 = e * e;
    const double g1 = (e * (-0.5) + (e2 * 0.33333333333333331 + 1.0)) * e;
    const double g2 = g1 - ((e2 * e2) * 0.25) / (e < 0 ? e + 1.0 : 1.0);
    double ub = std::fma(y, g1, (-g2) * mode_) + 0.0033999999999999998;
    double b = 0;
    for (int i = 0; i < 4; ++i) {
      const double square = a[i] * a[i];
      ub =
          std::fma(c[i] * a[i], std::fma(std::fma(a[i], 0.33333333333333331, -0.5), a[i], 1.0), ub);
      // Never below 0, as no c is, so that the correction of the paper for such terms never runs.
      b += c[i] * square * square;
    }
    const double lnv = finite_log(v);
    if (lnv > ub) {
      return seen_.reject("surely outside");
    }
    const double lb = (y + mode_) * (g2 - g1) + (ub - 0.25 * b) + -0.0077999999999999996;
    if (!(lnv >= lb)) {
      return seen_.accept("surely inside");
    }
    return seen_.decide(!(lnv > c_.a - log_factorials(y)), "inside", "outside");
  }

  /// The logarithm of what the pmf at y is divided by.
  double log_factorials(double y) const {
    const double x[4] = {y, n1_ - y, k_ - y, y + (n2_ - k_)};
    if (*std::min_element(x, x + 4) < 16) {
      return log_factorial(x[0]) + log_factorial(x[1]) + log_factorial(x[2]) + log_factorial(x[3]);
    }
    double t = 3.6757541327999999;
    double inverses = 0;
    double cubes = 0;
    for (const double z : x) {
      t = std::fma(sycl::log(z), z + 0.5, t);
      inverses += 1 / z;
      cubes += 1 / z * (1 / z) * (1 / z);
    }
    t = std::fma(inverses, 0.083333333333333329, t);
    return t - std::fma(cubes, 0.0027777777777777779, static_cast<double>(c_.lot));
  }

  void fill_constants() {
    h2pe_constants& c = c_;
    const double l = c.lot;
    const double d = std::floor(std::sqrt((l - k_) * k_ * n1_ * n2_ / (-1.0 + l)) / l * 1.5) + 0.5;
    c.p1 = 2 * d;
    c.xl = mode_ - d + 0.5;
    c.xr = d + mode_ + 0.5;
    c.c1 = mode_ + 0.5;
    c.c2 = (n1_ - mode_) + 0.5;
    c.c3 = k_ - mode_ + 0.5;
    c.c4 = c.c1 + (n2_ - k_);
    c.ll = -sycl::log(((n2_ - k_) + c.xl) * c.xl / (n1_ - c.xl + 1.0) / (k_ - c.xl + 1.0));
    c.lr = -sycl::log((k_ - c.xr + 1.0) * (n1_ - c.xr + 1.0) / c.xr / (c.xr + (n2_ - k_)));
    c.inv_ll = 1.0 / c.ll;
    c.inv_lr = 1.0 / c.lr;
    c.a = log_factorials(mode_);
    const double kl = sycl::exp(c.a - log_factorials(std::trunc(c.xl)));
    const double kr = sycl::exp(c.a - log_factorials(std::trunc(c.xr) - 1));
    c.p2 = kl * c.inv_ll + c.p1;
    c.p3 = kr * c.inv_lr + c.p2;
    double down = 1, up = 1;
    for (int j = 0; j < 64; ++j) {
      const double low = mode_ - j, high = mode_ + j;
      c.down[j] = down *= (n2_ - k_ + low) * low / ((k_ - low + 1.0) * (n1_ - low + 1.0));
      c.up[j] = up *= (k_ - high) * (n1_ - high) / (((n2_ - k_) + high + 1.0) * (high + 1.0));
    }
  }

  step_counts& seen_;
  bool small_;  // the sample is less than half the lot
  bool few_;    // not more than half the lot is marked
  h2pe_constants c_{};
  double n1_ = 0, n2_ = 0, k_ = 0, high_ = 0, mode_ = 0;
  std::vector<double> cdf_;
};

}  // namespace tarn_test
