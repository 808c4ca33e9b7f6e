// SPDX-License-Identifier: Apache-2.0
// A serial model of binomial on GPU queues: a table of the cdf where the mean is below 30,
// otherwise BTPE (Kachitvichyanukul and Schmeiser, Comm. ACM 31, 1988) one candidate at a time. For
// p >= 1/2 failures are drawn and the result is turned round, but BTPE keeps the p as given in its
// constants, as the library does.
#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "rejection_model.hpp"
#include "table_models.hpp"

namespace tarn_test {

/// The constants of BTPE in the order in which the device reads them.
struct btpe_constants {
  double n, p, npq, fm, m, p1, p2, p3, p4, xm, xl, xr, ll, lr, inv_ll, inv_lr, c, inv_c, inv_p1,
      inv_npq, s;
  double down[32], up[32];
};

class btpe_model {
 public:
  using source = double;
  using value = std::int32_t;
  static constexpr bool whole = false;

  btpe_model(std::int32_t ntrial, double p, step_counts& seen)
      : seen_(seen), ntrial_(ntrial), flip_(p >= 0.5) {
    const double x = 0.5 > p ? ntrial * p : ntrial * (1 - p);
    const double q = 0.5 > p ? 1 - p : p;
    if (30.0 > x) {
      cdf_ = binomial_cdf(ntrial, p);
    } else {
      fill_constants(p, x, q);
    }
  }

  model_road road() const {
    if (ntrial_ == 0) {
      return model_road::constant;
    }
    return !cdf_.empty() ? model_road::each : model_road::rejection;
  }
  value constant() const { return 0; }

  value each(double u) {
    const std::size_t k = first_above(cdf_, u);
    seen_(k == 0 ? "table first" : "table later");
    return post(static_cast<value>(k));
  }

  value candidate(double u0, double v) {
    const double u = u0 * c_.p4;
    double y = 0;
    if (u < c_.p1) {
      seen_("triangle");
      return static_cast<value>(std::trunc(std::fma(-c_.p1, v, c_.xm) + u));
    }
    if (u > c_.p2 && u > c_.p3) {
      y = std::trunc(c_.xr - finite_log(v) * c_.inv_lr);
      if (c_.n < y) {
        seen_("right of all");
        return -1;
      }
      seen_("right tail");
      v = v * ((u - c_.p3) * c_.lr);
    } else if (u > c_.p2) {
      y = std::trunc(finite_log(v) * c_.inv_ll + c_.xl);
      if (y < 0) {
        seen_("left of all");
        return -1;
      }
      seen_("left tail");
      v = v * ((u - c_.p2) * c_.ll);
    } else {
      const double t = (u - c_.p1) * c_.inv_c + c_.xl;
      const double dx = c_.xm - t;
      v = (-std::fabs(dx)) * c_.inv_p1 + (v * c_.c + 1.0);
      if (v > 1.0) {
        seen_("above parallelogram");
        return -1;
      }
      seen_("parallelogram");
      y = std::trunc(t);
    }
    return below_curve(y, v) ? static_cast<value>(y) : -1;
  }

  value post(value y) const { return flip_ ? ntrial_ - y : y; }

  const btpe_constants& constants() const { return c_; }

 private:
  bool below_curve(double y, double v) {
    const double k = y - c_.m;
    const double ak = std::fabs(k);
    if (ak > 20 && ak < c_.npq * 0.5 - 1.0) {
      return by_logarithms(y, v, k, ak);
    }
    if (k == 0) {
      seen_("at mode");
      return true;
    }
    return k < 0 ? by_ratios_below(y, v, static_cast<int>(-k))
                 : by_ratios_above(y, v, static_cast<int>(k));
  }

