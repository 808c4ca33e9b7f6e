// SPDX-License-Identifier: Apache-2.0
// Kernel functors of the families whose cdf has a closed inverse: each is a formula of l = ln(u)
// with u of [0, 1), apart from cauchy. One multiply-add places the result; the accurate methods
// keep its rounding from falling below `a`.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "distributions/formulas.hpp"
#include "distributions/kernel_functor.hpp"

namespace kestrel::tarn::rng::detail::gpu {

template <typename R>
struct exponential_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R a;
  R beta;
  R lo;
  R hi;
  std::uint8_t accurate;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return each_of<R>(*this, u);
  }

  SYCL_EXTERNAL R one(R u) const {
    const R x = sycl::mad(-guarded_log(u), beta, a);
    return accurate != 0 ? sycl::fmax(x, a) : x;
  }
};

/// The exponent is `alpha` itself, where the law of shape alpha has its reciprocal; results depend
/// on it. The host road takes the reciprocal.
template <typename R>
struct weibull_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R alpha;
  R a;
  R beta;
  R lo;
  R hi;
  std::uint8_t accurate;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return each_of<R>(*this, u);
  }

  SYCL_EXTERNAL R one(R u) const {
    const R x = sycl::mad(beta, sycl::powr(-guarded_log(u), alpha), a);
    return accurate != 0 ? sycl::fmax(x, a) : x;
  }
};

/// No factor sqrt(2): the law's usual sigma is b / sqrt(2), on the host road as well.
template <typename R>
struct rayleigh_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R a;
  R b;
  R lo;
  R hi;
  std::uint8_t accurate;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return each_of<R>(*this, u);
  }

  SYCL_EXTERNAL R one(R u) const {
    const R x = sycl::mad(b, sycl::sqrt(-guarded_log(u)), a);
    return accurate != 0 ? sycl::fmax(x, a) : x;
  }
};

template <typename R>
struct gumbel_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R a;
  R b;
  R lo = 0;
  R hi = 1;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return each_of<R>(*this, u);
  }

  /// The second logarithm is guarded as well: -ln(u) is 0 where rounding brings u to 1.
  SYCL_EXTERNAL R one(R u) const { return sycl::mad(guarded_log(-guarded_log(u)), b, a); }
};

template <typename R>
struct cauchy_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R a;
  R b;
  R lo = static_cast<R>(-1.57079632679489661923);
  R hi = static_cast<R>(1.57079632679489661923);

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return each_of<R>(*this, u);
  }

  SYCL_EXTERNAL R one(R u) const { return sycl::mad(b, sycl::tan(u), a); }
};

/// From pairs: the distance from `a` and the side.
template <typename R>
struct laplace_icdf {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 2;
  static constexpr int pair_results = 1;

  R a;
  R b;
  R lo = 0;
  R hi = 1;

  real_range<R> range() const { return {lo, hi}; }

  SYCL_EXTERNAL sycl::vec<R, results> operator()(const sycl::vec<R, 4>& u) const {
    return pairs_of<R>(*this, u);
  }

  /// The half and what is below lie on the right; a u1 that is no number goes to the left.
  SYCL_EXTERNAL void pair(R u0, R u1, R* out) const {
    out[0] = sycl::mad(u1 <= static_cast<R>(0.5) ? -b : b, guarded_log(u0), a);
  }
};

}  // namespace kestrel::tarn::rng::detail::gpu
