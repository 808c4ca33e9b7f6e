// SPDX-License-Identifier: Apache-2.0
// Kernels that turn canonical reals into values by the inverse of a distribution function. They use
// u up; out may be u. `streaming` stores around the caches.
#pragma once

#include <cstddef>

#include "distributions/placement.hpp"

namespace tarn::statistics {

// The standard variates, of u in [0, 1] with l = ln(u): -l, sqrt(-l), ln(-l); and tan(u) of u in
// [-pi/2, pi/2].
#define TARN_CLOSED_FORM(name)                                                            \
  void name##_form(float* u, std::size_t n, const placement<float>& to, bool streaming,   \
                   float* out);                                                           \
  void name##_form(double* u, std::size_t n, const placement<double>& to, bool streaming, \
                   double* out);
TARN_CLOSED_FORM(exponential)
TARN_CLOSED_FORM(rayleigh)
TARN_CLOSED_FORM(gumbel)
TARN_CLOSED_FORM(cauchy)
#undef TARN_CLOSED_FORM

// (-l)^exponent, exponent > 0.
void weibull_form(float* u, std::size_t n, float exponent, const placement<float>& to,
                  bool streaming, float* out);
void weibull_form(double* u, std::size_t n, double exponent, const placement<double>& to,
                  bool streaming, double* out);

// n values from n pairs of [0, 1]: ln(u0), its sign turned unless u1 > 0.5.
void laplace_form(float* u, std::size_t n, const placement<float>& to, float* out);
void laplace_form(double* u, std::size_t n, const placement<double>& to, double* out);

}  // namespace tarn::statistics
