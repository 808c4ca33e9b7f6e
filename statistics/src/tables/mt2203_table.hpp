// SPDX-License-Identifier: Apache-2.0
// Parameters of 6024 Mersenne twisters of period 2^2203 - 1 (32-bit words, 69 words of state,
// middle word 34, lower part of 5 bits; tempering shifts 12, 7, 15, 18), whose characteristic
// polynomials differ. They are made by dynamic creation (Matsumoto and Nishimura, "Dynamic Creation
// of Pseudorandom Number Generators", MCQMC 1998, Springer 2000); tools/mt2203 makes and checks
// them.
#pragma once

#include <cstdint>

namespace tarn::statistics {

struct mt2203_parameters {
  std::uint32_t matrix_a;  // its low 16 bits are the member's number
  std::uint32_t mask_b;    // of the tempering shift by 7
  std::uint32_t mask_c;    // of the tempering shift by 15
};

inline constexpr std::uint32_t mt2203_members = 6024;

extern const mt2203_parameters mt2203_table[mt2203_members];

}  // namespace tarn::statistics
