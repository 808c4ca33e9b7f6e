// SPDX-License-Identifier: Apache-2.0
// SFMT19937 (Saito, Matsumoto: SIMD-Oriented Fast Mersenne Twister, MCQMC 2006): a recurrence of
// 128-bit words, each of which is four words of the stream, least significant one first.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::sfmt19937 {

inline constexpr std::size_t quads = 156;  // 128-bit words of a block
inline constexpr std::size_t words = 4 * quads;

// The recurrence x[k + 156] = x[k] ^ (x[k] << 8) ^ ((x[k + 122] >> 11) & mask) ^ (x[k + 154] >> 8)
//                             ^ (x[k + 155] << 18)
// shifts x[k] and x[k + 154] as 128-bit words and the other two as four of 32 bits.
inline constexpr std::size_t middle = 122;
inline constexpr std::uint32_t mask[4] = {0xDFFFFFEF, 0xDDFECB7F, 0xBFFAFFFF, 0xBFFFFFF6};

// Writes the `blocks` >= 1 blocks of `words` words that follow the one at `from`. A single one may
// take its place.
void next_blocks(const std::uint32_t* from, std::size_t blocks, std::uint32_t* to);

}  // namespace tarn::statistics::sfmt19937
