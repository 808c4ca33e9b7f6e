// SPDX-License-Identifier: Apache-2.0
// A serial model of beta on GPU queues, one candidate at a time: Johnk's method (Metrika 8, 1964)
// for two small shapes, Atkinson's switching method (J. R. Stat. Soc. A 142, 1979) where one is
// below 1, Cheng's BB (Comm. ACM 21, 1978) where both are above; a power of a uniform where one is
// 1.
#pragma once

#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

#include <sycl/sycl.hpp>

#include "rejection_model.hpp"

namespace tarn_test {

/// The constants of the switching method and of BB, those that a method has.
template <typename T>
struct beta_constants {
  T split, t, w1, w2, e1, e2, r1t, rt, inv[2], s, bb, cc;
};

template <typename T>
class beta_model {
 public:
  using source = T;
  using value = T;
  static constexpr bool whole = false;

  beta_model(T p, T q, T a, T b, bool accurate, step_counts& seen)
      : seen_(seen), alpha_(p), beta_(q), a_(a), b_(b), accurate_(accurate) {
    if (1 > p && 1 > q) {
      const T c1 = std::is_same_v<T, float> ? T(0.8522552f) : static_cast<T>(0.8522552176537243);
      const T c2 = std::is_same_v<T, float> ? T(-0.95624095f) : static_cast<T>(-0.9562409713408151);
      method_ = 0 >= c1 * p * p + q + c2 ? 0 : 1;
    } else if (1 > p && q > 1) {
      method_ = 2;
    } else if (p > 1 && 1 > q) {
      method_ = 3;
    } else if (p > 1 && q > 1) {
      method_ = 4;
    } else {
      road_ = model_road::each;
      shape_ = p == 1 ? q : p;
    }
    if (road_ == model_road::rejection) {
      fill_constants();
    }
  }

  model_road road() const { return road_; }
  value constant() const { return std::numeric_limits<T>::quiet_NaN(); }

  value each(T u) {
    const T power = sycl::pow(u, 1 / shape_);
    if (alpha_ == 1) {
      seen_("first shape 1");
      return clamped(b_ * (1 - power) + a_);
    }
    seen_("second shape 1");
    return clamped(b_ * power + a_);
  }

  value candidate(T u, T v) {
    switch (method_) {
      case 0:
        return johnk(u, v);
      case 4:
        return cheng(u, v);
      default:
        return atkinson(u, finite_log(v));
    }
  }

  value post(value v) { return clamped(std::fma(v, b_, a_)); }

  int method() const { return method_; }
  const beta_constants<T>& constants() const { return c_; }

 private:
  T clamped(T y) {
    if (!accurate_) {
      return y;
    }
    if (y < a_) {
      seen_("raised to a");
      y = a_;
    }
    if (y > a_ + b_) {
      seen_("lowered to a + b");
      y = a_ + b_;
    }
    return y;
  }

  T johnk(T u, T v) {
    const T x = sycl::exp(finite_log(u) / alpha_);
    const T y = sycl::exp(finite_log(v) / beta_);
    const T d = x + y;
    if (!(d > 0)) {
      seen_("johnk: both powers 0");
      return -1;
    }
    return seen_.decide(d <= 1, "johnk accepts", "johnk rejects") ? x / d : -1;
  }

  T atkinson(T u, T lw) {
    const bool first = method_ == 1;
    T x = 0;
    T test = 0;
    const char* accepts = nullptr;
    const char* rejects = nullptr;
    if (u > c_.split) {
      x = std::fma(-c_.w2, sycl::pow(1 - u, c_.inv[1]), T(1));
      test = std::fma(c_.e2, finite_log(first ? x * c_.rt : x / c_.t), lw);
      accepts = names[method_ - 1][0];
      rejects = names[method_ - 1][1];
    } else {
      x = c_.w1 * sycl::pow(u, c_.inv[0]);
      test = std::fma(c_.e1, finite_log(first ? (1 - x) * c_.r1t : 1 - x), lw);
      accepts = names[method_ - 1][2];
      rejects = names[method_ - 1][3];
    }
    if (!seen_.decide(test <= 0, accepts, rejects)) {
      return -1;
    }
    return method_ == 3 ? 1 - x : x;
  }
  static constexpr const char* names[3][4] = {
      {"1: upper accepts", "1: upper rejects", "1: lower accepts", "1: lower rejects"},
      {"2: upper accepts", "2: upper rejects", "2: lower accepts", "2: lower rejects"},
      {"3: upper accepts", "3: upper rejects", "3: lower accepts", "3: lower rejects"}};

  T cheng(T u1, T u2) {
    const T vv = c_.bb * finite_log(u1 / (1 - u1));
    const T w = alpha_ * sycl::exp(vv);
    const T rw = 1 / (beta_ + w);
    const T g = finite_log(c_.s * rw);
    const T z = finite_log((u1 * u1) * u2);
    T h = std::fma(c_.s, g, c_.cc * vv);
    h += static_cast<T>(-1.38629436f);
    return seen_.decide(h >= z, "cheng accepts", "cheng rejects") ? w * rw : -1;
  }

  void fill_constants() {
    beta_constants<T>& c = c_;
    if (method_ == 4) {
      c.s = alpha_ + beta_;
      c.bb = sycl::sqrt((-2 + c.s) / ((alpha_ + alpha_) * beta_ - c.s));
      c.cc = alpha_ + 1 / c.bb;
    } else if (method_ != 0) {
      // Method 3 is method 2 with the shapes in each other's place.
      const T p = method_ == 3 ? beta_ : alpha_;
      const T q = method_ == 3 ? alpha_ : beta_;
      if (method_ == 1) {
        const T root = sycl::sqrt((1 - p) * p);
        c.t = root / (sycl::sqrt(q * (1 - q)) + root);
        c.split = q * c.t / ((1 - c.t) * p + q * c.t);
      } else {
        c.t = (1 - p) / ((1 - p) + q);
        c.split = q * c.t / (sycl::pow(1 - c.t, q) * p + q * c.t);
      }
      c.w1 = c.t * sycl::pow(1 / c.split, 1 / p);
      c.w2 = (1 - c.t) * sycl::pow(1 / (1 - c.split), 1 / q);
      c.e1 = 1 - q;
      c.e2 = 1 - p;
      c.inv[0] = 1 / p;
      c.inv[1] = 1 / q;
      if (method_ == 1) {
        c.r1t = 1 / (1 - c.t);
        c.rt = 1 / c.t;
      }
    }
  }

  step_counts& seen_;
  T alpha_, beta_, a_, b_;
  bool accurate_;
  int method_ = 0;
  model_road road_ = model_road::rejection;
  T shape_ = 0;
  beta_constants<T> c_{};
};

}  // namespace tarn_test
