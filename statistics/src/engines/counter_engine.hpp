// SPDX-License-Identifier: Apache-2.0
// What the counter-based engines share (Salmon, Moraes, Dror, Shaw: Parallel Random Numbers: As
// Easy as 1, 2, 3, SC'11): seeding, position and runs of words over a 128-bit counter whose blocks
// have four words.
//
// Position: the next word has the serial index 4 * ctr - idx, counted modulo 2^130; idx says how
// many words of the block ctr - 1 are unread. These engines leave idx in 0..3; 4, the whole block,
// names the same position as idx 0 at ctr - 1 and is read as that.
//
// A kernel is a class of static functions:
//   key_words                             32-bit words of a key
//   evaluate(key, ctr, out)               one block
//   write_blocks(key, ctr, count, out)    the blocks of `count` >= 1 successive counters; the low
//                                         64 bits of the counter do not wrap before the last one
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "engine.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics {

// A 128-bit number, wrapping.
struct wide {
  std::uint64_t low, high;
};

inline wide operator+(wide a, wide b) {
  const std::uint64_t low = a.low + b.low;
  return {low, a.high + b.high + (low < a.low ? 1u : 0u)};
}

template <class Kernel>
class counter_engine {
 public:
  static constexpr engine_ops table(const word_rule* rule) {
    return {1, 1, state_size, seed, accepts, nullptr, skip, nullptr, fill, true, rule};
  }

 private:
  static constexpr std::size_t key_words = Kernel::key_words;

  // The record as it stands in a stream; clients read it there.
  struct record {
    std::uint32_t key[key_words];
    std::uint32_t ctr[4];  // least significant word first
    std::uint32_t idx;
  };
  static_assert(sizeof(record) == 4 * (key_words + 5) && sizeof(record) <= max_parallel_state);

  static constexpr wide one{1, 0};
  static constexpr wide minus_one{~std::uint64_t{0}, ~std::uint64_t{0}};

  struct cursor {
    std::uint32_t key[key_words];
    wide ctr;
    std::uint32_t idx;  // 0..3
  };

  struct words {
    std::uint32_t word[4];
  };

  static cursor load(const void* state) {
    record r;
    std::memcpy(&r, state, sizeof r);
    cursor c;
    std::memcpy(c.key, r.key, sizeof c.key);
    c.ctr = {r.ctr[0] | std::uint64_t{r.ctr[1]} << 32, r.ctr[2] | std::uint64_t{r.ctr[3]} << 32};
    c.idx = r.idx;
    if (c.idx == 4) {
      c.ctr = c.ctr + minus_one;
      c.idx = 0;
    }
    return c;
  }

  static words words_of(wide ctr) {
    return {{static_cast<std::uint32_t>(ctr.low), static_cast<std::uint32_t>(ctr.low >> 32),
             static_cast<std::uint32_t>(ctr.high), static_cast<std::uint32_t>(ctr.high >> 32)}};
  }

  static void store(const cursor& c, void* state) {
    record r;
    const words ctr = words_of(c.ctr);
    std::memcpy(r.key, c.key, sizeof r.key);
    std::memcpy(r.ctr, ctr.word, sizeof r.ctr);
    r.idx = c.idx;
    std::memcpy(state, &r, sizeof r);
  }

  static words evaluate_at(const cursor& c, wide ctr) {
    words block;
    Kernel::evaluate(c.key, words_of(ctr).word, block.word);
    return block;
  }

  static std::size_t state_size(span<std::uint32_t>) { return sizeof(record); }

  static int seed(void* state, std::uint32_t, span<std::uint32_t> given) {
    record r{};  // the key, then the counter; what is missing is 0
    const std::size_t taken = std::min(given.size, key_words + 4);
    const std::size_t of_key = std::min(taken, key_words);
    std::copy_n(given.data, of_key, r.key);
    std::copy_n(given.data + of_key, taken - of_key, r.ctr);
    std::memcpy(state, &r, sizeof r);
    return RVX_STATUS_OK;
  }

  static bool accepts(const void* state, std::size_t size, std::uint32_t) {
    if (size != sizeof(record))
      return false;
    record r;
    std::memcpy(&r, state, sizeof r);
    return r.idx <= 4;
  }

  static void skip(void* state, span<std::uint64_t> digits) {
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

  static void fill(void* state, std::uint32_t* out, std::size_t n) {
    cursor c = load(state);
    if (c.idx != 0 && n != 0) {
      const words head = evaluate_at(c, c.ctr + minus_one);
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
      Kernel::write_blocks(c.key, words_of(c.ctr).word, count, out);
      c.ctr = c.ctr + wide{count, 0};
      out += 4 * count;
      n -= 4 * count;
    }
    if (n != 0) {
      const words tail = evaluate_at(c, c.ctr);
      std::copy_n(tail.word, n, out);
      c.ctr = c.ctr + one;
      c.idx = 4 - static_cast<std::uint32_t>(n);
    }
    store(c, state);
  }
};

}  // namespace tarn::statistics
