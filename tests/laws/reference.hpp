// SPDX-License-Identifier: Apache-2.0
// The reference laws, from Boost.Math, in the parametrisations of tarn_rvx.h. Nothing here is
// shared with the library under test.
#pragma once

#include "law.hpp"

namespace laws {

// a + b * X for X of the law `of`, which must not be discrete; b > 0.
law placed(const law& of, double a, double b);

law uniform(double a, double b);
law gaussian(double mean, double stddev);
law lognormal(double m, double s, double displ, double scale);
law exponential(double a, double beta);
law gamma(double alpha, double a, double beta);
law beta(double p, double q, double a, double b);
law chi_square(int degrees);
// F(x) = 1 - exp(-((x - a) / beta)^alpha)
law weibull(double alpha, double a, double beta);
// F(x) = 1 - exp(-((x - a) / b)^2)
law rayleigh(double a, double b);
// F(x) = 1 - exp(-exp((x - a) / b)), the law of a minimum
law gumbel(double a, double b);
law laplace(double a, double b);
law cauchy(double a, double b);

// The integers a, ..., b - 1.
law integers(double a, double b);
law bernoulli(double p);
// Failures before the first success.
law geometric(double p);
law binomial(int ntrial, double p);
// Marked ones among s drawn from l of which m are marked.
law hypergeometric(int l, int s, int m);
// Failures before success number a, a real number.
law negative_binomial(double a, double p);
law poisson(double lambda);

}  // namespace laws
