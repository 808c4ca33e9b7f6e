// SPDX-License-Identifier: Apache-2.0
// Kernel functors of gaussian and lognormal by the method of G. E. P. Box and M. E. Muller (A note
// on the generation of random normal deviates, Annals of Mathematical Statistics 29, 1958): a pair
// of reals of [0, 1) is a radius and an angle, whose sine and cosine give one normal each.
#pragma once

#include <sycl/sycl.hpp>

#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"

namespace kestrel::tarn::rng::detail::gpu {

template <typename R>
struct polar {
  R radius;
  R angle;
};

template <typename R>
SYCL_EXTERNAL polar<R> polar_of(R u0, R u1) {
  constexpr R two_pi = static_cast<R>(6.28318530717958647693);
  return {sycl::sqrt(-2 * guarded_log(u0)), u1 * two_pi};
}

template <typename R>
struct gaussian_box_muller {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 2;
  static constexpr int pair_results = 1;

  R mean;
  R stddev;
  R lo = 0;
  R hi = 1;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return pairs_of<R>(*this, u);
  }

  SYCL_EXTERNAL void pair(R u0, R u1, R* out) const {
    const polar<R> at = polar_of(u0, u1);
    out[0] = sycl::mad(stddev, at.radius * sycl::sin(at.angle), mean);
  }
};

template <typename R>
struct gaussian_box_muller2 {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;
  static constexpr int pair_results = 2;

  R mean;
  R stddev;
  R lo = 0;
  R hi = 1;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return pairs_of<R>(*this, u);
  }

  /// The sine's normal first.
  SYCL_EXTERNAL void pair(R u0, R u1, R* out) const {
    const polar<R> at = polar_of(u0, u1);
    out[0] = sycl::mad(stddev, at.radius * sycl::sin(at.angle), mean);
    out[1] = sycl::mad(stddev, at.radius * sycl::cos(at.angle), mean);
  }
};

template <typename R>
struct lognormal_box_muller2 {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;
  static constexpr int pair_results = 2;

  R m;
  R s;
  R displ;
  R scale;
  R lo = 0;
  R hi = 1;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return pairs_of<R>(*this, u);
  }

  SYCL_EXTERNAL void pair(R u0, R u1, R* out) const {
    gaussian_box_muller2<R>{m, s}.pair(u0, u1, out);
    out[0] = sycl::mad(sycl::exp(out[0]), scale, displ);
    out[1] = sycl::mad(sycl::exp(out[1]), scale, displ);
  }
};

}  // namespace kestrel::tarn::rng::detail::gpu
