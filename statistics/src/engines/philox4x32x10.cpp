// SPDX-License-Identifier: Apache-2.0
// The engine philox4x32x10: seeding, position and runs of words.
//
// Position: the next word has the serial index 4 * ctr - idx, counted modulo 2^130; idx says how
// many words of the block ctr - 1 are unread. This engine leaves idx in 0..3; 4, the whole block,
// names the same position as idx 0 at ctr - 1 and is read as that.
#include "engines/philox4x32x10.hpp"

#include <algorithm>
#include <cstring>

#include "distributions/real_words.hpp"
#include "engine.hpp"

namespace tarn::statistics {

namespace {

// The record as it stands in a stream; clients read it there.
struct philox_state {
  std::uint32_t key[2];
  std::uint32_t ctr[4];  // least significant word first
  std::uint32_t idx;
};
static_assert(sizeof(philox_state) == 28);

// A 128-bit number, wrapping.
struct wide {
  std::uint64_t low, high;
};

wide operator+(wide a, wide b) {
  const std::uint64_t low = a.low + b.low;
  return {low, a.high + b.high + (low < a.low ? 1u : 0u)};
}

constexpr wide one{1, 0};
constexpr wide minus_one{~std::uint64_t{0}, ~std::uint64_t{0}};

struct cursor {
  std::uint32_t key[2];
  wide ctr;
  std::uint32_t idx;  // 0..3
};

cursor load(const void* state) {
  philox_state s;
  std::memcpy(&s, state, sizeof s);
  cursor c{{s.key[0], s.key[1]},
           {s.ctr[0] | std::uint64_t{s.ctr[1]} << 32, s.ctr[2] | std::uint64_t{s.ctr[3]} << 32},
           s.idx};
  if (c.idx == 4) {
    c.ctr = c.ctr + minus_one;
    c.idx = 0;
  }
  return c;
}

philox::block words_of(wide ctr) {
  return {{static_cast<std::uint32_t>(ctr.low), static_cast<std::uint32_t>(ctr.low >> 32),
           static_cast<std::uint32_t>(ctr.high), static_cast<std::uint32_t>(ctr.high >> 32)}};
}

void store(const cursor& c, void* state) {
  philox_state s{{c.key[0], c.key[1]}, {}, c.idx};
  const philox::block ctr = words_of(c.ctr);
  std::memcpy(s.ctr, ctr.word, sizeof s.ctr);
  std::memcpy(state, &s, sizeof s);
}

philox::block evaluate_at(const cursor& c, wide ctr) {
  return philox::evaluate(words_of(ctr), c.key[0], c.key[1]);
}

std::size_t state_size(span<std::uint32_t>) {
  return sizeof(philox_state);
}

void seed(void* state, std::uint32_t, span<std::uint32_t> words) {
  std::uint32_t taken[6] = {};  // key[0], key[1], ctr[0..3]
  std::copy_n(words.data, std::min<std::size_t>(words.size, 6), taken);
  philox_state s{{taken[0], taken[1]}, {taken[2], taken[3], taken[4], taken[5]}, 0};
  std::memcpy(state, &s, sizeof s);
}

bool accepts(const void* state, std::size_t size) {
  if (size != sizeof(philox_state))
    return false;
  philox_state s;
  std::memcpy(&s, state, sizeof s);
  return s.idx <= 4;
}

void skip(void* state, span<std::uint64_t> digits) {
  // The period is 2^130 words: three digits count, and of the third one two bits.
  const auto digit = [digits](std::size_t i) {
    return i < digits.size ? digits.data[i] : std::uint64_t{0};
  };
  const wide blocks{digit(0) >> 2 | digit(1) << 62, digit(1) >> 2 | digit(2) << 62};
  const auto odd_words = static_cast<std::uint32_t>(digit(0) & 3);

  cursor c = load(state);
  c.ctr = c.ctr + blocks;
  if (c.idx >= odd_words) {
    c.idx -= odd_words;
  } else {
    c.ctr = c.ctr + one;
    c.idx += 4 - odd_words;
  }
  store(c, state);
}

void fill(void* state, std::uint32_t* out, std::size_t n) {
  cursor c = load(state);
  if (c.idx != 0 && n != 0) {
    const philox::block head = evaluate_at(c, c.ctr + minus_one);
    const std::uint32_t taken = n < c.idx ? static_cast<std::uint32_t>(n) : c.idx;
    out = std::copy_n(head.word + 4 - c.idx, taken, out);
    n -= taken;
    c.idx -= taken;
  }
  while (n >= 4) {
    // Up to the wrap of the counter's low half, where the kernel has to be called anew; a
    // distance of 0 stands for 2^64.
    const std::uint64_t to_wrap = 0 - c.ctr.low;
    const std::size_t count =
        to_wrap == 0 ? n / 4 : static_cast<std::size_t>(std::min<std::uint64_t>(n / 4, to_wrap));
    philox::write_blocks(c.key, words_of(c.ctr).word, count, out);
    c.ctr = c.ctr + wide{count, 0};
    out += 4 * count;
    n -= 4 * count;
  }
  if (n != 0) {
    const philox::block tail = evaluate_at(c, c.ctr);
    std::copy_n(tail.word, n, out);
    c.ctr = c.ctr + one;
    c.idx = 4 - static_cast<std::uint32_t>(n);
  }
  store(c, state);
}

}  // namespace

extern const engine_ops philox4x32x10_engine;
constexpr engine_ops philox4x32x10_engine = {
    1, state_size, seed, accepts, skip, nullptr, fill, true, &signed_word_rule,
};

}  // namespace tarn::statistics
