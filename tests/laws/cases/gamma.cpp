// SPDX-License-Identifier: Apache-2.0
// Shapes on both sides of 0.6 and of 1, where the methods change, of 2^14 + 1/3, where the test
// becomes a series, and far from them.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

template <class Real>
void add(std::vector<specimen>& all) {
  const double sets[][3] = {
      {0.05, 0, 1},  {0.3, 0, 1},   {0.59, 1, 2},   {0.6, 0, 1},  {0.601, 0, 1}, {0.61, -3, 0.1},
      {0.8, 0, 5},   {0.99, 0, 1},  {0.9999, 0, 1}, {1, 0, 2},    {1, 5, 0.5},   {1.0001, 0, 1},
      {1.05, 0, 1},  {2.5, 0, 2},   {7, 0, 1e-10},  {40, 1, 0.5}, {300.5, 0, 1}, {1e4, 0, 1e10},
      {16384, 0, 1}, {16385, 0, 1}, {1e5, 0, 1}};
  for (const auto& set : sets) {
    const auto alpha = static_cast<Real>(set[0]);
    const auto a = static_cast<Real>(set[1]), beta = static_cast<Real>(set[2]);
    for (const std::int64_t method : {0, RVX_RNG_METHOD_ACCURACY_FLAG}) {
      all.push_back(routine(form_name<Real>("RngGamma"), form<Real>(rvxsRngGamma, rvxdRngGamma),
                            method, gamma(alpha, a, beta), resolution_of<Real>(a, method != 0),
                            alpha, a, beta));
    }
  }
}

}  // namespace

std::vector<specimen> gamma_cases() {
  std::vector<specimen> all;
  add<float>(all);
  add<double>(all);
  return all;
}

}  // namespace laws
