// SPDX-License-Identifier: Apache-2.0
// Parameters at the ends of what is allowed, where results may overflow or vanish: no sample is
// held against these laws, but results have to be finite and in their range.
#pragma once

#include <limits>
#include <vector>

#include "reference.hpp"
#include "specimen.hpp"

namespace laws {

// Only the support matters.
inline law between(double lower, double upper) {
  return {false, lower, upper, nullptr, nullptr, nullptr, nullptr};
}

template <class Real>
void add_edge_cases(std::vector<specimen>& all) {
  using limits = std::numeric_limits<Real>;
  constexpr double infinity = std::numeric_limits<double>::infinity();
  const Real tiny = limits::min(), huge = limits::max() / 1024;
  const law any = between(-infinity, infinity), positive = between(0, infinity);
  const grain g = resolution_of<Real>(0);
  const auto name = [](const char* n) { return form_name<Real>(n); };
  for (const Real scale : {tiny, huge}) {
    for (const std::int64_t m : {0, 1, 2})
      all.push_back(routine(name("RngGaussian"), form<Real>(rvxsRngGaussian, rvxdRngGaussian), m,
                            any, g, Real(0), scale));
    all.push_back(routine(name("RngExponential"),
                          form<Real>(rvxsRngExponential, rvxdRngExponential), 0, positive, g,
                          Real(0), scale));
    all.push_back(routine(name("RngRayleigh"), form<Real>(rvxsRngRayleigh, rvxdRngRayleigh), 0,
                          positive, g, Real(0), scale));
    all.push_back(routine(name("RngGumbel"), form<Real>(rvxsRngGumbel, rvxdRngGumbel), 0, any, g,
                          Real(0), scale));
    all.push_back(routine(name("RngLaplace"), form<Real>(rvxsRngLaplace, rvxdRngLaplace), 0, any, g,
                          Real(0), scale));
  }
  // tan next to a right angle is 2^24 for a float, 2^53 for a double at most.
  all.push_back(routine(name("RngCauchy"), form<Real>(rvxsRngCauchy, rvxdRngCauchy), 0, any, g,
                        Real(0), huge * limits::epsilon()));
  all.push_back(routine(name("RngCauchy"), form<Real>(rvxsRngCauchy, rvxdRngCauchy), 0, any, g,
                        Real(0), tiny));
  // Powers far beyond the type on one side: (-ln u)^(1 / alpha) vanishes or is 1.
  for (const Real shape : {Real(50), Real(1e6), huge})
    all.push_back(routine(name("RngWeibull"), form<Real>(rvxsRngWeibull, rvxdRngWeibull), 0,
                          positive, g, shape, Real(0), Real(1)));
  for (const Real shape : {tiny, Real(1e-6), Real(1e-3), Real(1) - limits::epsilon(),
                           Real(1) + limits::epsilon(), Real(1e6), Real(1e30)})
    all.push_back(routine(name("RngGamma"), form<Real>(rvxsRngGamma, rvxdRngGamma), 0, positive, g,
                          shape, Real(0), Real(1)));
  const law unit = between(0, 1);
  const Real shapes[] = {
      Real(1e-3), Real(0.3), Real(1) - limits::epsilon(), Real(1), Real(1) + limits::epsilon(),
      Real(1e6)};
  for (const Real p : shapes) {
    for (const Real q : shapes)
      all.push_back(routine(name("RngBeta"), form<Real>(rvxsRngBeta, rvxdRngBeta), 0, unit, g, p, q,
                            Real(0), Real(1)));
  }
  for (const std::int64_t m : {0, 1}) {
    all.push_back(routine(name("RngLognormal"), form<Real>(rvxsRngLognormal, rvxdRngLognormal), m,
                          positive, g, Real(0), Real(5), Real(0), Real(1)));
    all.push_back(routine(name("RngLognormal"), form<Real>(rvxsRngLognormal, rvxdRngLognormal), m,
                          positive, g, Real(-1000), Real(0.1), Real(0), Real(1)));
  }
  all.push_back(routine(name("RngChiSquare"), form<Real>(rvxsRngChiSquare, rvxdRngChiSquare), 0,
                        positive, g, std::numeric_limits<std::int32_t>::max()));
}

inline void add_integer_edge_cases(std::vector<specimen>& all) {
  constexpr std::int32_t most = std::numeric_limits<std::int32_t>::max();
  const grain g = integer_resolution();
  const law natural = between(0, most);
  for (const double p : {1e-300, 1e-12, 1e-9, 1 - 1e-16}) {
    all.push_back(routine("iRngGeometric", rvxiRngGeometric, 0, natural, g, p));
    all.push_back(routine("iRngBernoulli", rvxiRngBernoulli, 0, between(0, 1), g, p));
    for (const std::int32_t ntrial : {1, 1000, most})
      all.push_back(routine("iRngBinomial", rvxiRngBinomial, 0, between(0, ntrial), g, ntrial, p));
    for (const double a : {1e-9, 1.0, 1e5})
      all.push_back(routine("iRngNegbinomial", rvxiRngNegbinomial, 0, natural, g, a, p));
  }
  for (const double lambda : {1e-300, 1e-9, 2147483647.0, 1e12})
    for (const std::int64_t m : {0, 1})
      all.push_back(routine("iRngPoisson", rvxiRngPoisson, m, natural, g, lambda));
  all.push_back(routine("iRngHypergeometric", rvxiRngHypergeometric, 0, between(most - 2, most - 1),
                        g, most, most - 1, most - 1));
  all.push_back(routine("iRngHypergeometric", rvxiRngHypergeometric, 0, between(0, 1 << 30), g,
                        most, 1 << 30, 1 << 30));
}

inline std::vector<specimen> edge_cases() {
  std::vector<specimen> all;
  add_edge_cases<float>(all);
  add_edge_cases<double>(all);
  add_integer_edge_cases(all);
  return all;
}

// Closed formulas: the routines without any rejection, whatever their parameters.
inline bool takes_a_fixed_number_of_words(const specimen& s) {
  for (const char* rejecting : {"Gamma", "Beta", "ChiSquare", "Binomial", "Hypergeometric",
                                "Negbinomial", "Multinomial", "Poisson"}) {
    if (s.routine.find(rejecting) != std::string::npos)
      return false;
  }
  return true;
}

}  // namespace laws
