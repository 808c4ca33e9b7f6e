// SPDX-License-Identifier: Apache-2.0
// What tells Mersenne twisters of one shape apart (Matsumoto, Nishimura, ACM TOMACS 8, 1998).
#pragma once

#include <cstdint>

namespace tarn::statistics {

struct twister_constants {
  std::uint32_t matrix;  // last row of the twist matrix
  std::uint32_t mask_b;  // of the tempering shift by 7
  std::uint32_t mask_c;  // of the tempering shift by 15
};

}  // namespace tarn::statistics
