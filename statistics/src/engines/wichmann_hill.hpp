// SPDX-License-Identifier: Apache-2.0
// Sums of four multiplicative generators s_j <- a_j s_j mod p_j (Wichmann and Hill, Algorithm AS
// 183, Applied Statistics 31, 1982; Maclaren, The generation of multiple independent sequences of
// pseudorandom numbers, Applied Statistics 38, 1989), and the kernel that writes runs of words.
//
// A word is the fraction of s_1/p_1 + ... + s_4/p_4 in fixed point: the high 32 bits of the sum of
// s_j R_j modulo 2^64, where R_j is 2^64 / p_j rounded to the nearest integer. So it is exact
// arithmetic on integers everywhere. The rounding of R_j moves the sum by less than
// 4 * 2^24 * 1/2 * 2^-64 = 2^-39 up or down, before it is cut to 32 bits.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::wichmann_hill {

inline constexpr int components = 4;

struct generator {
  std::uint32_t modulus[components];     // p_j, primes in (2^23, 2^24)
  std::uint32_t multiplier[components];  // a_j in 1..p_j - 1
  std::uint64_t reciprocal[components];  // R_j
};

inline std::uint32_t product(std::uint32_t a, std::uint32_t b, std::uint32_t p) {
  return static_cast<std::uint32_t>(std::uint64_t{a} * b % p);
}

// Writes the words of n >= 1 successive states from `state` on, all s_j in 1..p_j - 1, and leaves
// the next one there.
void write_words(const generator& g, std::uint32_t state[components], std::size_t n,
                 std::uint32_t* out);

}  // namespace tarn::statistics::wichmann_hill