  bool by_logarithms(double y, double v, double k, double ak) {
    const double rho =
        (ak * c_.inv_npq) *
        (((ak * (ak * 0.33333333333333331 + 0.625) + 0.16666666666666666) * c_.inv_npq) + 0.5);
    const double t = ((-ak * ak) * c_.inv_npq) * 0.5;
    const double lnv = finite_log(v);
    if (lnv < t - rho) {
      return seen_.accept("surely inside");
    }
    if (lnv > t + rho) {
      return seen_.reject("surely outside");
    }
    const double x1 = y + 1;
    const double f1 = c_.m + 1;
    const double z = c_.n + 1 - c_.m;
    const double w1 = c_.n - y + 1;
    double a = c_.xm * finite_log(f1 / x1) + (c_.n - c_.m + 0.5) * finite_log(z / w1) +
               k * finite_log((w1 / x1) * c_.s);
    for (const double x : {f1, z, x1, w1}) {
      a = plus_stirling(x, a);
    }
    return seen_.decide(!(lnv > a), "inside", "outside");
  }

  /// a + the rest of Stirling's series for ln(x!), of which the leading terms are in a.
  static double plus_stirling(double x, double a) {
    const double h = (1 / x) * (1 / x);
    double e = std::fma(h, -0.00084175084175084171, 0.00059523809523809529);
    e = std::fma(-e, h, 0.00079365079365079365);
    e = std::fma(-e, h, 0.0027777777777777779);
    e = std::fma(-e, h, 0.083333333333333329);
    return std::fma(e, 1 / x, a);
  }

  bool by_ratios_below(double y, double v, int i) {
    if (i < 33) {
      return seen_.decide(!(v > c_.down[i - 1]), "table below accepts", "table below rejects");
    }
    if (v > c_.down[31]) {
      return seen_.reject("table end below rejects");
    }
    const double w = (c_.n + 1.0) * c_.s;
    double j = c_.m - 32;
    double g = c_.down[31];
    do {
      j -= 1;
      g *= j / ((-c_.s) * j + w);
      if (v > g) {
        return seen_.reject("walk below rejects");
      }
    } while (j > y);
    return seen_.accept("walk below accepts");
  }

  bool by_ratios_above(double y, double v, int i) {
    if (i < 33) {
      return seen_.decide(!(v > c_.up[i - 1]), "table above accepts", "table above rejects");
    }
    if (v > c_.up[31]) {
      return seen_.reject("table end above rejects");
    }
    const double w = (c_.n + 1.0) * c_.s;
    double j = c_.m + 32;
    double g = c_.up[31];
    do {
      j += 1;
      g *= w / j - c_.s;
      if (v > g) {
        return seen_.reject("walk above rejects");
      }
    } while (j < y);
    return seen_.accept("walk above accepts");
  }

  void fill_constants(double p, double x, double q) {
    btpe_constants& c = c_;
    c.n = ntrial_;
    c.p = p;
    c.npq = x * q;
    c.fm = p + x;
    c.m = static_cast<std::int32_t>(c.fm);
    c.p1 = std::trunc(2.195 * std::sqrt(c.npq) + -4.6 * q) + 0.5;
    c.xm = c.m + 0.5;
    c.xl = c.xm - c.p1;
    c.xr = c.xm + c.p1;
    const double al = (c.fm - c.xl) / (c.fm - p * c.xl);
    const double ar = (c.xr - c.fm) / (q * c.xr);
    c.ll = (0.5 * al + 1.0) * al;
    c.lr = (0.5 * ar + 1.0) * ar;
    c.inv_ll = 1.0 / c.ll;
    c.inv_lr = 1.0 / c.lr;
    c.c = 20.5 / (15.3 + c.m) + 0.134;
    c.inv_c = 1.0 / c.c;
    c.inv_p1 = 1.0 / c.p1;
    c.inv_npq = 1.0 / c.npq;
    c.p2 = (c.c + 1.0 + c.c) * c.p1;
    c.p3 = c.c * c.inv_ll + c.p2;
    c.p4 = c.c * c.inv_lr + c.p3;
    c.s = p / q;
    const double w = (c.n + 1.0) * c.s;
    double down = 1;
    double up = 1;
    for (int k = 0; k < 32; ++k) {
      down *= (c.m - k) / (w - c.s * (c.m - k));
      up *= w / (c.m + (k + 1)) - c.s;
      c.down[k] = down;
      c.up[k] = up;
    }
  }

  step_counts& seen_;
  std::int32_t ntrial_;
  bool flip_;
  std::vector<double> cdf_;
  btpe_constants c_{};
};

}  // namespace tarn_test
