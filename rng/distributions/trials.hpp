// SPDX-License-Identifier: Apache-2.0
// Counts of trials: bernoulli, geometric, binomial, negative_binomial, hypergeometric, multinomial;
// the first two on both roads, the others on the host.
#pragma once

#include <kestrel/tarn/rng/discrete.hpp>

#include "distributions/host_routine.hpp"
#include "distributions/trials_functors.hpp"

namespace kestrel::tarn::rng::detail {

template <typename T, typename Method>
struct distribution_impl<T, bernoulli<T, Method>, device_type::gpu> {
  using functor = gpu::bernoulli_icdf<T>;
  explicit distribution_impl(const bernoulli<T, Method>& distr)
      : kernel{0, 1, static_cast<float>(distr.p())} {}
  functor kernel;
};

template <typename T, typename Method>
struct distribution_impl<T, geometric<T, Method>, device_type::gpu> {
  using functor = gpu::geometric_icdf<T>;
  explicit distribution_impl(const geometric<T, Method>& distr)
      : kernel{0, 1, static_cast<float>(distr.p())} {}
  functor kernel;
};

TARN_INTEGER_ROUTINE(bernoulli, Bernoulli, distr.p())
TARN_INTEGER_ROUTINE(geometric, Geometric, distr.p())
TARN_INTEGER_ROUTINE(binomial, Binomial, distr.ntrial(), distr.p())
TARN_INTEGER_ROUTINE(negative_binomial, Negbinomial, distr.a(), distr.p())
TARN_INTEGER_ROUTINE(hypergeometric, Hypergeometric, distr.l(), distr.s(), distr.m())
TARN_INTEGER_ROUTINE(multinomial, Multinomial, distr.ntrial(),
                     static_cast<std::int32_t>(distr.p().size()), distr.p().data())

}  // namespace kestrel::tarn::rng::detail
