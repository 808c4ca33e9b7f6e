// SPDX-License-Identifier: Apache-2.0
// Continuous families with a closed inverse of their cdf: exponential, weibull, rayleigh, gumbel,
// laplace, cauchy; on both roads.
#pragma once

#include <kestrel/tarn/rng/continuous.hpp>

#include "distributions/closed_forms.hpp"
#include "distributions/host_routine.hpp"

namespace kestrel::tarn::rng::detail {

template <>
inline constexpr std::int64_t method_code<exponential_method::icdf_accurate> =
    RVX_RNG_METHOD_ACCURACY_FLAG;
template <>
inline constexpr std::int64_t method_code<weibull_method::icdf_accurate> =
    RVX_RNG_METHOD_ACCURACY_FLAG;
template <>
inline constexpr std::int64_t method_code<rayleigh_method::icdf_accurate> =
    RVX_RNG_METHOD_ACCURACY_FLAG;

/// Whether the method keeps rounding from leaving [a, infinity).
template <typename Method>
inline constexpr bool keeps_above = (method_code<Method> & RVX_RNG_METHOD_ACCURACY_FLAG) != 0;

template <typename T, typename Method>
struct distribution_impl<T, exponential<T, Method>, device_type::gpu> {
  using functor = gpu::exponential_icdf<T>;
  explicit distribution_impl(const exponential<T, Method>& distr)
      : kernel{distr.a(), distr.beta(), 0, 1, keeps_above<Method>} {}
  functor kernel;
};

template <typename T, typename Method>
struct distribution_impl<T, weibull<T, Method>, device_type::gpu> {
  using functor = gpu::weibull_icdf<T>;
  explicit distribution_impl(const weibull<T, Method>& distr)
      : kernel{distr.alpha(), distr.a(), distr.beta(), 0, 1, keeps_above<Method>} {}
  functor kernel;
};

template <typename T, typename Method>
struct distribution_impl<T, rayleigh<T, Method>, device_type::gpu> {
  using functor = gpu::rayleigh_icdf<T>;
  explicit distribution_impl(const rayleigh<T, Method>& distr)
      : kernel{distr.a(), distr.b(), 0, 1, keeps_above<Method>} {}
  functor kernel;
};

template <typename T, typename Method>
struct distribution_impl<T, gumbel<T, Method>, device_type::gpu> {
  using functor = gpu::gumbel_icdf<T>;
  explicit distribution_impl(const gumbel<T, Method>& distr) : kernel{distr.a(), distr.b()} {}
  functor kernel;
};

template <typename T, typename Method>
struct distribution_impl<T, laplace<T, Method>, device_type::gpu> {
  using functor = gpu::laplace_icdf<T>;
  explicit distribution_impl(const laplace<T, Method>& distr) : kernel{distr.a(), distr.b()} {}
  functor kernel;
};

template <typename T, typename Method>
struct distribution_impl<T, cauchy<T, Method>, device_type::gpu> {
  using functor = gpu::cauchy_icdf<T>;
  explicit distribution_impl(const cauchy<T, Method>& distr) : kernel{distr.a(), distr.b()} {}
  functor kernel;
};

TARN_REAL_ROUTINE(exponential, Exponential, distr.a(), distr.beta())
TARN_REAL_ROUTINE(weibull, Weibull, distr.alpha(), distr.a(), distr.beta())
TARN_REAL_ROUTINE(rayleigh, Rayleigh, distr.a(), distr.b())
TARN_REAL_ROUTINE(gumbel, Gumbel, distr.a(), distr.b())
TARN_REAL_ROUTINE(laplace, Laplace, distr.a(), distr.b())
TARN_REAL_ROUTINE(cauchy, Cauchy, distr.a(), distr.b())

}  // namespace kestrel::tarn::rng::detail
