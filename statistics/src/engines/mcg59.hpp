// SPDX-License-Identifier: Apache-2.0
// The generator x -> 13^13 x mod 2^59 (the basic generator of the NAG Fortran Library: its manual,
// chapter G05). Its states are odd
// and its period is 2^57.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::mcg59 {

struct group {
  using number = std::uint64_t;

  static constexpr number mask = (number{1} << 59) - 1;
  static constexpr number multiplier = 302875106592253;  // 13^13

  static constexpr number multiply(number p, number q) { return p * q & mask; }

  static constexpr bool contains(number x) { return x % 2 != 0 && x <= mask; }

  // Even seeds get the highest bit flipped beside the lowest one, so that neighbours stay apart.
  static constexpr number start(std::uint64_t seed) {
    return (seed % 2 != 0 ? seed : seed ^ (number{1} << 58 | 1)) & mask;
  }

  static number write_words(number x, number a, std::size_t n, std::uint32_t* out);
};

}  // namespace tarn::statistics::mcg59
