// SPDX-License-Identifier: Apache-2.0
// Shapes on both sides of 1, far below and far above it.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

template <class Real>
void add(std::vector<specimen>& all) {
  const double sets[][3] = {{0.1, 0, 1},    {0.25, 0, 3},   {0.5, 0, 1}, {0.9, -1, 2},
                            {1, 0, 1},      {1, 3, 0.5},    {1.1, 0, 1}, {1.5, 0, 2},
                            {2, 0, 1},      {3.6, -10, 10}, {5, 1, 3},   {20, 0, 1e10},
                            {2.5, 0, 1e-10}};
  for (const auto& set : sets) {
    const auto alpha = static_cast<Real>(set[0]);
    const auto a = static_cast<Real>(set[1]), beta = static_cast<Real>(set[2]);
    for (const std::int64_t method : {0, RVX_RNG_METHOD_ACCURACY_FLAG}) {
      all.push_back(
          routine(form_name<Real>("RngWeibull"), form<Real>(rvxsRngWeibull, rvxdRngWeibull), method,
                  weibull(alpha, a, beta), resolution_of<Real>(a, method != 0), alpha, a, beta));
    }
  }
}

}  // namespace

std::vector<specimen> weibull_cases() {
  std::vector<specimen> all;
  add<float>(all);
  add<double>(all);
  return all;
}

}  // namespace laws
