// SPDX-License-Identifier: Apache-2.0
// Parameters at the ends of what is allowed, for every routine that has some, where results may
// overflow or vanish: no sample is held against these laws, but results have to be finite and in
// their range.
#pragma once

#include <algorithm>
#include <cmath>
#include <limits>
#include <string>
#include <vector>

#include "reference.hpp"
#include "specimen.hpp"

namespace laws {

// Only the support matters.
inline law between(double lower, double upper) {
  return {false, lower, upper, nullptr, nullptr, nullptr, nullptr};
}

template <class Real>
class real_edges {
 public:
  explicit real_edges(std::vector<specimen>& all) : all_(all) {}

  void add_all() {
    add_uniform();
    for (const Real place : {Real(0), most, -most})
      for (const Real scale : {least, tiny, Real(1), most})
        add_placed(place, scale);
    add_cauchy_of_small_scale();
    add_gaussian_mv();
    for (const std::int32_t degrees : {1, std::numeric_limits<std::int32_t>::max()})
      add("RngChiSquare", form<Real>(rvxsRngChiSquare, rvxdRngChiSquare), 0, 0, degrees);
  }

 private:
  using limits = std::numeric_limits<Real>;
  static constexpr Real least = limits::denorm_min(), tiny = limits::min(), most = limits::max();
  static constexpr double infinity = std::numeric_limits<double>::infinity();
  static constexpr std::int64_t flag = RVX_RNG_METHOD_ACCURACY_FLAG;

  // Results from `lower` on, to the greatest finite number.
  template <class Draw, class... Parameters>
  void add(const char* name, Draw draw, std::int64_t method, double lower, Parameters... p) {
    add_between(name, draw, method, lower, infinity, p...);
  }
  template <class Draw, class... Parameters>
  void add_between(const char* name, Draw draw, std::int64_t method, double lower, double upper,
                   Parameters... p) {
    const double place = std::isfinite(lower) ? std::fabs(lower) : 0;
    all_.push_back(routine(form_name<Real>(name), draw, method, between(lower, upper),
                           resolution_of<Real>(place, (method & flag) != 0), p...));
  }

  // b - a and a + b have to be finite.
  void add_uniform() {
    const Real ends[][2] = {
        {0, least},   {0, tiny}, {0, most}, {-most / 2, most / 2}, {-most / 2, -most / 4},
        {-tiny, tiny}};
    for (const auto& e : ends)
      for (const std::int64_t m : {RVX_RNG_METHOD_UNIFORM_STD, RVX_RNG_METHOD_UNIFORM_STD_ACCURATE})
        all_.push_back(routine(form_name<Real>("RngUniform"),
                               form<Real>(rvxsRngUniform, rvxdRngUniform), m, between(e[0], e[1]),
                               resolution_of<Real>(std::max(std::fabs(e[0]), std::fabs(e[1])),
                                                   m == RVX_RNG_METHOD_UNIFORM_STD_ACCURATE),
                               e[0], e[1]));
  }

  void add_placed(Real a, Real b) {
    for (const std::int64_t m : {0, 1, 2})
      add("RngGaussian", form<Real>(rvxsRngGaussian, rvxdRngGaussian), m, -infinity, a, b);
    add("RngGumbel", form<Real>(rvxsRngGumbel, rvxdRngGumbel), 0, -infinity, a, b);
    add("RngLaplace", form<Real>(rvxsRngLaplace, rvxdRngLaplace), 0, -infinity, a, b);
    add("RngCauchy", form<Real>(rvxsRngCauchy, rvxdRngCauchy), 0, -infinity, a, b);
    for (const std::int64_t m : {std::int64_t{0}, flag}) {
      add("RngExponential", form<Real>(rvxsRngExponential, rvxdRngExponential), m, a, a, b);
      add("RngRayleigh", form<Real>(rvxsRngRayleigh, rvxdRngRayleigh), m, a, a, b);
      // Powers far beyond the type on either side; those of large shapes are 1 or vanish.
      for (const Real shape : {tiny, Real(1e-3), Real(0.05), Real(50), most})
        add("RngWeibull", form<Real>(rvxsRngWeibull, rvxdRngWeibull), m, a, shape, a, b);
      for (const Real shape : {tiny, Real(1e-6), Real(1) - limits::epsilon(),
                               Real(1) + limits::epsilon(), Real(1e6), Real(1e30), most})
        add("RngGamma", form<Real>(rvxsRngGamma, rvxdRngGamma), m, a, shape, a, b);
      add_lognormal(m, a, b);
      add_beta(m, a, b);
    }
  }

  // Exponentials of numbers far beyond the type on either side.
  void add_lognormal(std::int64_t accuracy, Real displ, Real scale) {
    for (const std::int64_t m : {0, 1})
      for (const Real mean : {-most, Real(-1000), Real(0), Real(1000), most})
        for (const Real deviation : {least, Real(5), Real(1e5), most})
          add("RngLognormal", form<Real>(rvxsRngLognormal, rvxdRngLognormal), m | accuracy, displ,
              mean, deviation, displ, scale);
  }

