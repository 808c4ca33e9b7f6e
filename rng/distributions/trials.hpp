// SPDX-License-Identifier: Apache-2.0
// Counts of trials: bernoulli, geometric, binomial, negative_binomial, hypergeometric, multinomial.
#pragma once

#include <kestrel/tarn/rng/discrete.hpp>

#include "distributions/host_routine.hpp"

namespace kestrel::tarn::rng::detail {

TARN_INTEGER_ROUTINE(bernoulli, Bernoulli, distr.p())
TARN_INTEGER_ROUTINE(geometric, Geometric, distr.p())
TARN_INTEGER_ROUTINE(binomial, Binomial, distr.ntrial(), distr.p())
TARN_INTEGER_ROUTINE(negative_binomial, Negbinomial, distr.a(), distr.p())
TARN_INTEGER_ROUTINE(hypergeometric, Hypergeometric, distr.l(), distr.s(), distr.m())
TARN_INTEGER_ROUTINE(multinomial, Multinomial, distr.ntrial(),
                     static_cast<std::int32_t>(distr.p().size()), distr.p().data())

}  // namespace kestrel::tarn::rng::detail
