// SPDX-License-Identifier: Apache-2.0
// From nearly always zero to means of millions.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

std::vector<specimen> geometric_cases() {
  std::vector<specimen> all;
  for (const double p :
       {1e-6, 1e-4, 0.003, 0.01, 0.05, 0.2, 0.3, 0.5, 0.7, 0.9, 0.99, 1 - 1e-5, 1.0}) {
    all.push_back(
        routine("iRngGeometric", rvxiRngGeometric, 0, geometric(p), integer_resolution(), p));
  }
  return all;
}

}  // namespace laws
