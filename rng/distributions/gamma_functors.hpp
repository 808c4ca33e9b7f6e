// SPDX-License-Identifier: Apache-2.0
// The kernel functor of gamma: candidates for standard gamma numbers of shape alpha, by three
// methods.
//   weibull  0.6 < alpha < 1: rejection from Weibull's law. I. Vaduva, On computer generation of
//            gamma random variables by rejection and composition procedures, Math.
//            Operationsforsch. Statist. 8, 1977.
//   power    alpha <= 0.6: a uniform for x^alpha up to 1, an exponential beyond. L. Devroye,
//            Non-Uniform Random Variate Generation, 1986, IX.3.
//   cube     alpha > 1: the cube of a shifted normal. G. Marsaglia, W. W. Tsang, A simple
//            method for generating gamma variables, ACM Transactions on Mathematical Software 26,
//            2000. Two normals of Box and Muller take a uniform each to be judged by, so that two
//            candidates come of four uniforms together.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "distributions/box_muller.hpp"
#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"

namespace kestrel::tarn::rng::detail::gpu::functors {

enum class gamma_way : std::int32_t { weibull = 0, power = 1, cube = 2 };

/// -1/3 as float has it, also in double. Kept: results depend on it.
template <typename T>
inline constexpr T minus_third = static_cast<T>(-0x1.555556p-2);
static_assert(minus_third<float> == -0.33333334f);
static_assert(minus_third<double> == -0.3333333432674408);

template <typename T>
struct gamma {
  using source = T;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 2;
  static constexpr bool whole = true;
  static constexpr T rejected = -1;

  T r0;
  T r1;
  T alpha;
  gamma_way method;
  T k1;  // weibull, power: 1 / alpha; cube: what a normal is multiplied by
  T k2;  // weibull: the density's advantage; power: 1 - alpha; cube: alpha - 1/3

  real_range<T> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<T, results> operator()(const sycl::vec<T, 4>& v) const {
    sycl::vec<T, results> out;
    if (method == gamma_way::cube) {
      const polar<T> at = polar_of<T>(v[0], v[2]);
      out[0] = by_cube(at.radius * sycl::sin(at.angle), v[1]);
      out[1] = by_cube(at.radius * sycl::cos(at.angle), v[3]);
    } else if (method == gamma_way::weibull) {
      out[0] = by_weibull(v[0], v[1]);
      out[1] = by_weibull(v[2], v[3]);
    } else {
      out[0] = by_power(v[0], v[1]);
      out[1] = by_power(v[2], v[3]);
    }
    return out;
  }

 private:
  /// Of a normal x, judged by u: first by the squeeze, then by the density. A w that is not above 0
  /// is outside of the law.
  SYCL_EXTERNAL T by_cube(T x, T u) const {
    constexpr T squeeze = static_cast<T>(-0.0331);
    const T w = sycl::fma(k1, x, T(1));
    if (!(w > 0)) {
      return rejected;
    }
    const T w3 = w * w * w;
    const T x2 = x * x;
    if (u < sycl::fma(x2 * squeeze, x2, T(1))) {
      return k2 * w3;
    }
    const T bound = sycl::fma(x2, static_cast<T>(0.5), k2 * (1 - w3 + guarded_log(w3)));
    return guarded_log(u) < bound ? k2 * w3 : rejected;
  }

  SYCL_EXTERNAL T by_weibull(T u, T w) const {
    const T e1 = -guarded_log(u);
    const T e2 = -guarded_log(w);
    const T x = sycl::powr(e1, k1);
    return e2 + e1 < x + k2 ? rejected : x;
  }

  SYCL_EXTERNAL T by_power(T u, T w) const {
    const T e = -guarded_log(w);
    if (u <= k2) {
      const T x = sycl::powr(u, k1);
      return x > e ? rejected : x;
    }
    const T e2 = -guarded_log((1 - u) * k1);
    const T x = sycl::powr(sycl::fma(alpha, e2, k2), k1);
    return x > e2 + e ? rejected : x;
  }
};

/// A standard gamma number at its place. `accurate` keeps rounding from bringing it below `a`.
template <typename T>
struct gamma_post {
  T a;
  T beta;
  std::uint8_t accurate;

  SYCL_EXTERNAL T operator()(T v) const {
    const T y = sycl::mad(v, beta, a);
    return accurate != 0 && y < a ? a : y;
  }
};

}  // namespace kestrel::tarn::rng::detail::gpu::functors