  void add_beta(std::int64_t m, Real a, Real b) {
    const Real shapes[] = {tiny, Real(0.3), Real(1) - limits::epsilon(),
                           Real(1) + limits::epsilon(), Real(1e6)};
    const double end = static_cast<double>(a) + static_cast<double>(b);
    for (const Real p : shapes)
      for (const Real q : shapes)
        add_between("RngBeta", form<Real>(rvxsRngBeta, rvxdRngBeta), m, a, end, p, q, a, b);
  }

  // tan next to a right angle is 2^24 for a float, 2^53 for a double at most.
  void add_cauchy_of_small_scale() {
    add("RngCauchy", form<Real>(rvxsRngCauchy, rvxdRngCauchy), 0, -infinity, Real(0),
        most * limits::epsilon());
  }

  // Terms of either sign that overflow by themselves or together.
  void add_gaussian_mv() {
    static const Real mean[] = {most, -most, 0},
                      matrix[] = {most, 0, 0, -most, most, 0, most, -most, least};
    for (const std::int64_t m : {0, 1, 2})
      for (const std::int32_t layout : {0, 1, 2}) {
        add("RngGaussianMV", form<Real>(rvxsRngGaussianMV, rvxdRngGaussianMV), m, -infinity, 3,
            layout, &mean[0], &matrix[0]);
        specimen& s = all_.back();
        s.width = 3;
        s.paired = m == RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2;
        for (std::size_t i : {1u, 2u}) {
          view other = s.views[0];
          other.of = [i](const double* x) { return x[i]; };
          s.views.push_back(other);
        }
      }
  }

  std::vector<specimen>& all_;
};

// Results from 0 to `greatest`, each of `width` values.
template <class Draw, class... Parameters>
void add_counts(std::vector<specimen>& all, const char* name, Draw draw, std::int64_t method,
                std::int32_t greatest, Parameters... p) {
  all.push_back(routine(name, draw, method, between(0, greatest), integer_resolution(), p...));
}

inline void add_integer_edge_cases(std::vector<specimen>& all) {
  constexpr std::int32_t most = std::numeric_limits<std::int32_t>::max();
  constexpr double least = std::numeric_limits<double>::denorm_min();
  for (const double p : {least, 1e-300, 1e-12, 1e-9, 1 - 1e-16, 1.0}) {
    add_counts(all, "iRngGeometric", rvxiRngGeometric, 0, most, p);
    add_counts(all, "iRngBernoulli", rvxiRngBernoulli, 0, 1, p);
    for (const std::int32_t ntrial : {1, 1000, most})
      add_counts(all, "iRngBinomial", rvxiRngBinomial, 0, ntrial, ntrial, p);
    for (const double a : {least, 1e-9, 1.0, 1e5, std::numeric_limits<double>::max()})
      add_counts(all, "iRngNegbinomial", rvxiRngNegbinomial, 0, most, a, p);
  }
  for (const double lambda :
       {least, 1e-300, 1e-9, 2147483647.0, 1e12, std::numeric_limits<double>::max()}) {
    for (const std::int64_t m : {0, 1})
      add_counts(all, "iRngPoisson", rvxiRngPoisson, m, most, lambda);
    specimen s = routine("iRngPoissonV", rvxiRngPoissonV, 0, between(0, most), integer_resolution(),
                         static_cast<const double*>(nullptr));
    s.parameters = std::to_string(lambda);
    s.draw = [lambda](rvx_stream stream, std::size_t n, void* r) {
      const std::vector<double> rates(n, lambda);
      return rvxiRngPoissonV(0, stream, static_cast<std::int64_t>(n), static_cast<std::int32_t*>(r),
                             rates.data());
    };
    all.push_back(s);
  }
  for (const std::int32_t l : {1, most})
    for (const std::int32_t s : {0, l - 1, l})
      for (const std::int32_t m : {0, l - 1, l}) {
        const std::int32_t fewest = std::max(0, s - (l - m));
        all.push_back(routine("iRngHypergeometric", rvxiRngHypergeometric, 0,
                              between(fewest, std::min(s, m)), integer_resolution(), l, s, m));
      }
  add_counts(all, "iRngHypergeometric", rvxiRngHypergeometric, 0, 1 << 30, most, 1 << 30, 1 << 30);
  const std::int32_t ends[][2] = {{-most - 1, -most}, {most - 1, most}, {-(1 << 30), 1 << 30}};
  for (const auto& e : ends) {
    // The bounds and the results are rounded to float on the way: 2^7 steps of an integer there.
    constexpr double step = 128;
    all.push_back(routine("iRngUniform", rvxiRngUniform, 0, between(e[0] - step, e[1] + step),
                          integer_resolution(), e[0], e[1]));
  }
  static const double rare[] = {1, least};
  static const double shares[] = {0.5, 0.5};
  for (const std::int32_t ntrial : {0, 1, most})
    for (const double* p : {rare, shares}) {
      add_counts(all, "iRngMultinomial", rvxiRngMultinomial, 0, ntrial, ntrial, 2, p);
      all.back().width = 2;
    }
}

inline std::vector<specimen> edge_cases() {
  std::vector<specimen> all;
  real_edges<float>(all).add_all();
  real_edges<double>(all).add_all();
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
