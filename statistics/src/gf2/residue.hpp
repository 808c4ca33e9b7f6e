// SPDX-License-Identifier: Apache-2.0
// Kernels of the jump: arithmetic with polynomials over GF(2) modulo one of degree 19968, and the
// sum of the windows that a polynomial names.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::gf2 {

// A polynomial of degree below 128 * residue_blocks, t^0 in the lowest bit of the first word.
inline constexpr std::size_t residue_blocks = 156;
inline constexpr std::size_t residue_words = 2 * residue_blocks;

// x = x^2 t^odd modulo t^19968 + low, odd = 0 or 1. The uppermost two words of low are zero.
void square(const std::uint64_t* low, int odd, std::uint64_t* x);

// Writes the sum of the windows of `count` words that begin at words + first[i], i < windows.
void sum_windows(const std::uint32_t* words, const std::uint32_t* first, std::size_t windows,
                 std::size_t count, std::uint32_t* out);

}  // namespace tarn::statistics::gf2
