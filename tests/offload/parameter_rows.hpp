// SPDX-License-Identifier: Apache-2.0
// What each routine refuses before anything else, with the nearest that it takes on the other side:
// a walk that calls visit.refused<entries>(method, arguments...) or visit.taken<...>(...).
#pragma once

#include <cmath>
#include <cstdint>
#include <limits>
#include <tuple>
#include <vector>

#include "drawings.hpp"
#include "refusal.hpp"

namespace tarn_test {

/// Methods of routines that have an accurate one besides, refused and taken.
template <typename Entries, typename Visit, typename... Argument>
void accurate_rows(Visit& visit, Argument... good) {
  visit.template taken<Entries>(0, good...);
  visit.template taken<Entries>(accuracy, good...);
  for (const std::int64_t method : {std::int64_t{1}, std::int64_t{2}, accuracy + 1, accuracy / 2,
                                    std::int64_t{-1}, std::int64_t{0x7fffffff}}) {
    visit.template refused<Entries>(method, good...);
  }
}

/// Of routines with one method, whose code is `method`.
template <typename Entries, typename Visit, typename... Argument>
void single_method_rows(Visit& visit, std::int64_t only, Argument... good) {
  visit.template taken<Entries>(only, good...);
  for (const std::int64_t method :
       {1 - only, std::int64_t{2}, accuracy, accuracy + only, std::int64_t{-1}}) {
    visit.template refused<Entries>(method, good...);
  }
}

/// Scales and shapes: 0 and less are refused, the least numbers above it are not. `at(x)` is the
/// list of arguments with x in its place.
template <typename Entries, typename Real, typename Visit, typename At>
void positive_rows(Visit& visit, const At& at) {
  const auto refuse = [&](Real x) {
    std::apply([&](auto... a) { visit.template refused<Entries>(0, a...); }, at(x));
  };
  refuse(Real(0));
  refuse(Real(-0.0));
  refuse(-std::numeric_limits<Real>::min());
  refuse(Real(-1));
  refuse(-std::numeric_limits<Real>::infinity());
}
template <typename Entries, typename Real, typename Visit, typename At>
void positive_rows_to_the_edge(Visit& visit, const At& at) {
  positive_rows<Entries, Real>(visit, at);
  std::apply([&](auto... a) { visit.template taken<Entries>(0, a...); },
             at(std::numeric_limits<Real>::min()));
}

template <typename Real, typename Visit>
void location_and_scale_rows(Visit& visit) {
  using namespace offload;
  const auto at = [](Real scale) { return std::make_tuple(Real(1), scale); };
  positive_rows_to_the_edge<Gaussian<Real>, Real>(visit, at);
  positive_rows_to_the_edge<Cauchy<Real>, Real>(visit, at);
  positive_rows_to_the_edge<Gumbel<Real>, Real>(visit, at);
  positive_rows_to_the_edge<Laplace<Real>, Real>(visit, at);
  positive_rows_to_the_edge<Exponential<Real>, Real>(visit, at);
  positive_rows_to_the_edge<Rayleigh<Real>, Real>(visit, at);
  single_method_rows<Cauchy<Real>>(visit, 0, 1, 2);
  single_method_rows<Gumbel<Real>>(visit, 0, 1, 2);
  single_method_rows<Laplace<Real>>(visit, 0, 1, 2);
  accurate_rows<Exponential<Real>>(visit, 1, 2);
  accurate_rows<Rayleigh<Real>>(visit, 1, 2);
  for (const std::int64_t method : {0, 1, 2}) {
    visit.template taken<Gaussian<Real>>(method, 1, 2);
  }
  for (const std::int64_t method : {std::int64_t{3}, std::int64_t{-1}, accuracy, accuracy + 2}) {
    visit.template refused<Gaussian<Real>>(method, 1, 2);
  }
}

template <typename Real, typename Visit>
void uniform_rows(Visit& visit) {
  using namespace offload;
  using entries = Uniform<Real>;
  const Real one = Real(1);
  const Real above = std::nextafter(one, Real(2));
  visit.template refused<entries>(0, one, one);
  visit.template refused<entries>(accuracy, one, one);
  visit.template refused<entries>(0, above, one);
  visit.template refused<entries>(0, 3, -3);
  visit.template taken<entries>(0, one, above);
  accurate_rows<entries>(visit, -1, 1);
}

template <typename Real, typename Visit>
void shape_rows(Visit& visit) {
  using namespace offload;
  const auto tuple = [](auto... x) { return std::make_tuple(Real(x)...); };
  positive_rows<Gamma<Real>, Real>(visit, [&](Real x) { return tuple(x, 1, 2); });
  positive_rows_to_the_edge<Gamma<Real>, Real>(visit, [&](Real x) { return tuple(2, 1, x); });
  positive_rows_to_the_edge<Weibull<Real>, Real>(visit, [&](Real x) { return tuple(x, 1, 2); });
  positive_rows_to_the_edge<Weibull<Real>, Real>(visit, [&](Real x) { return tuple(2, 1, x); });
  positive_rows<Beta<Real>, Real>(visit, [&](Real x) { return tuple(x, 2, 1, 3); });
  positive_rows<Beta<Real>, Real>(visit, [&](Real x) { return tuple(2, x, 1, 3); });
  positive_rows_to_the_edge<Beta<Real>, Real>(visit, [&](Real x) { return tuple(2, 2, 1, x); });
  positive_rows_to_the_edge<Lognormal<Real>, Real>(visit,
                                                   [&](Real x) { return tuple(1, x, 1, 3); });
  positive_rows_to_the_edge<Lognormal<Real>, Real>(visit,
                                                   [&](Real x) { return tuple(1, 2, 1, x); });
  accurate_rows<Gamma<Real>>(visit, 2, 1, 3);
  accurate_rows<Weibull<Real>>(visit, 2, 1, 3);
  accurate_rows<Beta<Real>>(visit, 2, 2, 1, 3);
  accurate_rows<Lognormal<Real>>(visit, 1, 2, 1, 3);
}

template <typename Real, typename Visit>
void vector_rows(Visit& visit) {
  using namespace offload;
  static const Real numbers[] = {Real(1), Real(0.5), Real(0.75), Real(2)};
  const Real* const nothing = nullptr;
  using entries = GaussianMV<Real>;
  for (const int layout : {0, 1, 2}) {
    for (const std::int64_t method : {0, 1, 2}) {
      visit.template taken<entries>(method, 2, layout, numbers, numbers);
    }
    visit.template taken<entries>(0, 1, layout, numbers, numbers);
    visit.template refused<entries>(0, 0, layout, numbers, numbers);
    visit.template refused<entries>(0, -1, layout, numbers, numbers);
    visit.template refused<entries>(3, 2, layout, numbers, numbers);
    visit.template refused<entries>(-1, 2, layout, numbers, numbers);
    visit.template refused<entries>(accuracy, 2, layout, numbers, numbers);
    visit.template refused<entries>(0, 2, layout, nothing, numbers);
    visit.template refused<entries>(0, 2, layout, numbers, nothing);
  }
  visit.template refused<entries>(0, 2, 3, numbers, numbers);
  visit.template refused<entries>(0, 2, -1, numbers, numbers);
}

template <typename Real, typename Visit>
void real_rows(Visit& visit) {
  uniform_rows<Real>(visit);
  location_and_scale_rows<Real>(visit);
  shape_rows<Real>(visit);
  vector_rows<Real>(visit);
  using degrees = offload::ChiSquare<Real>;
  visit.template refused<degrees>(0, 0);
  visit.template refused<degrees>(0, -1);
  visit.template taken<degrees>(0, 1);
  single_method_rows<degrees>(visit, 0, 5);
}

/// Trials of a probability.
template <typename Visit>
void trial_rows(Visit& visit) {
  using namespace offload;
  const double below_0 = -std::numeric_limits<double>::min();
  const double above_1 = std::nextafter(1.0, 2.0);
  const double below_1 = std::nextafter(1.0, 0.0);
  for (const double p : {below_0, -1.0, above_1, 2.0}) {
    visit.template refused<viBernoulli>(0, p);
    visit.template refused<viGeometric>(0, p);
    visit.template refused<viBinomial>(0, 9, p);
    visit.template refused<viNegbinomial>(0, 3, p);
  }
  for (const double p : {0.0, 1.0}) {
    visit.template taken<viBernoulli>(0, p);
    visit.template taken<viBinomial>(0, 9, p);
    visit.template refused<viNegbinomial>(0, 3, p);
  }
  visit.template taken<viGeometric>(0, below_1);
  visit.template taken<viNegbinomial>(0, 3, 0.999);
  visit.template refused<viBinomial>(0, 0, 0.5);
  visit.template refused<viBinomial>(0, -1, 0.5);
  visit.template taken<viBinomial>(0, 1, 0.5);
  visit.template refused<viNegbinomial>(0, 0, 0.5);
  visit.template refused<viNegbinomial>(0, -1, 0.5);
  visit.template taken<viNegbinomial>(0, 0.25, 0.5);
  single_method_rows<viBernoulli>(visit, 0, 0.5);
  single_method_rows<viGeometric>(visit, 0, 0.5);
  single_method_rows<viBinomial>(visit, 0, 9, 0.5);
  single_method_rows<viNegbinomial>(visit, 0, 3, 0.5);
}

template <typename Visit>
void other_integer_rows(Visit& visit) {
  using namespace offload;
  static const std::vector<double> thirds(48, 1.0 / 48);
  static const std::vector<double> rates(static_cast<std::size_t>(few), 2.5);
  const double* const nothing = nullptr;
  visit.template refused<viUniform>(0, 1, 1);
  visit.template refused<viUniform>(0, 2, 1);
  visit.template taken<viUniform>(0, 1, 2);
  single_method_rows<viUniform>(visit, 0, -7, 7);
  single_method_rows<viUniformBits>(visit, 0);
  single_method_rows<viUniformBits32>(visit, 0);
  single_method_rows<viUniformBits64>(visit, 0);
  visit.template refused<viHypergeometric>(0, 9, -1, 3);
  visit.template refused<viHypergeometric>(0, 9, 3, -1);
  visit.template refused<viHypergeometric>(0, 8, 9, 3);
  visit.template refused<viHypergeometric>(0, 8, 3, 9);
  visit.template refused<viHypergeometric>(0, -1, 0, 0);
  visit.template taken<viHypergeometric>(0, 50, 5, 10);
  single_method_rows<viHypergeometric>(visit, 0, 50, 5, 10);
  visit.template refused<viMultinomial>(0, -1, 48, thirds.data());
  visit.template refused<viMultinomial>(0, 3, 0, thirds.data());
  visit.template refused<viMultinomial>(0, 3, -1, thirds.data());
  visit.template refused<viMultinomial>(0, 3, 48, nothing);
  single_method_rows<viMultinomial>(visit, 0, 3, 48, thirds.data());
  visit.template refused<viPoisson>(1, -std::numeric_limits<double>::min());
  visit.template refused<viPoisson>(1, -1.0);
  single_method_rows<viPoisson>(visit, 1, 2.5);
  visit.template refused<viPoissonV>(0, nothing);
  single_method_rows<viPoissonV>(visit, 0, rates.data());
}

template <typename Visit>
void for_every_parameter_row(Visit& visit) {
  real_rows<float>(visit);
  real_rows<double>(visit);
  trial_rows(visit);
  other_integer_rows(visit);
}

}  // namespace tarn_test
