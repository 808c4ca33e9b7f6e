// SPDX-License-Identifier: Apache-2.0
// Two methods, with and without the accuracy flag, from nearly symmetric to very skew.
#include <cmath>

#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

template <class Real>
void add(std::vector<specimen>& all) {
  const double sets[][4] = {{0, 1, 0, 1},     {1, 0.5, -2, 3},      {-0.5, 0.25, 0, 10},
                            {0, 0.01, 0, 1},  {0, 2, 0, 1},         {3, 1, 5, 0.1},
                            {-5, 1.5, -1, 2}, {0.1, 0.1, 0.1, 0.1}, {0, 3, 0, 1e-10},
                            {10, 1, 0, 1e-3}, {-20, 0.7, 0, 1e9},   {2, 0.3, -100, 7}};
  constexpr std::int64_t flag = RVX_RNG_METHOD_ACCURACY_FLAG;
  for (const auto& set : sets) {
    const auto m = static_cast<Real>(set[0]), s = static_cast<Real>(set[1]);
    const auto displ = static_cast<Real>(set[2]), scale = static_cast<Real>(set[3]);
    for (const std::int64_t method :
         {std::int64_t{RVX_RNG_METHOD_LOGNORMAL_BOXMULLER2},
          std::int64_t{RVX_RNG_METHOD_LOGNORMAL_ICDF}, flag, flag | 1}) {
      all.push_back(routine(form_name<Real>("RngLognormal"),
                            form<Real>(rvxsRngLognormal, rvxdRngLognormal), method,
                            lognormal(m, s, displ, scale),
                            resolution_of<Real>(displ, method >= flag), m, s, displ, scale));
      // The exponential of a rounded number: its relative error grows with the number.
      grain& g = all.back().views[0].resolution;
      g.relative *= 1 + std::fabs(static_cast<double>(m)) + 6 * static_cast<double>(s);
      all.back().paired = (method & 1) == RVX_RNG_METHOD_LOGNORMAL_BOXMULLER2;
    }
  }
}

}  // namespace

std::vector<specimen> lognormal_cases() {
  std::vector<specimen> all;
  add<float>(all);
  add<double>(all);
  return all;
}

}  // namespace laws
