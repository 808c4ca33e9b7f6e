// SPDX-License-Identifier: Apache-2.0
// Both sides of every change of method: of p = 1/64 for shapes below, of and above 1, of
// (a - 1) (1 - p) / p = 100 for greater p, and of a = 1 for lesser ones. Laws under each form of
// the hat: most likely value 0 or not, with and without a left slope and a left tail.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

std::vector<specimen> negative_binomial_cases() {
  std::vector<specimen> all;
  const double sets[][2] = {
      {0.1, 0.3},    {0.5, 0.2},     {1, 0.5},     {5, 0.3},      {60.5, 0.9},   {0.5, 0.0156},
      {0.5, 0.0157}, {1, 0.0156},    {1, 0.0157},  {2, 0.0156},   {2, 0.0157},   {0.99, 0.01},
      {1, 0.01},     {1.01, 0.01},   {101, 0.501}, {101, 0.4999}, {0.02, 0.02},  {2.02, 0.01},
      {2.3, 0.005},  {2.7, 0.01},    {5, 0.01},    {1.5, 0.004},  {200, 0.5},    {1e4, 0.9},
      {1e4, 0.99},   {300.25, 0.05}, {1e6, 0.3},   {0.9, 1e-4},   {0.01, 0.001}, {1e8, 0.999},
      {3, 1}};
  for (const auto& [a, p] : sets) {
    all.push_back(routine("iRngNegbinomial", rvxiRngNegbinomial, 0, negative_binomial(a, p),
                          integer_resolution(), a, p));
  }
  return all;
}

}  // namespace laws
