// SPDX-License-Identifier: Apache-2.0
// Standard gamma variates by rejection: one method for each range of the shape. All of them accept
// more than 0.74 of their candidates, whatever the shape. The shape 1 is the exponential
// distribution and none of this file's.
#pragma once

#include <cstddef>

#include "distributions/candidates.hpp"

namespace tarn::statistics {

// Shapes above 1. A normal number x of Box and Muller gives the value d v with v = (1 + c x)^3
// (Marsaglia, Tsang: A Simple Method for Generating Gamma Variables, ACM TOMS 26, 2000). Three
// uniforms: radius and angle of the normal number, of which one coordinate is used, so that half a
// turn is enough; and the one that decides. Accepts more than 0.95 of the candidates.
struct marsaglia_tsang {
  static constexpr std::size_t width = 3;

  double d;        // shape - 1/3
  double c;        // 1 / sqrt(9 d)
  double squeeze;  // uniforms below 1 - squeeze x^4 accept
  bool narrow;     // c x is so small that the test needs its series

  explicit marsaglia_tsang(double shape);
  void attempt(candidates& block, std::size_t n) const;
};

// Shapes between 0.6 and 1: rejection from Weibull's distribution (Vaduva: On computer generation
// of gamma random variables by rejection and composition procedures, Math. Operationsforsch.
// Statist. 8, 1977; Devroye: Non-Uniform Random Variate Generation, 1986, section IX.3). Two
// uniforms: value, decision. Accepts more than 0.74.
struct weibull_rejection {
  static constexpr std::size_t width = 2;

  double shape;
  double excess;  // greatest x^shape - x: (1 - shape) shape^(shape / (1 - shape))

  explicit weibull_rejection(double shape);
  void attempt(candidates& block, std::size_t n) const;
};

// Shapes up to 0.6: x^shape is uniform up to 1 - shape and exponential beyond (Devroye, the same,
// section IX.3, after Vaduva; a closer majorant than that of Ahrens and Dieter's GS, Computing 12,
// 1974). Two uniforms: value, decision. Accepts Gamma(1 + shape) > 0.88.
struct power_rejection {
  static constexpr std::size_t width = 2;

  double shape;

  explicit power_rejection(double positive) : shape(positive) {}
  void attempt(candidates& block, std::size_t n) const;
};

inline constexpr double last_power_shape = 0.6;

}  // namespace tarn::statistics
