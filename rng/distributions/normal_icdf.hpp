// SPDX-License-Identifier: Apache-2.0
// Kernel functors of gaussian and lognormal by inversion: sqrt(2) erfinv(u) with u of [-1, 1) is a
// standard normal. Products and sums are rounded one by one, as on the host road.
#pragma once

#include <sycl/sycl.hpp>

#include "distributions/erfinv.hpp"
#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"

namespace kestrel::tarn::rng::detail::gpu {

template <typename R>
inline constexpr R sqrt_of_two = static_cast<R>(1.41421356237309504880);

template <typename R>
struct gaussian_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R mean;
  R stddev;
  R lo = -1;
  R hi = 1;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return each_of<R>(*this, u);
  }

  SYCL_EXTERNAL R one(R u) const {
    const R product = (stddev * sqrt_of_two<R>)*erfinv_wrapper(u);
    return product + mean;
  }
};

template <typename R>
struct lognormal_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R m;
  R s;
  R displ;
  R scale;
  R lo = -1;
  R hi = 1;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return each_of<R>(*this, u);
  }

  SYCL_EXTERNAL R one(R u) const {
    const R normal = gaussian_icdf<R>{m, s}.one(u);
    const R product = sycl::exp(normal) * scale;
    return product + displ;
  }
};

}  // namespace kestrel::tarn::rng::detail::gpu
