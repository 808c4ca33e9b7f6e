// SPDX-License-Identifier: Apache-2.0
#include "place_and_scale.hpp"

namespace laws {

std::vector<specimen> cauchy_cases() {
  return places_and_scales("RngCauchy", rvxsRngCauchy, rvxdRngCauchy, cauchy);
}

}  // namespace laws
