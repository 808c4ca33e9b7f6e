// SPDX-License-Identifier: Apache-2.0
// Philox4x32-10 (Salmon, Moraes, Dror, Shaw: Parallel Random Numbers: As Easy as 1, 2, 3, SC'11):
// the constants, one evaluation, and the kernel that writes runs of blocks.
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::philox {

inline constexpr std::uint32_t multiplier[2] = {0xD2511F53, 0xCD9E8D57};
inline constexpr std::uint32_t key_step[2] = {0x9E3779B9, 0xBB67AE85};
inline constexpr int rounds = 10;

struct block {
  std::uint32_t word[4];
};

inline block evaluate(block ctr, std::uint32_t key0, std::uint32_t key1) {
  for (int r = 0; r < rounds; ++r) {
    const std::uint64_t p0 = std::uint64_t{ctr.word[0]} * multiplier[0];
    const std::uint64_t p1 = std::uint64_t{ctr.word[2]} * multiplier[1];
    ctr.word[0] = static_cast<std::uint32_t>(p1 >> 32) ^ ctr.word[1] ^ key0;
    ctr.word[2] = static_cast<std::uint32_t>(p0 >> 32) ^ ctr.word[3] ^ key1;
    ctr.word[1] = static_cast<std::uint32_t>(p1);
    ctr.word[3] = static_cast<std::uint32_t>(p0);
    key0 += key_step[0];
    key1 += key_step[1];
  }
  return ctr;
}

// Writes the blocks of `count` >= 1 successive counters from `ctr` on, four words each. The low 64
// bits of the counter must not wrap before the last block.
void write_blocks(const std::uint32_t key[2], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* out);

}  // namespace tarn::statistics::philox
