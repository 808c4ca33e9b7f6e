// SPDX-License-Identifier: Apache-2.0
// MT19937 (Matsumoto, Nishimura: Mersenne Twister, ACM TOMACS 8, 1998): its shape and constants,
// and the kernels on runs of words.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engines/twister.hpp"

namespace tarn::statistics::mt19937 {

struct shape {
  static constexpr std::size_t words = 624;
  static constexpr std::size_t middle = 397;
  static constexpr int lower_bits = 31;
  static constexpr int first_shift = 11;
};

inline constexpr twister_constants constants{0x9908B0DF, 0x9D2C5680, 0xEFC60000};

// Continues the sequence words[0..623] by `count` words, rounded up to whole steps of block_step.
void extend(std::uint32_t* words, std::size_t count);

// Writes n tempered words.
void temper(const std::uint32_t* words, std::size_t n, std::uint32_t* out);

}  // namespace tarn::statistics::mt19937
