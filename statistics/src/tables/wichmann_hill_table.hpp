// SPDX-License-Identifier: Apache-2.0
// The constants of 273 sets of four multiplicative generators s <- a s mod p with 1092 different
// primes (Maclaren: The generation of multiple independent sequences of pseudorandom numbers,
// Applied Statistics 38, 1989); tools/wichmann_hill makes them and says how.
#pragma once

#include <cstdint>

namespace tarn::statistics {

struct wichmann_hill_constants {
  std::uint32_t modulus[4];  // primes of 24 bits
  std::uint32_t multiplier[4];
};

inline constexpr std::uint32_t wichmann_hill_members = 273;

extern const wichmann_hill_constants wichmann_hill_table[wichmann_hill_members];

}  // namespace tarn::statistics
