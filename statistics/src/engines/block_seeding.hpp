// SPDX-License-Identifier: Apache-2.0
// Start words of engines whose state is a block of words: the two initialisations that Matsumoto
// and Nishimura published for MT19937 in 2002, carried over to any number of words.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "engine.hpp"

namespace tarn::statistics {

namespace block_seeding {

inline std::uint32_t folded(std::uint32_t word) {
  return word ^ word >> 30;
}

// Never all zero: word 1 can be zero, and word 2 is 2 then.
template <std::size_t Words>
void from_word(std::uint32_t seed, std::uint32_t (&x)[Words]) {
  x[0] = seed;
  for (std::uint32_t i = 1; i < Words; ++i)
    x[i] = 1812433253 * folded(x[i - 1]) + i;
}

// Every word of the key acts on every word from word 1 on. Word 0 becomes 2^31, so that the state
// is not zero: a twister's state begins with the upper bits of word 0, however few they are.
template <std::size_t Words>
void from_key(span<std::uint32_t> key, std::uint32_t (&x)[Words]) {
  from_word(19650218, x);
  std::size_t i = 1;
  // Steps from word to word; behind the last one comes word 1 again, with the last as the one
  // before it.
  const auto advance = [&i, &x] {
    if (++i == Words) {
      x[0] = x[Words - 1];
      i = 1;
    }
  };
  std::size_t j = 0;
  for (std::size_t step = std::max(Words, key.size); step != 0; --step) {
    x[i] = (x[i] ^ 1664525 * folded(x[i - 1])) + key.data[j] + static_cast<std::uint32_t>(j);
    j = j + 1 == key.size ? 0 : j + 1;
    advance();
  }
  for (std::size_t step = Words - 1; step != 0; --step) {
    x[i] = (x[i] ^ 1566083941 * folded(x[i - 1])) - static_cast<std::uint32_t>(i);
    advance();
  }
  x[0] = 0x80000000;
}

}  // namespace block_seeding

// One seed word is taken as such, none as 1, several as a key.
template <std::size_t Words>
void seed_block(span<std::uint32_t> seed, std::uint32_t (&x)[Words]) {
  if (seed.size > 1)
    block_seeding::from_key(seed, x);
  else
    block_seeding::from_word(seed.size == 0 ? 1 : seed.data[0], x);
}

}  // namespace tarn::statistics
