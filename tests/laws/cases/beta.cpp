// SPDX-License-Identifier: Apache-2.0
// Shapes in each region of its own method: both below 1 (on both sides of the line between two
// methods, q = 0.956 - 0.852 p^2), one below and one above, both above (the lesser on both sides of
// 2^17, where the test becomes a series), one or both equal to 1.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

template <class Real>
void add(std::vector<specimen>& all) {
  const double sets[][4] = {
      {0.5, 0.5, 0, 1},    {0.1, 0.2, 0, 1},    {0.05, 0.9, 0, 1},  {0.9, 0.05, 0, 1},
      {0.7, 0.53, 0, 1},   {0.7, 0.55, 0, 1},   {0.9, 0.9, -1, 2},  {0.99, 0.3, 0, 1},
      {0.7, 4, -1, 5},     {0.1, 30, 0, 1},     {0.95, 1.05, 0, 1}, {4, 0.7, 0, 1},
      {30, 0.1, 0, 1},     {1.05, 0.95, 3, 1},  {1.01, 1.01, 0, 1}, {2, 3, 0, 1},
      {20, 35, 2, 0.5},    {500, 2, 0, 1},      {1.5, 400, 0, 10},  {1e4, 1e4, 0, 1},
      {131072, 2e5, 0, 1}, {3e5, 131073, 0, 1}, {1, 1, 0, 1},       {1, 0.3, 0, 1},
      {1, 7, -2, 4},       {0.3, 1, 0, 1},      {8, 1, 0, 1e10}};
  for (const auto& set : sets) {
    const auto p = static_cast<Real>(set[0]), q = static_cast<Real>(set[1]);
    const auto a = static_cast<Real>(set[2]), b = static_cast<Real>(set[3]);
    for (const std::int64_t method : {0, RVX_RNG_METHOD_ACCURACY_FLAG}) {
      all.push_back(routine(form_name<Real>("RngBeta"), form<Real>(rvxsRngBeta, rvxdRngBeta),
                            method, beta(p, q, a, b), resolution_of<Real>(a, method != 0), p, q, a,
                            b));
      // The upper end as the routine forms it.
      all.back().views[0].expected.upper = a + b;
    }
  }
}

}  // namespace

std::vector<specimen> beta_cases() {
  std::vector<specimen> all;
  add<float>(all);
  add<double>(all);
  return all;
}

}  // namespace laws
