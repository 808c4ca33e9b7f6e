// SPDX-License-Identifier: Apache-2.0
// A place and a scale: small and large against each other and by themselves.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

template <class Real>
void add(std::vector<specimen>& all) {
  const double sets[][2] = {{0, 1},   {1, 1},    {-2, 0.5},  {10, 30},  {0, 1e-20}, {0, 1e20},
                            {-1, 10}, {2, 0.25}, {1e6, 1e5}, {-0.1, 3}, {7, 1},     {-1e-9, 1e-9}};
  for (const auto& set : sets) {
    const auto a = static_cast<Real>(set[0]), b = static_cast<Real>(set[1]);
    for (const std::int64_t method : {0, RVX_RNG_METHOD_ACCURACY_FLAG}) {
      all.push_back(routine(form_name<Real>("RngExponential"),
                            form<Real>(rvxsRngExponential, rvxdRngExponential), method,
                            exponential(a, b), resolution_of<Real>(a, method != 0), a, b));
    }
  }
}

}  // namespace

std::vector<specimen> exponential_cases() {
  std::vector<specimen> all;
  add<float>(all);
  add<double>(all);
  return all;
}

}  // namespace laws
