// SPDX-License-Identifier: Apache-2.0
// From impossible to certain.
#include "../reference.hpp"
#include "../specimen.hpp"

namespace laws {

std::vector<specimen> bernoulli_cases() {
  std::vector<specimen> all;
  for (const double p :
       {0.0, 1e-9, 1e-4, 0.01, 0.1, 0.25, 1.0 / 3, 0.5, 0.7, 0.9, 0.999, 1 - 1e-9, 1.0}) {
    all.push_back(
        routine("iRngBernoulli", rvxiRngBernoulli, 0, bernoulli(p), integer_resolution(), p));
  }
  return all;
}

}  // namespace laws
