// SPDX-License-Identifier: Apache-2.0
// Set-up of the gamma methods.
#include "distributions/gamma.hpp"

#include <cmath>

namespace tarn::statistics {

// The squeeze: with e = c x, ln u is accepted below -3 d f(e), where f does not depend on d
// (gamma_simd.cpp), so the least squeeze is the greatest (1 - exp(-3 d f(e))) / (81 d^2 e^4). Times
// d that falls as d grows, and the paper gives 0.0331 for d = 2/3.
//
// 9 d may be beyond the range: the root is taken of d. The plain form of the test has an absolute
// error of some d 2^-51, the series of four terms one of some (c x)^4 x^4 / 8 / 108 d: at 2^14 both
// stay below 2^-37, where a uniform of 32 bits has steps of 2^-32.
marsaglia_tsang::marsaglia_tsang(double shape)
    : d(shape - 1.0 / 3.0),
      c(1 / (3 * std::sqrt(d))),
      squeeze(0.0331 * 2 / 3 / d),
      narrow(d > 0x1p14) {}

weibull_rejection::weibull_rejection(double between)
    : shape(between),
      excess((1 - between) * std::exp(between * std::log(between) / (1 - between))) {}

}  // namespace tarn::statistics
