// SPDX-License-Identifier: Apache-2.0
// The engine sfmt19937: seeding, position and runs of words.
#include "engines/sfmt19937.hpp"

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

using sfmt19937::next_blocks;
using sfmt19937::words;

// The record as it stands in a stream.
using sfmt19937_state = block_record<words>;
static_assert(sizeof(sfmt19937_state) == 2500);

// Skips over fewer blocks make them: a jump costs as much as some 3000 of them.
constexpr std::uint64_t jump_blocks = 3000;

// The array initialisation of the authors: three words that stand apart act on each other, once
// round the block or as often as the key needs, and once more round.
void seed_key(span<std::uint32_t> key, std::uint32_t (&x)[words]) {
  constexpr std::size_t lag = 11;  // for a block of 623 or more words
  constexpr std::size_t middle = (words - lag) / 2;
  const auto folded = [](std::uint32_t word) { return word ^ word >> 27; };
  const auto at = [&x](std::size_t i) -> std::uint32_t& { return x[i % words]; };

  std::fill_n(x, words, 0x8B8B8B8B);
  const std::size_t steps = std::max(key.size + 1, words);
  for (std::size_t i = 0; i < steps; ++i) {
    const std::uint32_t r = 1664525 * folded(at(i) ^ at(i + middle) ^ at(i + words - 1));
    // First comes the length of the key, then its words, then nothing.
    std::uint32_t taken = static_cast<std::uint32_t>(key.size);
    if (i != 0)
      taken = static_cast<std::uint32_t>(i % words) + (i <= key.size ? key.data[i - 1] : 0);
    at(i + middle) += r;
    at(i + middle + lag) += r + taken;
    at(i) = r + taken;
  }
  for (std::size_t i = steps; i < steps + words; ++i) {
    const std::uint32_t r = 1566083941 * folded(at(i) + at(i + middle) + at(i + words - 1));
    const std::uint32_t taken = r - static_cast<std::uint32_t>(i % words);
    at(i + middle) ^= r;
    at(i + middle + lag) ^= taken;
    at(i) = taken;
  }
}

// The period is a multiple of 2^19937 - 1 where the parity of these bits of the first 128-bit word
// is odd. Where it is not, the lowest of them is changed.
void certify_period(std::uint32_t (&x)[words]) {
  constexpr std::uint32_t parity[4] = {0x00000001, 0, 0, 0x13C9E684};
  std::uint32_t sum = 0;
  for (int i = 0; i < 4; ++i)
    sum ^= x[i] & parity[i];
  if (__builtin_parity(sum) == 0)
    x[0] ^= 1;
}

std::size_t state_size(span<std::uint32_t>) {
  return sizeof(sfmt19937_state);
}

int seed(void* state, std::uint32_t, span<std::uint32_t> key) {
  std::uint32_t start[words];
  if (key.size > 1)
    seed_key(key, start);
  else
    block_seeding::from_word(key.size == 0 ? 1 : key.data[0], start);
  certify_period(start);
  auto& s = *static_cast<sfmt19937_state*>(state);
  next_blocks(start, 1, s.words);
  s.position = words;
  return RVX_STATUS_OK;
}

bool accepts(const void* state, std::size_t size, std::uint32_t) {
  return size == sizeof(sfmt19937_state) && is_block_record<words>(state, ~std::uint32_t{0});
}

// Replaces the block by the one `blocks` blocks on. Throws std::bad_alloc before it writes.
void jump_over(sfmt19937_state& s, std::uint64_t blocks) {
  constexpr std::size_t ahead = jump_terms / sfmt19937::quads;
  static_assert(ahead * sfmt19937::quads == jump_terms);
  std::vector<std::uint32_t> sequence((ahead + 1) * words);
  std::copy_n(s.words, words, sequence.data());
  next_blocks(s.words, ahead, sequence.data() + words);
  jump(sfmt19937_minimal, blocks * sfmt19937::quads, sequence.data(), 4, words, s.words);
}

void skip(void* state, span<std::uint64_t> digits) {
  auto& s = *static_cast<sfmt19937_state*>(state);
  const std::uint64_t distance = digits.data[0];
  const std::uint64_t place = s.position % words + distance % words;
  const std::uint64_t blocks = distance / words + place / words;
  if (blocks < jump_blocks) {
    for (std::uint64_t i = 0; i < blocks; ++i)
      next_blocks(s.words, 1, s.words);
  } else {
    jump_over(s, blocks);
  }
  s.position = static_cast<std::uint32_t>(place % words == 0 ? words : place % words);
}

void fill(void* state, std::uint32_t* out, std::size_t n) {
  if (n == 0)
    return;
  auto& s = *static_cast<sfmt19937_state*>(state);
  const std::size_t place = s.position % words;
  const std::size_t head = std::min(n, words - place);
  out = std::copy_n(s.words + place, head, out);
  s.position = static_cast<std::uint32_t>(place + head);
  if (s.position != words)
    return;
  // Whole blocks are made where they are wanted, each from the one before it; the block that
  // follows them goes to the record, even if no word of it is due yet.
  const std::size_t whole = (n - head) / words, rest = (n - head) % words;
  const std::uint32_t* last = s.words;
  if (whole != 0) {
    next_blocks(last, whole, out);
    out += whole * words;
    last = out - words;
  }
  next_blocks(last, 1, s.words);
  std::copy_n(s.words, rest, out);
  if (rest != 0)
    s.position = static_cast<std::uint32_t>(rest);
}

}  // namespace

extern const engine_ops sfmt19937_engine;
constexpr engine_ops sfmt19937_engine = {
    1, 1, state_size, seed, accepts, nullptr, skip, nullptr, fill, false, &unsigned_word_rule,
};

}  // namespace tarn::statistics
