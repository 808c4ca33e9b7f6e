// SPDX-License-Identifier: Apache-2.0
// gaussian_mv.
#pragma once

#include <kestrel/tarn/rng/gaussian_mv.hpp>

#include "distributions/host_routine.hpp"

namespace kestrel::tarn::rng::detail {

template <>
inline constexpr std::int64_t method_code<gaussian_mv_method::box_muller2> =
    RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2;
template <>
inline constexpr std::int64_t method_code<gaussian_mv_method::icdf> = RVX_RNG_METHOD_GAUSSIAN_ICDF;

template <typename T, matrix_layout layout, typename Method>
struct distribution_impl<T, gaussian_mv<T, layout, Method>, device_type::cpu> {
  const gaussian_mv<T, layout, Method>& distr;

  int generate(rvx_stream stream, std::int64_t n, T* r) const {
    return real_routine<T>(rvxsRngGaussianMV, rvxdRngGaussianMV)(
        method_code<Method>, stream, n, r, static_cast<std::int32_t>(distr.dimension()),
        static_cast<std::int32_t>(layout), distr.mean().data(), distr.matrix().data());
  }
};

}  // namespace kestrel::tarn::rng::detail
