// SPDX-License-Identifier: Apache-2.0
// The geometric law where doubles do not do.
#include "distributions/trials.hpp"

#include <algorithm>
#include <cmath>

namespace tarn::statistics {

// Bounded so that its product with a logarithm of 0 is a number: all values are the greatest
// integer long before.
geometric_law::geometric_law(double success)
    : inverse_log(std::max(1 / std::log1p(-success), -0x1p900)), p(success) {}

bool geometric_law::reaches(double u, double k) const {
  const long double left = std::log(static_cast<long double>(u));
  const long double right = static_cast<long double>(k) * std::log1p(-static_cast<long double>(p));
  // Equality occurs (p = 1/2, u = 1/4, k = 2) and must survive the roundings of both sides.
  return left <= right * (1 - 0x1p-60L);
}

}  // namespace tarn::statistics
