// SPDX-License-Identifier: Apache-2.0
// gamma on a device: shape 1 by inversion, as exponential, all others by rejection.
#pragma once

#include <cstdint>
#include <type_traits>

#include <kestrel/tarn/rng/continuous.hpp>
#include <sycl/sycl.hpp>

#include "distributions/compound_call.hpp"
#include "distributions/gamma.hpp"
#include "distributions/gamma_functors.hpp"
#include "distributions/inverse_cdf.hpp"

namespace kestrel::tarn::rng::detail {

namespace gpu {

/// The functor of a shape above 0 other than 1.
template <typename T>
functors::gamma<T> gamma_candidates(T alpha);

}  // namespace gpu

/// For shapes other than 1.
template <typename T, typename Method>
struct distribution_impl<T, gamma<T, Method>, device_type::gpu> {
  explicit distribution_impl(const gamma<T, Method>& distr)
      : kernel(gpu::gamma_candidates(distr.alpha())),
        post{distr.a(), distr.beta(), keeps_above<Method>} {}

  std::int64_t consumed = 0;
  using functor = gpu::functors::gamma<T>;
  functor kernel;
  using post_type = gpu::functors::gamma_post<T>;
  post_type post;
};

namespace gpu {

TARN_ACCEPTANCE_REJECTION(extern template, float, functors::gamma_post<float>)
TARN_ACCEPTANCE_REJECTION(extern template, double, functors::gamma_post<double>)

/// Asynchronous for shape 1, over on return for the others.
template <typename Engine, typename Out, typename T, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const gamma<T, Method>& distr) {
  if (distr.alpha() == 1) {
    using method = std::conditional_t<keeps_above<Method>, exponential_method::icdf_accurate,
                                      exponential_method::icdf>;
    using inverted = exponential<T, method>;
    const distribution_impl<T, inverted, device_type::gpu> inversion(
        inverted(distr.a(), distr.beta()));
    return {call.draw(inversion, call.n, call.out), call.n};
  }
  distribution_impl<T, gamma<T, Method>, device_type::gpu> rejection(distr);
  return call.reject(rejection, call.out);
}

}  // namespace gpu
}  // namespace kestrel::tarn::rng::detail
