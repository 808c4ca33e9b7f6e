// SPDX-License-Identifier: Apache-2.0
// gamma, chi_square and beta on the host. Their device roads are the modules <family>_gpu_dispatch.
#pragma once

#include <kestrel/tarn/rng/continuous.hpp>

#include "distributions/host_routine.hpp"

namespace kestrel::tarn::rng::detail {

template <>
inline constexpr std::int64_t method_code<gamma_method::marsaglia_accurate> =
    RVX_RNG_METHOD_ACCURACY_FLAG;
template <>
inline constexpr std::int64_t method_code<beta_method::cja_accurate> = RVX_RNG_METHOD_ACCURACY_FLAG;

TARN_REAL_ROUTINE(gamma, Gamma, distr.alpha(), distr.a(), distr.beta())
TARN_REAL_ROUTINE(chi_square, ChiSquare, distr.n())
TARN_REAL_ROUTINE(beta, Beta, distr.p(), distr.q(), distr.a(), distr.b())

}  // namespace kestrel::tarn::rng::detail
