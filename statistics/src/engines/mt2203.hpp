// SPDX-License-Identifier: Apache-2.0
// Mersenne twisters of period 2^2203 - 1, a family made by dynamic creation (Matsumoto, Nishimura:
// Dynamic Creation of Pseudorandom Number Generators, MCQMC 1998, Springer 2000): their shape, and
// the kernels on runs of words.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engines/twister.hpp"

namespace tarn::statistics::mt2203 {

struct shape {
  static constexpr std::size_t words = 69;
  static constexpr std::size_t middle = 34;
  static constexpr int lower_bits = 5;
  static constexpr int first_shift = 12;
};

// Continues the sequence words[0..68] by `count` words, rounded up to whole steps of block_step.
void extend(const twister_constants& constants, std::uint32_t* words, std::size_t count);

// Writes n tempered words.
void temper(const twister_constants& constants, const std::uint32_t* words, std::size_t n,
            std::uint32_t* out);

}  // namespace tarn::statistics::mt2203
