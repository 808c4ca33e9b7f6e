// SPDX-License-Identifier: Apache-2.0
#include "place_and_scale.hpp"

namespace laws {

std::vector<specimen> laplace_cases() {
  return places_and_scales("RngLaplace", rvxsRngLaplace, rvxdRngLaplace, laplace);
}

}  // namespace laws
