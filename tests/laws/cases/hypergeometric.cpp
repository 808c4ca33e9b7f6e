// SPDX-License-Identifier: Apache-2.0
// Modes on both sides of 40, where methods change, samples and marked items on both sides of half
// the lot, up to the largest lots, and laws of a single value.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

std::vector<specimen> hypergeometric_cases() {
  std::vector<specimen> all;
  const std::int32_t sets[][3] = {{10, 5, 5},
                                  {50, 5, 10},
                                  {50, 40, 10},
                                  {50, 5, 40},
                                  {50, 45, 40},
                                  {100, 25, 45},
                                  {1000, 100, 300},
                                  {1000, 130, 300},
                                  {1000, 134, 300},
                                  {1000, 900, 300},
                                  {1000, 134, 700},
                                  {1000, 866, 700},
                                  {1000, 500, 500},
                                  {100000, 5000, 40000},
                                  {100000, 95000, 40000},
                                  {100000, 5000, 60000},
                                  {2000000, 1000000, 999999},
                                  {2147483647, 1000, 1000000},
                                  {2147483647, 100000, 2000000},
                                  {2147483647, 1000000000, 1000000000},
                                  {2147483647, 2000000000, 2000000000},
                                  {7, 0, 3},
                                  {7, 3, 0},
                                  {7, 3, 7},
                                  {7, 7, 3},
                                  {0, 0, 0}};
  for (const auto& [l, s, m] : sets) {
    all.push_back(routine("iRngHypergeometric", rvxiRngHypergeometric, 0, hypergeometric(l, s, m),
                          integer_resolution(), l, s, m));
  }
  return all;
}

}  // namespace laws
