// SPDX-License-Identifier: Apache-2.0
// Minimal polynomials of the recurrences that are jumped in (gf2/linear_jump.hpp).
// tools/minimal_polynomials makes the table.
#pragma once

#include <cstdint>

#include "gf2/linear_jump.hpp"

namespace tarn::statistics {

inline constexpr std::uint32_t polynomial_words = 312;

struct jump_polynomial {
  std::uint32_t degree;  // from 19905 to 19968
  // The coefficients below the leading one, t^0 in the lowest bit of low[0]. The ones next to the
  // leading one, 128 and more, are zero: what the reduction relies on.
  std::uint64_t low[polynomial_words];
};

}  // namespace tarn::statistics
