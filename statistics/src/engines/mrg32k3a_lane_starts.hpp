// SPDX-License-Identifier: Apache-2.0
// Where the lanes of a round of mrg32k3a begin, as matrices over the state at its start.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engines/mrg32k3a.hpp"

namespace tarn::statistics::mrg32k3a {

// A round is cut into as many equal parts as there are lanes. Column `lane` of the rows of an
// element (i, j): that element of the matrix that leads from the start of the round to the start
// of the lane's part.
template <std::size_t lanes>
struct lane_starts {
  alignas(64) std::uint64_t x[3][3][lanes];
  alignas(64) std::uint64_t y[3][3][lanes];
};

template <std::size_t lanes>
constexpr lane_starts<lanes> make_lane_starts() {
  matrix part = transition;  // over the words of a part, a power of two
  for (std::size_t words = 1; words < round_words / lanes; words *= 2)
    part = part * part;
  matrix power = {{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}, {{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}};
  lane_starts<lanes> starts{};
  for (std::size_t lane = 0; lane < lanes; ++lane) {
    for (int i = 0; i < 3; ++i) {
      for (int j = 0; j < 3; ++j) {
        starts.x[i][j][lane] = power.x[i][j];
        starts.y[i][j][lane] = power.y[i][j];
      }
    }
    power = part * power;
  }
  return starts;
}

}  // namespace tarn::statistics::mrg32k3a
