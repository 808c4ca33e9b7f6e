// SPDX-License-Identifier: Apache-2.0
// Values of (a - 1) (1 - p) / p on both sides of 100, where methods change; shapes below 1,
// fractional, large.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

std::vector<specimen> negative_binomial_cases() {
  std::vector<specimen> all;
  const double sets[][2] = {{0.1, 0.3},   {0.5, 0.2},   {1, 0.5},      {5, 0.3},     {60.5, 0.9},
                            {2.7, 0.01},  {101, 0.501}, {101, 0.4999}, {2, 0.0099},  {2, 0.00991},
                            {1.5, 0.004}, {200, 0.5},   {1e4, 0.9},    {1e4, 0.99},  {300.25, 0.05},
                            {1e6, 0.3},   {0.9, 1e-4},  {0.01, 0.001}, {1e8, 0.999}, {3, 1}};
  for (const auto& [a, p] : sets) {
    all.push_back(routine("iRngNegbinomial", rvxiRngNegbinomial, 0, negative_binomial(a, p),
                          integer_resolution(), a, p));
  }
  return all;
}

}  // namespace laws
