// SPDX-License-Identifier: Apache-2.0
// Words and bits of words: producers for blocks.hpp.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "blocks.hpp"

namespace tarn::statistics {

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "values are written part by part");

// A word of more than 32 bits, as callers receive it.
struct two_parts {
  std::uint32_t low, high;
};

// The engine's words as they are, the first one in the low half where a value takes two. They go
// straight into the results: a detour through a block for the sake of streaming stores costs more
// than it saves (measured for 100 million words: 4.7 against 6.1 thousand million a second on one
// thread, 8.0 against 7.7 on two).
template <class Value>
struct raw_words {
  void operator()(const word_source& source, std::size_t n, Value* out, bool) const {
    const std::size_t words =
        n * (sizeof(Value) / sizeof(std::uint32_t)) / source.engine->word_parts;
    source.fill(reinterpret_cast<std::uint32_t*>(out), words);
  }
};

// 32 bits of each word of two parts, from bit `shift` on (0 < shift <= 32).
template <class Value>
struct upper_bits {
  std::uint32_t shift;

  void operator()(const word_source& source, std::size_t n, Value* out, bool) const {
    constexpr std::size_t block = block_words / 2;
    std::uint32_t parts[2 * block];
    auto* to = reinterpret_cast<std::uint32_t*>(out);
    std::size_t left = n * (sizeof(Value) / sizeof(std::uint32_t));
    while (left != 0) {
      const std::size_t count = std::min(left, block);
      source.fill(parts, count);
      for (std::size_t i = 0; i < count; ++i) {
        const std::uint64_t word = parts[2 * i] | std::uint64_t{parts[2 * i + 1]} << 32;
        to[i] = static_cast<std::uint32_t>(word >> shift);
      }
      to += count;
      left -= count;
    }
  }
};

}  // namespace tarn::statistics
