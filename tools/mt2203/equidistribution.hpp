// SPDX-License-Identifier: Apache-2.0
// Dimensions of equidistribution of a twister's output.
#pragma once

#include <array>
#include <cstdint>

#include "twister.hpp"

namespace tarn::mt2203 {

// k(v): the largest k such that the upper v bits of k successive outputs, taken together over the
// period, have every value equally often (all zeros once less). It is at most state_bits / v.
// The twister must have the full period; v = 1..32.
int dimension_of_equidistribution(const twister_shape& shape, const parameters& member, int v);

struct equidistribution {
  std::array<int, 33> k;  // k[v]; k[0] is not used
  int defect;             // sum over v of state_bits / v, rounded down, less k(v)
};

equidistribution measure_equidistribution(const twister_shape& shape, const parameters& member);

}  // namespace tarn::mt2203
