// SPDX-License-Identifier: Apache-2.0
// A serial model of gamma on GPU queues, two candidates from four uniforms: above shape 1 the cubed
// normal of Marsaglia and Tsang (ACM Trans. Math. Software 26, 2000) with both normals of a Box and
// Muller pair, below it rejection from a Weibull law, below 0.6 the power transformation; shape 1
// is the exponential law.
#pragma once

#include <array>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

#include <sycl/sycl.hpp>

#include "rejection_model.hpp"

namespace tarn_test {

template <typename T>
class gamma_model {
 public:
  using source = T;
  using value = T;
  static constexpr bool whole = true;

  gamma_model(T alpha, T a, T beta, bool accurate, step_counts& seen)
      : seen_(seen), alpha_(alpha), a_(a), beta_(beta), accurate_(accurate) {
    if (alpha > 1) {
      method_ = 2;
      k1_ = sycl::sqrt(1 / (alpha * 9 + -3));
      k2_ = alpha + static_cast<T>(-0.33333334f);
    } else if (alpha > T(0.6)) {
      method_ = 0;
      k1_ = 1 / alpha;
      k2_ = (1 - alpha) * sycl::exp(alpha * sycl::log(alpha) / (1 - alpha));
    } else {
      method_ = 1;
      k1_ = 1 / alpha;
      k2_ = 1 - alpha;
    }
  }

  model_road road() const { return alpha_ == 1 ? model_road::each : model_road::rejection; }
  value constant() const { return std::numeric_limits<T>::quiet_NaN(); }

  value each(T u) {
    seen_("exponential");
    return post(-finite_log(u));
  }

  std::array<value, 2> candidates(const T* v) {
    if (method_ == 2) {
      const T t = v[2] * static_cast<T>(6.283185307179586477L);
      const T r = sycl::sqrt(-2 * finite_log(v[0]));
      const T x[2] = {r * sycl::sin(t), r * sycl::cos(t)};
      return {cubed_normal(x[0], v[1]), cubed_normal(x[1], v[3])};
    }
    const bool weibull = method_ == 0;
    return {weibull ? of_weibull(v[0], v[1]) : of_powers(v[0], v[1]),
            weibull ? of_weibull(v[2], v[3]) : of_powers(v[2], v[3])};
  }

  value post(value v) {
    const T y = std::fma(v, beta_, a_);
    if (accurate_ && y < a_) {
      seen_("raised to a");
      return a_;
    }
    return y;
  }

  int method() const { return method_; }
  T k1() const { return k1_; }
  T k2() const { return k2_; }

 private:
  T cubed_normal(T x, T u) {
    const T w = std::fma(k1_, x, T(1));
    if (!(w > 0)) {
      seen_("cube not above 0");
      return -1;
    }
    const T w3 = (w * w) * w;
    const T x2 = x * x;
    if (u < std::fma(x2 * T(-0.0331), x2, T(1))) {
      seen_("cube squeezes");
      return k2_ * w3;
    }
    const T lc = finite_log(w3);
    const T lu = finite_log(u);
    const bool inside = lu < std::fma(x2, T(0.5), k2_ * ((1 - w3) + lc));
    return seen_.decide(inside, "cube accepts", "cube rejects") ? k2_ * w3 : -1;
  }

  T of_weibull(T u0, T u1) {
    const T e1 = -finite_log(u0);
    const T e2 = -finite_log(u1);
    const T x = sycl::powr(e1, k1_);
    return seen_.decide(!(e2 + e1 < x + k2_), "weibull accepts", "weibull rejects") ? x : -1;
  }

  T of_powers(T u, T u1) {
    const T e = -finite_log(u1);
    if (u <= k2_) {
      const T x = sycl::powr(u, k1_);
      return seen_.decide(!(x > e), "power accepts", "power rejects") ? x : -1;
    }
    const T e2 = -finite_log((1 - u) * k1_);
    const T x = sycl::powr(std::fma(alpha_, e2, k2_), k1_);
    return seen_.decide(!(x > e2 + e), "tail accepts", "tail rejects") ? x : -1;
  }

  step_counts& seen_;
  T alpha_, a_, beta_;
  bool accurate_;
  int method_;
  T k1_, k2_;
};

}  // namespace tarn_test
