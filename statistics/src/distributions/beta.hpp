// SPDX-License-Identifier: Apache-2.0
// Standard beta variates of shapes p and q: Cheng's method for two shapes above 1, Johnk's or
// Atkinson's for two below, Atkinson's for one above and one below, inversion where a shape is 1.
// All of them accept at least two thirds of their candidates, whatever the shapes. Values near
// either end are computed without cancellation, and shapes up to the ends of the range of doubles
// are safe.
#pragma once

#include <algorithm>
#include <cstddef>

#include "blocks.hpp"
#include "distributions/candidates.hpp"
#include "distributions/canonical.hpp"

namespace tarn::statistics {

// p, q > 1: the method BB, rejection from the logistic distribution of the log-odds (Cheng:
// Generating Beta Variates with Nonintegral Shape Parameters, Comm. ACM 21, 1978). Two uniforms:
// log-odds, decision. Accepts at least e / 4 = 0.68 of the candidates.
//
// With a the lesser shape, b the greater, s = a + b, and the logistic number L of the first
// uniform: V = lambda L, and the value is the one with the log-odds V + ln(a / b).
struct cheng_bb {
  static constexpr std::size_t width = 2;

  double a, ratio;   // b / a
  double sum, part;  // s, a / s
  double lambda;     // sqrt((s - 2) / (2 a b - s))
  bool first_is_a;   // p is the lesser shape
  bool narrow;       // the shapes are so large that the test needs its series
  double series[5];  // its coefficients of L^2 to L^6

  cheng_bb(double p, double q);
  void attempt(candidates& block, std::size_t n) const;
};

// p, q < 1, not both close to 1: powers of two uniforms until their sum is at most 1 (Johnk:
// Erzeugung von betaverteilten und gammaverteilten Zufallszahlen, Metrika 8, 1964), with logarithms
// where the powers underflow. Accepts more than 0.7 of the candidates.
struct johnk {
  static constexpr std::size_t width = 2;

  double greater;        // shape
  double first, second;  // shapes as parts of the greater

  johnk(double p, double q);
  void attempt(candidates& block, std::size_t n) const;
};

// p < 1, q any but 1: the switching method (Atkinson: A family of switching algorithms for the
// computer generation of beta random variables, Biometrika 66, 1979). Below the point t the
// majorant is a multiple of x^(p-1), above it of (1-x)^(q-1). Two uniforms: value, decision. With p
// above 1 and q below, the same on 1 - x. Accepts more than 0.77 of the candidates.
struct atkinson {
  static constexpr std::size_t width = 2;

  double p, q;
  double left, right;      // probabilities of the majorant below and above t
  double log_t, log_rest;  // ln t, ln(1 - t)
  double left_bound;       // ln of the least 1 - x that the left part counts with: 0 or log_rest
  bool mirrored;           // p and q have changed places

  atkinson(double p, double q);
  void attempt(candidates& block, std::size_t n) const;
};

// Which of the two methods for two shapes below 1 is taken.
bool prefers_johnk(double p, double q);

// The values of n uniforms of [0, 1], in their place; x is that of whole_vectors(n).
void invert_beta(double shape, bool complement, std::size_t n, double* x);

// One shape is 1: x^p or 1 - (1 - x)^q is uniform. One word each.
template <class Real>
struct beta_by_inversion {
  double shape;     // the other one
  bool complement;  // p is 1
  affine_place<Real> where;

  void operator()(const word_source& source, std::size_t n, Real* out, bool) const {
    const canonical<Real> uniforms(source, 0, 1);
    Real drawn[block_words];
    alignas(64) double x[block_words];
    while (n != 0) {
      const std::size_t count = std::min(n, block_words);
      uniforms.draw(source, count, drawn);
      std::fill(std::copy_n(drawn, count, x), x + whole_vectors(count), 0.5);
      invert_beta(shape, complement, count, x);
      put_in_place(x, count, where, out);
      out += count;
      n -= count;
    }
  }
};

}  // namespace tarn::statistics
