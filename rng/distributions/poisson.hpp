// SPDX-License-Identifier: Apache-2.0
// poisson, and poisson_v with a rate for each result.
#pragma once

#include <kestrel/tarn/rng/discrete.hpp>

#include "distributions/host_routine.hpp"

namespace kestrel::tarn::rng::detail {

template <>
inline constexpr std::int64_t method_code<poisson_method::gaussian_icdf_based> =
    RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF;

TARN_INTEGER_ROUTINE(poisson, Poisson, distr.lambda())
TARN_INTEGER_ROUTINE(poisson_v, PoissonV, distr.lambda().data())

}  // namespace kestrel::tarn::rng::detail
