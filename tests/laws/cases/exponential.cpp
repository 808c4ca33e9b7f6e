// SPDX-License-Identifier: Apache-2.0
#include "place_and_scale.hpp"

namespace laws {

std::vector<specimen> exponential_cases() {
  return places_and_scales("RngExponential", rvxsRngExponential, rvxdRngExponential, exponential,
                           {0, RVX_RNG_METHOD_ACCURACY_FLAG});
}

}  // namespace laws
