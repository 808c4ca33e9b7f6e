// SPDX-License-Identifier: Apache-2.0
#include "place_and_scale.hpp"

namespace laws {

std::vector<specimen> gumbel_cases() {
  return places_and_scales("RngGumbel", rvxsRngGumbel, rvxdRngGumbel, gumbel);
}

}  // namespace laws
