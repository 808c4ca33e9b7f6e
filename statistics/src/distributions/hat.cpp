// SPDX-License-Identifier: Apache-2.0
// Ratios kept for calls of many values.
#include "distributions/hat.hpp"

namespace tarn::statistics {

void near_ratios::keep(const log_ratio& of_all) {
  double y[2 * reach + 1];
  for (int k = -reach; k <= reach; ++k)
    y[k + reach] = center + k;
  ratios_of(of_all, y, 2 * reach + 1, ratio);
  kept = true;
}

}  // namespace tarn::statistics
