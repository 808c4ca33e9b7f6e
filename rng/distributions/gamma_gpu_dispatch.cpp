// SPDX-License-Identifier: Apache-2.0
// The set-up of gamma's methods, in the result's type, and its passes, which are those of
// chi_square as well.
#include "distributions/gamma_gpu_dispatch.hpp"

#include <cmath>

namespace kestrel::tarn::rng::detail::gpu {

template <typename T>
functors::gamma<T> gamma_candidates(T alpha) {
  using functors::gamma_way;
  const T inverse = 1 / alpha;
  if (alpha > 1) {
    return {0,
            1,
            alpha,
            gamma_way::cube,
            std::sqrt(1 / (alpha * 9 + -3)),
            alpha + functors::minus_third<T>};
  }
  if (alpha > static_cast<T>(0.6)) {
    const T advantage = (1 - alpha) * std::exp(alpha * std::log(alpha) / (1 - alpha));
    return {0, 1, alpha, gamma_way::weibull, inverse, advantage};
  }
  return {0, 1, alpha, gamma_way::power, inverse, 1 - alpha};
}

template functors::gamma<float> gamma_candidates(float);
template functors::gamma<double> gamma_candidates(double);

TARN_ACCEPTANCE_REJECTION(template, float, functors::gamma_post<float>)
TARN_ACCEPTANCE_REJECTION(template, double, functors::gamma_post<double>)

}  // namespace kestrel::tarn::rng::detail::gpu
