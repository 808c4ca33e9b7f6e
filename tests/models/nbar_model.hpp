// SPDX-License-Identifier: Apache-2.0
// A serial model of negative_binomial on GPU queues: a table of the cdf where the mode is below
// 100, and the recurrence behind its end; otherwise rejection from a hat of five pieces (a centre,
// a slope and an exponential tail on either side), one candidate at a time. Constants are for `a`
// successes of probability p; a1 = a - 1, q = 1 - p.
#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include <sycl/sycl.hpp>

#include "rejection_model.hpp"
#include "table_models.hpp"

namespace tarn_test {

/// A sloped piece and an exponential tail.
struct nbar_slope {
  double s, o, c, d, f, g, h;
};
struct nbar_tail {
  double s, o, w;
};

/// The constants of the hat in the order in which the device reads them: first of a pair is what
/// belongs to the right side.
struct nbar_constants {
  double a, p, m, P[5], down[64], up[64], tm, r0s, r0o, sr, o_r, sl, ol;
  nbar_slope b1, b2;
  nbar_tail e1, e2;
};

class nbar_model {
 public:
  using source = double;
  using value = std::int32_t;
  static constexpr bool whole = false;

  nbar_model(double a, double p, step_counts& seen)
      : seen_(seen), a_(a), a1_(a - 1), q_(1 - p), mu_((a - 1) * (1 - p) / p) {
    c_.a = a;
    c_.p = p;
    if (road() == model_road::rejection) {
      fill_constants();
    } else {
      cdf_ = negative_binomial_cdf(a, p);
    }
  }

  model_road road() const { return mu_ >= 100.0 ? model_road::rejection : model_road::each; }
  value constant() const { return -1; }

  value each(double u) {
    std::size_t k = first_above(cdf_, u);
    if (k < cdf_.size()) {
      seen_(k == 0 ? "table first" : "table later");
      return static_cast<value>(k);
    }
    seen_("behind the table");
    double cum = cdf_.back();
    double pm = cum - cdf_[cdf_.size() - 2];
    double f = static_cast<double>(k - 1);
    for (--k; u >= cum && pm > 0;) {
      ++k;
      pm *= q_ * (f + a_);
      f += 1;
      pm /= f;
      cum += pm;
    }
    return static_cast<value>(k);
  }

  value candidate(double u, double w) {
    const nbar_constants& c = c_;
    if (u <= c.P[0]) {
      const double x = std::fma(c.r0s, u, c.r0o);
      if (x > c.m + 0.5) {
        return w > std::fma(x, c.sr, c.o_r) ? right(std::floor(x), w, "centre right tests")
                                            : kept(std::floor(x), "centre right squeezes");
      }
      return w > std::fma(x, c.sl, c.ol) ? left(std::floor(x), w, "centre left tests")
                                         : kept(std::floor(x), "centre left squeezes");
    }
    if (u <= c.P[2]) {
      const bool on_right = u <= c.P[1];
      const nbar_slope& b = on_right ? c.b1 : c.b2;
      const double s = sycl::sqrt(std::fma(b.s, u, b.o));
      const double x = std::fma(-b.d, s, b.c);
      const double scaled = (w * b.f) * s;
      const double y = std::floor(x);
      if (scaled > std::fma(x, b.g, b.h)) {
        return on_right ? right(y, scaled, "slope right tests")
                        : left(y, scaled, "slope left tests");
      }
      return kept(y, on_right ? "slope right squeezes" : "slope left squeezes");
    }
    const double lw = finite_log(w);
    if (u <= c.P[3]) {
      const double y = std::floor(std::fma(c.e1.s, lw, c.e1.o));
      return right(y, ((u - c.P[2]) * w) * c.e1.w, "tail right");
    }
    const double y = std::floor(std::fma(c.e2.s, lw, c.e2.o));
    if (!(y >= 0)) {
      seen_("left of all");
      return -1;
    }
    return left(y, ((u - c.P[3]) * w) * c.e2.w, "tail left");
  }

  value post(value y) const { return y; }
  nbar_constants& constants() { return c_; }

 private:
  value kept(double y, const char* step) {
    seen_(step);
    return seen_.decide(y > 2147483520.0, "ceiling", "below the ceiling") ? 2147483520
                                                                          : static_cast<value>(y);
  }
  value kept_if(bool accepted, double y, const char* if_accepted, const char* if_rejected) {
    return seen_.decide(accepted, if_accepted, if_rejected) ? kept(y, "accepted") : -1;
  }

  value right(double y, double w, const char* from) {
    seen_(from);
    if (!(y <= c_.m + 64)) {
      return kept_if(!(finite_log(w) > log_density(y) - c_.tm), y, "density right accepts",
                     "density right rejects");
    }
    const int i = (static_cast<int>(y - c_.m) + 63) & 63;
    seen_(y == c_.m ? "mode from the right" : "table right");
    return kept_if(!(c_.up[i] < w), y, "table right accepts", "table right rejects");
  }

