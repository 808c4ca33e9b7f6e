// SPDX-License-Identifier: Apache-2.0
// Continuous families with a closed inverse of their cdf: exponential, weibull, rayleigh, gumbel,
// laplace, cauchy.
#pragma once

#include <kestrel/tarn/rng/continuous.hpp>

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

TARN_REAL_ROUTINE(exponential, Exponential, distr.a(), distr.beta())
TARN_REAL_ROUTINE(weibull, Weibull, distr.alpha(), distr.a(), distr.beta())
TARN_REAL_ROUTINE(rayleigh, Rayleigh, distr.a(), distr.b())
TARN_REAL_ROUTINE(gumbel, Gumbel, distr.a(), distr.b())
TARN_REAL_ROUTINE(laplace, Laplace, distr.a(), distr.b())
TARN_REAL_ROUTINE(cauchy, Cauchy, distr.a(), distr.b())

}  // namespace kestrel::tarn::rng::detail
