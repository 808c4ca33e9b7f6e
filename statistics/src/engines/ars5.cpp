// SPDX-License-Identifier: Apache-2.0
// The engine ars5: ARS in the frame of the counter-based engines, and its rounds on plain words.
#include "engines/ars5.hpp"

#include <algorithm>

#include "distributions/real_words.hpp"
#include "engines/aes_tables.hpp"
#include "engines/counter_engine.hpp"

namespace tarn::statistics {

namespace ars5 {

namespace {

std::uint32_t rotate_left(std::uint32_t x, int bits) {
  return bits == 0 ? x : x << bits | x >> (32 - bits);
}

// Column c of a round before its key is added. ShiftRows takes row r from column c + r; `table`
// gives what a byte of row 0 contributes to the column, and the other rows are its rotations.
std::uint32_t column(const aes::word_table& table, const std::uint32_t state[4], int c) {
  std::uint32_t sum = 0;
  for (int r = 0; r < 4; ++r)
    sum ^= rotate_left(table.of[state[(c + r) % 4] >> (8 * r) & 0xFF], 8 * r);
  return sum;
}

}  // namespace

void evaluate(const std::uint32_t key[4], const std::uint32_t ctr[4], std::uint32_t out[4]) {
  std::uint64_t lane[2] = {key[0] | std::uint64_t{key[1]} << 32,
                           key[2] | std::uint64_t{key[3]} << 32};
  std::uint32_t state[4];
  for (int c = 0; c < 4; ++c)
    state[c] = ctr[c] ^ key[c];
  for (int round = 1; round <= rounds; ++round) {
    const auto& table = round < rounds ? aes::mixed : aes::substituted;
    lane[0] += key_step[0];
    lane[1] += key_step[1];
    std::uint32_t next[4];
    for (int c = 0; c < 4; ++c)
      next[c] = column(table, state, c) ^ static_cast<std::uint32_t>(lane[c / 2] >> (32 * (c % 2)));
    std::copy_n(next, 4, state);
  }
  std::copy_n(state, 4, out);
}

}  // namespace ars5

namespace {

struct ars5_kernel {
  static constexpr std::size_t key_words = 4;

  static void evaluate(const std::uint32_t* key, const std::uint32_t* ctr, std::uint32_t* out) {
    ars5::write_blocks(key, ctr, 1, out);
  }

  static void write_blocks(const std::uint32_t* key, const std::uint32_t* ctr, std::size_t count,
                           std::uint32_t* out) {
    ars5::write_blocks(key, ctr, count, out);
  }
};

}  // namespace

extern const engine_ops ars5_engine;
constexpr engine_ops ars5_engine = counter_engine<ars5_kernel>::table(&unsigned_word_rule);

}  // namespace tarn::statistics
