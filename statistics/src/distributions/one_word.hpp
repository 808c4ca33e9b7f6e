// SPDX-License-Identifier: Apache-2.0
// A producer of values that take one word each: the word as a real number, and the value that
// belongs to it.
#pragma once

#include <algorithm>
#include <cstddef>

#include "blocks.hpp"
#include "distributions/canonical.hpp"

namespace tarn::statistics {

// turn(u, count, out) writes the values of `count` reals (at most block_words) of [lo, 1) and may
// change the reals.
template <class Turn>
struct one_word_values {
  double lo;
  Turn turn;

  template <class Value>
  void operator()(const word_source& source, std::size_t n, Value* out, bool) const {
    alignas(64) double u[block_words];
    const canonical<double> reals(source, lo, 1);
    while (n != 0) {
      const std::size_t count = std::min(n, block_words);
      reals.draw(source, count, u);
      turn(u, count, out);
      out += count;
      n -= count;
    }
  }
};

template <class Turn>
one_word_values(double, Turn) -> one_word_values<Turn>;

}  // namespace tarn::statistics
