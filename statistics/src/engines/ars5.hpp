// SPDX-License-Identifier: Apache-2.0
// ARS-5 (Salmon, Moraes, Dror, Shaw: Parallel Random Numbers: As Easy as 1, 2, 3, SC'11): the round
// keys, one plain evaluation, and the kernel that writes runs of blocks.
//
// A block is the counter, added to the key, after four full rounds and a last one of AES
// (FIPS-197). The key of each round is the one before plus a Weyl constant, in two 64-bit lanes.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::ars5 {

inline constexpr int rounds = 5;
inline constexpr std::uint64_t key_step[2] = {0x9E3779B97F4A7C15, 0xBB67AE8584CAA73B};

// One block by table look-ups, for targets without vectors of bytes.
void evaluate(const std::uint32_t key[4], const std::uint32_t ctr[4], std::uint32_t out[4]);

// Writes the blocks of `count` >= 1 successive counters from `ctr` on, four words each. The low 64
// bits of the counter must not wrap before the last block.
void write_blocks(const std::uint32_t key[4], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* out);

}  // namespace tarn::statistics::ars5
