// SPDX-License-Identifier: Apache-2.0
// Laws of real variates.
#include <cmath>
#include <limits>

#include <boost/math/distributions/beta.hpp>
#include <boost/math/distributions/cauchy.hpp>
#include <boost/math/distributions/chi_squared.hpp>
#include <boost/math/distributions/exponential.hpp>
#include <boost/math/distributions/extreme_value.hpp>
#include <boost/math/distributions/gamma.hpp>
#include <boost/math/distributions/laplace.hpp>
#include <boost/math/distributions/lognormal.hpp>
#include <boost/math/distributions/normal.hpp>
#include <boost/math/distributions/rayleigh.hpp>
#include <boost/math/distributions/uniform.hpp>
#include <boost/math/distributions/weibull.hpp>

#include "reference.hpp"

namespace laws {

namespace {

namespace bm = boost::math;
// Double precision gives fifteen digits here, far more than any sample can tell.
using in_double = bm::policies::policy<bm::policies::promote_double<false>>;

constexpr double infinity = std::numeric_limits<double>::infinity();

template <class Distribution>
law real_law(const Distribution& d, double lower, double upper) {
  return {false,
          lower,
          upper,
          [=](double x) { return x <= lower   ? 0
                                 : x >= upper ? 1
                                              : bm::cdf(d, x); },
          [=](double p) { return bm::quantile(d, p); },
          [=](double q) { return bm::quantile(bm::complement(d, q)); },
          nullptr};
}

}  // namespace

law placed(const law& of, double a, double b) {
  return {false,
          a + b * of.lower,
          a + b * of.upper,
          [=](double x) { return of.cdf((x - a) / b); },
          [=](double p) { return a + b * of.below(p); },
          [=](double q) { return a + b * of.above(q); },
          nullptr};
}

law uniform(double a, double b) {
  return real_law(bm::uniform_distribution<double, in_double>(a, b), a, b);
}

law gaussian(double mean, double stddev) {
  return real_law(bm::normal_distribution<double, in_double>(mean, stddev), -infinity, infinity);
}

law lognormal(double m, double s, double displ, double scale) {
  return placed(real_law(bm::lognormal_distribution<double, in_double>(m, s), 0, infinity), displ,
                scale);
}

law exponential(double a, double beta) {
  return placed(real_law(bm::exponential_distribution<double, in_double>(1), 0, infinity), a, beta);
}

law gamma(double alpha, double a, double beta) {
  return placed(real_law(bm::gamma_distribution<double, in_double>(alpha), 0, infinity), a, beta);
}

law beta(double p, double q, double a, double b) {
  return placed(real_law(bm::beta_distribution<double, in_double>(p, q), 0, 1), a, b);
}

law chi_square(int degrees) {
  return real_law(bm::chi_squared_distribution<double, in_double>(degrees), 0, infinity);
}

law weibull(double alpha, double a, double beta) {
  return placed(real_law(bm::weibull_distribution<double, in_double>(alpha), 0, infinity), a, beta);
}

law rayleigh(double a, double b) {
  // Boost's has exp(-x^2 / (2 sigma^2)).
  return placed(real_law(bm::rayleigh_distribution<double, in_double>(std::sqrt(0.5)), 0, infinity),
                a, b);
}

law gumbel(double a, double b) {
  // Boost's is the law of a maximum: its mirror image.
  const bm::extreme_value_distribution<double, in_double> maximum;
  const law minimum{false,
                    -infinity,
                    infinity,
                    [=](double x) { return bm::cdf(bm::complement(maximum, -x)); },
                    [=](double p) { return -bm::quantile(bm::complement(maximum, p)); },
                    [=](double q) { return -bm::quantile(maximum, q); },
                    nullptr};
  return placed(minimum, a, b);
}

law laplace(double a, double b) {
  return real_law(bm::laplace_distribution<double, in_double>(a, b), -infinity, infinity);
}

law cauchy(double a, double b) {
  return real_law(bm::cauchy_distribution<double, in_double>(a, b), -infinity, infinity);
}

}  // namespace laws
