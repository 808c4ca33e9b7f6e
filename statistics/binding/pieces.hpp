// SPDX-License-Identifier: Apache-2.0
// Long calls in pieces: a routine of the statistics library takes a 32-bit count.
#pragma once

#include <algorithm>
#include <cstdint>

#include "tarn_rvx.h"

namespace tarn::rvx {

inline constexpr std::int64_t largest_piece = 0x7FFFFFFF;

// Calls generate(count, r) for successive pieces of n results, each of `width` values, until one
// fails or all are done; the status of the last call is the result. 1 <= piece <= largest_piece.
template <class Value, class Generate>
int in_pieces(std::int64_t n, Value* r, int width, std::int64_t piece, const Generate& generate) {
  int status = RVX_STATUS_OK;
  while (n > 0 && status == RVX_STATUS_OK) {
    const std::int64_t count = std::min(n, piece);
    status = generate(static_cast<int>(count), r);
    r += count * width;
    n -= count;
  }
  return status;
}

}  // namespace tarn::rvx
