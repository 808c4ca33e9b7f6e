// SPDX-License-Identifier: Apache-2.0
// gaussian and lognormal.
#pragma once

#include <kestrel/tarn/rng/continuous.hpp>

#include "distributions/host_routine.hpp"

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

TARN_REAL_ROUTINE(gaussian, Gaussian, distr.mean(), distr.stddev())
TARN_REAL_ROUTINE(lognormal, Lognormal, distr.m(), distr.s(), distr.displ(), distr.scale())

}  // namespace kestrel::tarn::rng::detail
