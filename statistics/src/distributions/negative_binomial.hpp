// SPDX-License-Identifier: Apache-2.0
// Negative binomial variates: failures before the a-th success, a a real number. Results above the
// greatest 32-bit integer are that integer.
//
// With v = (a - 1) (1 - p) / p, which is the mode:
//   v < 100 and p >= 1/64          inversion, one word a value
//   a >= 1 otherwise               rejection from under a mountain with a flat top, two words a
//                                  candidate
//   a < 1 and p < 1/64             rejection from under a power and an exponential, two words a
//                                  candidate
#pragma once

#include <cstddef>
#include <cstdint>

#include "blocks.hpp"
#include "distributions/hat.hpp"
#include "distributions/log_ratio.hpp"
#include "distributions/tabulated_law.hpp"

namespace tarn::statistics {

struct negative_binomial_law {
  negative_binomial_law(double shape, double probability);

  bool zero() const { return q == 0; }
  // Whether results are practically certain to lie beyond the greatest representable count: all
  // others together are less likely than 2^-68.
  bool saturated() const;
  bool by_table() const { return v < 100 && p >= 0x1p-6; }

  double a, p, q;
  double v;
};

// Inversion for laws with by_table().
tabulated_values invert_negative_binomial(const negative_binomial_law& law, std::size_t uses);

// Rejection for a >= 1. The law is concave between the real zeros mode - 1/2 -+ sqrt(...) of its
// second difference and convex outside. Pieces of the hat, in the order of their areas:
//   the rectangle of height 1 between the zeros,
//   right and left of it trapezoids that end where the tangent at the zero does, parallel to it,
//   right and left of those exponential tails through two neighbouring values.
// Chords and tangents are the squeezes.
struct nbar {
  nbar(const negative_binomial_law& law, std::size_t uses);

  std::size_t attempt(const double* uniforms, std::size_t count, std::int32_t* out) const;

  struct side {
    double knee, ratio;          // where the law turns convex, and its ratio there
    double chord;                // fall per step of the chord from mode to knee
    double tangent;              // fall per step of the tangent at the knee
    double foot;                 // end of the trapezoid
    double width, excess;        // of the trapezoid; its height at the foot, divided by `ratio`
    double decay;                // logarithm of the factor of the tail per step outwards, below 0
    double slope_end, tail_end;  // sums of the areas up to the trapezoid and up to the tail
    double slope_area;
  };

  double begin;   // of the rectangle
  double middle;  // its area
  side right, left;
  double total;
  near_ratios near;
  log_ratio ratio;
  image result;
};

// Rejection for a < 1 and small p: 0 at sight; from 1 on the hat is x^(a - 1), and from about 1 / p
// on an exponential (after Ahrens, Dieter: Computer methods for sampling from gamma, beta, poisson
// and binomial distributions, Computing 12, 1974, who do so for gamma variates).
struct power_hat {
  explicit power_hat(const negative_binomial_law& law);

  std::size_t attempt(const double* uniforms, std::size_t count, std::int32_t* out) const;

  double a, rate;   // rate = -ln(1 - p)
  double border;    // between power and exponential
  double log_span;  // ln(border / (a / 2))
  double power_area, total;
  double log_border;  // height of the hat at the border
};

}  // namespace tarn::statistics
