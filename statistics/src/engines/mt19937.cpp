// SPDX-License-Identifier: Apache-2.0
// The engine mt19937: seeding, position and runs of words.
#include "engines/mt19937.hpp"

#include <algorithm>
#include <cstddef>
#include <vector>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "engines/block_record.hpp"
#include "engines/block_seeding.hpp"
#include "gf2/linear_jump.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

namespace {

constexpr std::size_t order = mt19937::shape::words;

// The record as it stands in a stream: untempered words and the position. Clients read it there.
using mt19937_state = block_record<order>;
static_assert(sizeof(mt19937_state) == 2500 && offsetof(mt19937_state, position) == 2496);

// The bit of word 0 that belongs to the state: the others reach no later word.
constexpr std::uint32_t upper = ~std::uint32_t{0} << mt19937::shape::lower_bits;

constexpr std::size_t run = 4;  // blocks: 10 KiB of words

// Skips over fewer blocks make them. Measured: a short jump costs as much as 11 000 blocks with
// AVX3, 8 000 with AVX2, 5 000 with SSE4, 40 000 without vectors.
constexpr std::uint64_t jump_blocks = 10000;

std::size_t state_size(span<std::uint32_t>) {
  return sizeof(mt19937_state);
}

int seed(void* state, std::uint32_t, span<std::uint32_t> words) {
  std::uint32_t start[order];
  seed_block(words, start);
  begin_blocks(start, *static_cast<mt19937_state*>(state), mt19937::extend);
  return RVX_STATUS_OK;
}

bool accepts(const void* state, std::size_t size, std::uint32_t) {
  return size == sizeof(mt19937_state) && is_block_record<order>(state, upper);
}

// Replaces the block by the one `blocks` blocks on. Makes the next block first: all of its words
// are functions of the 19937 bits of state, which word 0 of a record from outside need not be, and
// 624 * blocks may exceed 64 bits where 624 * (blocks - 1) does not. Throws std::bad_alloc before
// it writes.
void jump_over(mt19937_state& s, std::uint64_t blocks) {
  constexpr std::size_t ahead = whole_steps(jump_terms + order);
  std::vector<std::uint32_t> words(order + ahead);
  std::copy_n(s.words, order, words.data());
  mt19937::extend(words.data(), ahead);
  jump(mt19937_minimal, order * (blocks - 1), words.data() + order, 1, order, s.words);
}

void skip(void* state, span<std::uint64_t> digits) {
  auto& s = *static_cast<mt19937_state*>(state);
  const std::uint64_t distance = digits.data[0];
  const std::uint64_t within = s.position % order + distance % order;
  const std::uint64_t blocks = distance / order + within / order;
  if (blocks < jump_blocks) {
    walk_blocks<run>(s, distance, mt19937::extend, [](const std::uint32_t*, std::size_t) {});
    return;
  }
  jump_over(s, blocks);
  s.position = static_cast<std::uint32_t>(within % order == 0 ? order : within % order);
}

void fill(void* state, std::uint32_t* out, std::size_t n) {
  walk_blocks<run>(*static_cast<mt19937_state*>(state), n, mt19937::extend,
                   [&out](const std::uint32_t* words, std::size_t count) {
                     mt19937::temper(words, count, out);
                     out += count;
                   });
}

}  // namespace

extern const engine_ops mt19937_engine;
constexpr engine_ops mt19937_engine = {
    1, 1, state_size, seed, accepts, nullptr, skip, nullptr, fill, false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
