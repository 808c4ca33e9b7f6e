// SPDX-License-Identifier: Apache-2.0
// The prime moduli that may be used, each with the multipliers that may go with it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

struct candidate {
  std::uint32_t modulus;
  std::vector<std::uint32_t> multipliers;  // ascending
};

// The `count` largest candidates below 2^24, the largest first: p and (p - 1)/2 are prime, and at
// least four of the numbers 112..127 are primitive roots modulo p.
std::vector<candidate> largest_candidates(std::size_t count);
