// SPDX-License-Identifier: Apache-2.0
// Trials that succeed with probability p: one of them, and the failures before the first success.
// Inversions of one number, exact to what that number carries.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics {

// out[i] = 1 where u[i] < p, or everywhere if p is 1 (words of some engines round to u = 1).
void bernoulli(const double* u, std::size_t n, double p, std::int32_t* out);

// The greatest k with u <= (1 - p)^k, up to the greatest integer. u = 0 counts as
// exp(-744.44007192138122).
struct geometric_law {
  double inverse_log;  // 1 / ln(1 - p)
  double p;

  explicit geometric_law(double p);

  // Whether u <= (1 - p)^k, for numbers so close together that doubles do not tell.
  bool reaches(double u, double k) const;
};

void geometric(const double* u, std::size_t n, const geometric_law& law, std::int32_t* out);

}  // namespace tarn::statistics
