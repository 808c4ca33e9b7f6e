// SPDX-License-Identifier: Apache-2.0
// Polynomials for the inverse of poisson's law, octave by octave of the rate:
//
//   x(z) = A + B z (P1 + z (P2 + z (P3 + z P4)))
//
// where A, B and P1 to P4 are polynomials in t, the mantissa of the rate less 1.
#pragma once

#include <array>

#include "law.hpp"

namespace poisson {

// x as a function of the deviate, for one rate.
struct curve {
  real centre, scale;           // A and B
  std::array<real, 4> factors;  // P1 to P4
  real operator()(real z) const;
};

// Rates of [2^e, 2^(e + 1)) for e = 0 to 6, below 100: A of 3 coefficients, the others of 4 each.
constexpr int medium_rows = 7;
constexpr real medium_end = 100;
using medium_row = std::array<float, 23>;
medium_row fit_medium(int e);
curve medium_curve(const medium_row& row, real lambda);

// Rates of [2^(e - 4), 2^(e - 3)) for e = 0 to 17, the last row for all above as well: of A -
// lambda and B - sqrt(lambda) two coefficients each, of the others 4 each.
constexpr int wide_rows = 18;
using wide_row = std::array<double, 20>;
wide_row fit_wide(int e);
curve wide_curve(const wide_row& row, real lambda);

// The distance in total variation from the law of integers above x(z), z normal and cut off at the
// greatest deviates.
real total_variation(const curve& x, real lambda);

// The largest |x(z_k) - k| / B over the values k of deviates z_k up to 3 from the median.
real largest_deviation(const curve& x, real lambda);

}  // namespace poisson
