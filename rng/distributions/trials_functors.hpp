// SPDX-License-Identifier: Apache-2.0
// Kernel functors of bernoulli and geometric: inversion in float, whatever the result type, with
// the probability rounded to float.
#pragma once

#include <sycl/sycl.hpp>

#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"
#include "distributions/uniform.hpp"

namespace kestrel::tarn::rng::detail::gpu {

template <typename T>
struct bernoulli_icdf {
  using source = float;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  float r0;
  float r1;
  float p;

  real_range<float> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<T, results> operator()(const sycl::vec<float, 4>& u) const {
    return each_of<T>(*this, u);
  }

  /// A uniform may be rounded to 1: it is below 1 all the same.
  SYCL_EXTERNAL T one(float u) const { return u < p || p == 1 ? T{1} : T{0}; }
};

/// Kept: where 1 - p rounds to 1 (p <= 2^-25) the divisor ln(1 - p) is 0 and every quotient minus
/// infinity, so that all results are the least number of the type; results depend on it.
template <typename T>
struct geometric_icdf {
  using source = float;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  float r0;
  float r1;
  float p;

  real_range<float> range() const { return {r0, r1}; }

  SYCL_EXTERNAL sycl::vec<T, results> operator()(const sycl::vec<float, 4>& u) const {
    const float scale = reciprocal();
    sycl::vec<T, results> out;
    for (int i = 0; i < results; ++i) {
      out[i] = scaled(u[i], scale);
    }
    return out;
  }

  SYCL_EXTERNAL T one(float u) const { return scaled(u, reciprocal()); }

 private:
  SYCL_EXTERNAL float reciprocal() const { return 1 / guarded_log(1 - p); }

  SYCL_EXTERNAL static T scaled(float u, float scale) {
    return floor_to_integer<T>(guarded_log(u) * scale);
  }
};

}  // namespace kestrel::tarn::rng::detail::gpu