  value left(double y, double w, const char* from) {
    seen_(from);
    if (y >= c_.m - 64) {
      const int i = (static_cast<int>(c_.m - y) + 63) & 63;
      seen_(y == c_.m ? "mode from the left" : "table left");
      return kept_if(!(c_.down[i] < w), y, "table left accepts", "table left rejects");
    }
    if (y < 150) {
      double g = c_.down[63];
      // w in the denominator, a1 for q and q for w: results depend on it.
      for (double j = c_.m - 64; j > y; j -= 1) {
        g = g * (j / ((j + w) * a1_));
        if (g < q_) {
          return kept_if(false, y, "", "walk rejects");
        }
      }
      return kept(y, "walk accepts");
    }
    return kept_if(!(finite_log(w) > log_density(y) - c_.tm), y, "density left accepts",
                   "density left rejects");
  }

  /// The logarithm of the pmf up to a constant, by Stirling's series.
  double log_density(double y) const {
    constexpr double k1 = 0.083333333333333329, k2 = 0.0027777777777777779,
                     k3 = 0.00079365079365079365;
    const double i = 1 / y;
    const double j = 1 / (a1_ + y);
    return (y + 0.5) * sycl::log((a1_ * q_) * i + q_) + a1_ * sycl::log(a1_ + y) +
           (((-i * i) * k3 + k2) * (-i * i) + k1) * i - ((j * j * k3 + k2) * (j * j) + k1) * j;
  }

  /// The pmf at z as a multiple of that at the mode.
  double density(double z, bool tabled) {
    if (!seen_.decide(tabled, "constant of the table", "constant of the density")) {
      return sycl::exp(log_density(z) - c_.tm);
    }
    return z < c_.m ? c_.down[static_cast<int>(c_.m - z) - 1]
                    : c_.up[static_cast<int>(z - c_.m) - 1];
  }

  void fill_constants() {
    nbar_constants& c = c_;
    c.m = std::trunc(mu_);
    for (int j = 0; j < 64; ++j) {
      const double low = c.m - j;
      const double high = c.m + 1 + j;
      c.down[j] = (j == 0 ? 1.0 : c.down[j - 1]) * low / ((a1_ + low) * q_);
      c.up[j] = (j == 0 ? 1.0 : c.up[j - 1]) * ((a1_ + high) * q_ / high);
    }
    c.tm = log_density(c.m);
    const double sd = sycl::sqrt(mu_ / c.p + 0.25);
    const double kl = std::trunc(mu_ + -0.5 - sd);
    const double kr = std::ceil(sd + (mu_ + -0.5));
    const double cl = q_ * (a1_ + kl);
    const double xl0 = 1.0 + kl;
    const double xl = cl / (kl - cl) + xl0;
    const double xr = (kr + 1.0) / (kr + 1.0 - (kr + a_) * q_) + kr;
    const double il = std::trunc(xl), ir = std::trunc(xr);
    const double f_kl = density(kl, std::trunc(c.m - xl0) < 64);
    const double f_kr = density(kr, std::trunc(kr - c.m) <= 64);
    const double f_il = density(il, std::trunc(c.m - il) <= 64);
    const double f_ir = density(ir, std::trunc(ir - c.m) <= 64);
    const double gr = (a_ + ir) * q_ / (ir + 1.0);
    const double gl = (a1_ + il) * q_ / il;
    const double hr = sycl::pow(gr, xr - ir + -1.0) * f_ir;
    const double hl = sycl::pow(gl, xl - il) * f_il;
    const double d1 = ir * f_ir / ((a1_ + ir) * q_);
    const double d2 = ((il + a_) * f_il) * q_ / (il + 1.0);

    const double area[5] = {kr - xl0, (0.5 * f_kr + d1) * (xr - kr), (0.5 * f_kl + d2) * (xl0 - xl),
                            -hr / sycl::log(gr), hl / sycl::log(gl)};
    double sum = 0;
    for (int i = 0; i < 5; ++i) {
      c.P[i] = sum += area[i];
    }
    for (double& cumulative : c.P) {
      cumulative /= sum;
    }
    c.r0s = area[0] / c.P[0];
    c.r0o = xl0;
    c.sr = (1 - f_kr) / (c.m - kr);
    c.o_r = 1 - c.sr * c.m;
    c.sl = (1 - f_kl) / (c.m - kl);
    c.ol = 1 - (c.m + 1) * c.sl;
    c.b1 = slope(d1 / f_kr, c.P[0], c.P[1], kr, xr, f_kr);
    c.b2 = slope(d2 / f_kl, c.P[1], c.P[2], xl0, xl, f_kl);
    c.e1 = {1 / sycl::log(gr), xr, hr / (c.P[3] - c.P[2])};
    c.e2 = {1 / sycl::log(gl), xl, hl / (c.P[4] - c.P[3])};
  }

  /// The piece between the cumulative probabilities `below` and `above`, from the edge of the
  /// centre, where the density is f, to that of the tail.
  static nbar_slope slope(double w, double below, double above, double centre, double tail,
                          double f) {
    nbar_slope b{};
    b.s = (w + 1 + w) / (above - below);
    b.o = w * w - b.s * below;
    b.d = tail - centre;
    b.c = b.d * w + tail;
    b.f = f;
    b.g = f / (centre - tail);
    b.h = -tail * b.g;
    return b;
  }

  step_counts& seen_;
  double a_, a1_, q_, mu_;
  std::vector<double> cdf_;
  nbar_constants c_{};
};

}  // namespace tarn_test
