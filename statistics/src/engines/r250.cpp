// SPDX-License-Identifier: Apache-2.0
// The engine r250: seeding, position and runs of words. As in the paper's program, the first word
// delivered is the first one computed: the start words themselves never are.
#include "engines/r250.hpp"

#include <algorithm>
#include <cstddef>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "engines/block_record.hpp"
#include "engines/block_seeding.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

using r250_state = block_record<r250::order>;

constexpr std::size_t run = 8;  // blocks: 8 KiB of words, and whole vectors

bool is_start(span<std::uint32_t> seed) {
  return seed.size >= r250::order;
}

// The sequence of every bit obeys the recurrence by itself, so bits whose start values are linearly
// dependent stay dependent. 32 words are made triangular: word 7k + 3 has bit 31 - k, and none of
// the bits above.
void make_independent(std::uint32_t (&x)[r250::order]) {
  for (std::uint32_t k = 0; k < 32; ++k) {
    const std::uint32_t bit = 0x80000000 >> k;
    std::uint32_t& word = x[7 * k + 3];
    word = (word & (bit - 1)) | bit;
  }
}

// Start words that are given must not all be zero: so would be the sequence.
std::size_t state_size(span<std::uint32_t> seed) {
  const auto is_zero = [](std::uint32_t word) { return word == 0; };
  if (is_start(seed) && std::all_of(seed.data, seed.data + r250::order, is_zero))
    return bad_seed;
  return sizeof(r250_state);
}

int seed(void* state, std::uint32_t, span<std::uint32_t> words) {
  std::uint32_t start[r250::order];
  if (is_start(words)) {
    std::copy_n(words.data, r250::order, start);
  } else {
    seed_block(words, start);
    make_independent(start);
  }
  begin_blocks(start, *static_cast<r250_state*>(state), r250::extend);
  return RVX_STATUS_OK;
}

bool accepts(const void* state, std::size_t size, std::uint32_t) {
  return size == sizeof(r250_state) && is_block_record<r250::order>(state, ~std::uint32_t{0});
}

void fill(void* state, std::uint32_t* out, std::size_t n) {
  walk_blocks<run>(*static_cast<r250_state*>(state), n, r250::extend,
                   [&out](const std::uint32_t* words, std::size_t count) {
                     out = std::copy_n(words, count, out);
                   });
}

}  // namespace

extern const engine_ops r250_engine;
constexpr engine_ops r250_engine = {
    1, 1, state_size, seed, accepts, nullptr, nullptr, nullptr, fill, false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
