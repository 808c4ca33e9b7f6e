// SPDX-License-Identifier: Apache-2.0
// Which methods and parameters a routine can have. Each function gives the position, among the
// arguments of its routine, of the first one that it cannot, or 0. Shared by the plain names, which
// report the position, and the raw entries, which only refuse. Whatever is not finite is out of
// range.
#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>

namespace tarn::statistics::parameters {

// Bits that a method code may have.
inline constexpr int accuracy_methods = 0x40000000;
inline constexpr int gaussian_methods = 3;
inline constexpr int lognormal_methods = accuracy_methods | 1;
inline constexpr int any_method = 0x7FFFFFFF;  // routines with a single method take any code

inline constexpr int good = 0;

template <class Real>
bool positive(Real x) {
  return x > 0 && std::isfinite(x);
}

template <class Real>
bool all_finite(const Real* x, std::size_t n) {
  return std::all_of(x, x + n, [](Real number) { return std::isfinite(number); });
}

// Pairs of a condition and a position, looked at in order.
inline int first_bad() {
  return good;
}
template <class... Rest>
int first_bad(bool holds, int position, Rest... rest) {
  return holds ? first_bad(rest...) : position;
}

// Results are made of b - a and a + b, taken in their type: both have to be finite, and so are then
// the bounds.
template <class Real>
int uniform(Real a, Real b) {
  return first_bad(a < b && std::isfinite(b - a) && std::isfinite(a + b), 5);
}
inline int uniform(std::int32_t a, std::int32_t b) {
  return first_bad(a < b, 5);
}

// gaussian, exponential, rayleigh, gumbel, laplace, cauchy: a place and a scale.
template <class Real>
int place_and_scale(Real place, Real scale) {
  return first_bad(std::isfinite(place), 5, positive(scale), 6);
}

template <class Real>
int lognormal(Real m, Real s, Real displ, Real scale) {
  return first_bad(std::isfinite(m), 5, positive(s), 6, std::isfinite(displ), 7, positive(scale),
                   8);
}

// gamma, weibull.
template <class Real>
int shape_place_scale(Real alpha, Real a, Real beta) {
  return first_bad(positive(alpha), 5, std::isfinite(a), 6, positive(beta), 7);
}

template <class Real>
int beta(Real p, Real q, Real a, Real b) {
  return first_bad(positive(p), 5, positive(q), 6, std::isfinite(a), 7, positive(b), 8);
}

inline int chi_square(std::int32_t degrees) {
  return first_bad(degrees > 0, 5);
}

// The means and the factor themselves are looked at when they are used.
template <class Real>
int gaussian_mv(std::int32_t dimension, std::int32_t layout, const Real* mean, const Real* matrix) {
  return first_bad(dimension > 0, 5, 0 <= layout && layout <= 2, 6, mean != nullptr, 7,
                   matrix != nullptr, 8);
}

inline int bernoulli(double p) {
  return first_bad(0 <= p && p <= 1, 5);
}

// p = 0 has no finite value.
inline int geometric(double p) {
  return first_bad(0 < p && p <= 1, 5);
}

inline int binomial(std::int32_t ntrial, double p) {
  return first_bad(ntrial > 0, 5, 0 <= p && p <= 1, 6);
}

inline int hypergeometric(std::int32_t l, std::int32_t s, std::int32_t m) {
  return first_bad(s >= 0, 6, m >= 0, 7, l >= s && l >= m, 5);
}

inline int negative_binomial(double a, double p) {
  return first_bad(positive(a), 5, 0 < p && p <= 1, 6);
}

// The probabilities themselves are looked at when they are used.
inline int multinomial(std::int32_t ntrial, std::int32_t categories, const double* p) {
  return first_bad(ntrial >= 0, 5, categories > 0, 6, p != nullptr, 7);
}

inline int poisson(double lambda) {
  return first_bad(positive(lambda), 5);
}

inline int poisson_v(const double* lambda) {
  return first_bad(lambda != nullptr, 5);
}

}  // namespace tarn::statistics::parameters
