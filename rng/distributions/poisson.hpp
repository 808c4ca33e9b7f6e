// SPDX-License-Identifier: Apache-2.0
// poisson on both roads, and poisson_v, with a rate for each result, on the host.
#pragma once

#include <algorithm>
#include <limits>

#include <kestrel/tarn/rng/discrete.hpp>

#include "distributions/host_routine.hpp"
#include "distributions/poisson_functors.hpp"

namespace kestrel::tarn::rng::detail {

template <>
inline constexpr std::int64_t method_code<poisson_method::gaussian_icdf_based> =
    RVX_RNG_METHOD_POISSON_GAUSSIAN_ICDF;

/// The rate goes to float before anything depends on it. Rates that float cannot hold are its
/// greatest number: the results are those of the type either way.
template <typename T>
struct distribution_impl<T, poisson<T, poisson_method::gaussian_icdf_based>, device_type::gpu> {
  using functor = gpu::poisson_gaussian_icdf_based<T>;

  explicit distribution_impl(const poisson<T, poisson_method::gaussian_icdf_based>& distr)
      : kernel{static_cast<float>(
            std::min(distr.lambda(), static_cast<double>(std::numeric_limits<float>::max())))} {}

  functor kernel;
};

TARN_INTEGER_ROUTINE(poisson, Poisson, distr.lambda())
TARN_INTEGER_ROUTINE(poisson_v, PoissonV, distr.lambda().data())

}  // namespace kestrel::tarn::rng::detail
