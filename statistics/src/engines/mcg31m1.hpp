// SPDX-License-Identifier: Apache-2.0
// The generator x -> 1132489760 x mod (2^31 - 1), its multiplier from L'Ecuyer: Tables of Linear
// Congruential Generators of Different Sizes and Good Lattice Structure, Math. Comp. 68, 1999. The
// period is 2^31 - 2.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::mcg31m1 {

struct group {
  using number = std::uint32_t;

  static constexpr number modulus = 0x7FFFFFFF;
  static constexpr number multiplier = 1132489760;

  // 2^31 is 1 modulo 2^31 - 1, so the bits from 31 on are added to those below. No product of
  // members is 0, so that the sum is below twice the modulus and never the modulus itself.
  static constexpr number multiply(number p, number q) {
    const std::uint64_t product = std::uint64_t{p} * q;
    const auto sum = static_cast<number>((product & modulus) + (product >> 31));
    return sum < modulus ? sum : sum - modulus;
  }

  static constexpr bool contains(number x) { return x != 0 && x < modulus; }

  static constexpr number start(std::uint64_t seed) {
    const auto x = static_cast<number>(seed % modulus);
    return x == 0 ? 1 : x;
  }

  static number write_words(number x, number a, std::size_t n, std::uint32_t* out);
};

}  // namespace tarn::statistics::mcg31m1
