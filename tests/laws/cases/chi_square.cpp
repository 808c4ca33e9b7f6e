// SPDX-License-Identifier: Apache-2.0
// Degrees on both sides of every change of method: 1 and 3, even ones up to 16, and the others.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

namespace {

template <class Real>
void add(std::vector<specimen>& all) {
  for (const std::int32_t degrees :
       {1, 2, 3, 4, 5, 6, 7, 9, 14, 15, 16, 17, 18, 19, 33, 60, 101, 1000, 100000}) {
    all.push_back(routine(form_name<Real>("RngChiSquare"),
                          form<Real>(rvxsRngChiSquare, rvxdRngChiSquare), 0, chi_square(degrees),
                          resolution_of<Real>(0), degrees));
  }
}

}  // namespace

std::vector<specimen> chi_square_cases() {
  std::vector<specimen> all;
  add<float>(all);
  add<double>(all);
  return all;
}

}  // namespace laws
