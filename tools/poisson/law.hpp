// SPDX-License-Identifier: Apache-2.0
// The law of poisson against the normal one. Its cdf P(X <= k) = Q(k + 1, lambda), the regularised
// upper incomplete gamma function, holds for all reals k > -1, so that the inverse of the law is
// the integer above a smooth function of the normal deviate of the same probability.
#pragma once

namespace poisson {

using real = long double;

// sqrt(2) times the greatest value of the inverse error function in float: no deviate of a kernel
// lies beyond.
constexpr real greatest_deviate = 5.4199834L;

real normal_density(real z);
real normal_cdf(real z);

// z with Phi(z) = Q(x + 1, lambda), -1 < x.
real deviate(real x, real lambda);

// The other way round: x with Q(x + 1, lambda) = Phi(z).
real inverse(real z, real lambda);

}  // namespace poisson
