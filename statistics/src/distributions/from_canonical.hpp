// SPDX-License-Identifier: Apache-2.0
// Producers of values that a closed formula makes of a fixed number of canonical reals.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "blocks.hpp"
#include "distributions/canonical.hpp"

namespace tarn::statistics {

// One real of [lo, hi) a value: turn(u, count, streaming, out), which may change u.
template <class Real, class Turn>
void turn_reals(const word_source& source, Real lo, Real hi, std::size_t n, Real* out,
                bool streaming, const Turn& turn) {
  const canonical<Real> reals(source, lo, hi);
  turn_blocks(source, n, out, streaming,
              [&](const std::uint32_t* words, std::size_t count, Real* to) {
                alignas(64) Real u[block_words];
                reals.turn(words, count, u);
                turn(u, count, streaming, to);
              });
}

// Two reals of [0, 1) a value: turn(u, count, out) for `count` pairs, which may change u. These
// formulas take so long that stores around the caches gain nothing.
template <class Real, class Turn>
void turn_pairs(const word_source& source, std::size_t n, Real* out, const Turn& turn) {
  const canonical<Real> reals(source, 0, 1);
  alignas(64) Real u[block_words];
  while (n != 0) {
    const std::size_t count = std::min(n, block_words / 2);
    reals.draw(source, 2 * count, u);
    turn(u, count, out);
    out += count;
    n -= count;
  }
}

}  // namespace tarn::statistics
