// SPDX-License-Identifier: Apache-2.0
// beta on a device: by inversion where a shape is 1, else by rejection.
#pragma once

#include <cstdint>
#include <type_traits>

#include <kestrel/tarn/rng/continuous.hpp>
#include <sycl/sycl.hpp>

#include "distributions/beta_functors.hpp"
#include "distributions/compound_call.hpp"
#include "distributions/gamma.hpp"

namespace kestrel::tarn::rng::detail {

namespace gpu {

template <typename T>
using beta_candidates = functors::beta<T, beta_algorithm::acc_rej>;

/// The functor of shapes above 0, neither of which is 1.
template <typename T>
beta_candidates<T> beta_candidates_of(T p, T q);

/// Raises invalid_argument ("beta") for shapes of which next to nothing would be accepted, by what
/// the functor has made of them in its type: so small that both powers of the uniforms vanish, or
/// that the hat has no finite height, or so large that the test is lost in rounding.
template <typename T>
void check_beta_candidates(const beta_candidates<T>& candidates);

/// The functor where a shape is 1, or no number.
template <typename T>
functors::beta<T, beta_algorithm::pq> beta_power_of(T p, T q, T a, T b, bool accurate);

template <typename Method>
inline constexpr bool keeps_inside = std::is_same_v<Method, beta_method::cja_accurate>;

}  // namespace gpu

template <typename T, typename Method>
struct distribution_impl_ex<T, beta<T, Method>, device_type::gpu, gpu::beta_algorithm::acc_rej> {
  explicit distribution_impl_ex(const beta<T, Method>& distr)
      : kernel(gpu::beta_candidates_of(distr.p(), distr.q())),
        post{distr.a(), distr.b(), gpu::keeps_inside<Method>} {}

  std::int64_t consumed = 0;
  using functor = gpu::beta_candidates<T>;
  functor kernel;
  using post_type = gpu::functors::beta_post<T>;
  post_type post;
};

template <typename T, typename Method>
struct distribution_impl_ex<T, beta<T, Method>, device_type::gpu, gpu::beta_algorithm::pq> {
  explicit distribution_impl_ex(const beta<T, Method>& distr)
      : kernel(gpu::beta_power_of(distr.p(), distr.q(), distr.a(), distr.b(),
                                  gpu::keeps_inside<Method>)) {}

  using functor = gpu::functors::beta<T, gpu::beta_algorithm::pq>;
  functor kernel;
};

namespace gpu {

TARN_ACCEPTANCE_REJECTION(extern template, float, functors::beta_post<float>)
TARN_ACCEPTANCE_REJECTION(extern template, double, functors::beta_post<double>)

/// Whether a shape is 1, or not to be compared with it.
template <typename T>
bool has_no_side(T shape) {
  return !(shape < 1 || shape > 1);
}

/// Asynchronous by inversion, over on return by rejection.
template <typename Engine, typename Out, typename T, typename Method>
compound_result generate_compound(const compound_call<Engine, Out>& call,
                                  const beta<T, Method>& distr) {
  if (has_no_side(distr.p()) || has_no_side(distr.q())) {
    using algorithm = beta_algorithm::pq;
    const distribution_impl_ex<T, beta<T, Method>, device_type::gpu, algorithm> inversion(distr);
    return {call.draw(inversion, call.n, call.out), call.n};
  }
  using algorithm = beta_algorithm::acc_rej;
  distribution_impl_ex<T, beta<T, Method>, device_type::gpu, algorithm> rejection(distr);
  check_beta_candidates(rejection.kernel);
  return call.reject(rejection, call.out);
}

}  // namespace gpu
}  // namespace kestrel::tarn::rng::detail
