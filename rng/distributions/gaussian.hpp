// SPDX-License-Identifier: Apache-2.0
// gaussian and lognormal on both roads.
#pragma once

#include <type_traits>

#include <kestrel/tarn/rng/continuous.hpp>

#include "distributions/box_muller.hpp"
#include "distributions/host_routine.hpp"
#include "distributions/normal_icdf.hpp"

namespace kestrel::tarn::rng::detail {

template <>
inline constexpr std::int64_t method_code<gaussian_method::box_muller2> =
    RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2;
template <>
inline constexpr std::int64_t method_code<gaussian_method::icdf> = RVX_RNG_METHOD_GAUSSIAN_ICDF;
template <>
inline constexpr std::int64_t method_code<lognormal_method::box_muller2_accurate> =
    RVX_RNG_METHOD_ACCURACY_FLAG;
template <>
inline constexpr std::int64_t method_code<lognormal_method::icdf> = RVX_RNG_METHOD_LOGNORMAL_ICDF;
template <>
inline constexpr std::int64_t method_code<lognormal_method::icdf_accurate> =
    RVX_RNG_METHOD_ACCURACY_FLAG | RVX_RNG_METHOD_LOGNORMAL_ICDF;

template <typename T, typename Method>
struct distribution_impl<T, gaussian<T, Method>, device_type::gpu> {
  using by_pairs = std::conditional_t<std::is_same_v<Method, gaussian_method::box_muller>,
                                      gpu::gaussian_box_muller<T>, gpu::gaussian_box_muller2<T>>;
  using functor = std::conditional_t<std::is_same_v<Method, gaussian_method::icdf>,
                                     gpu::gaussian_icdf<T>, by_pairs>;

  explicit distribution_impl(const gaussian<T, Method>& distr)
      : kernel{distr.mean(), distr.stddev()} {}

  functor kernel;
};

/// box_muller2_accurate is drawn by inversion, and no result is kept from rounding below `displ`:
/// results depend on it.
template <typename T, typename Method>
struct distribution_impl<T, lognormal<T, Method>, device_type::gpu> {
  using functor = std::conditional_t<std::is_same_v<Method, lognormal_method::box_muller2>,
                                     gpu::lognormal_box_muller2<T>, gpu::lognormal_icdf<T>>;

  explicit distribution_impl(const lognormal<T, Method>& distr)
      : kernel{distr.m(), distr.s(), distr.displ(), distr.scale()} {}

  functor kernel;
};

TARN_REAL_ROUTINE(gaussian, Gaussian, distr.mean(), distr.stddev())
TARN_REAL_ROUTINE(lognormal, Lognormal, distr.m(), distr.s(), distr.displ(), distr.scale())

}  // namespace kestrel::tarn::rng::detail
