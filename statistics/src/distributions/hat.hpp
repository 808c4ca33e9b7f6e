// SPDX-License-Identifier: Apache-2.0
// Rejection of integers from under a hat: a candidate is a pair of uniform numbers, which give a
// value y and a height w evenly distributed below the hat at y; it is accepted if w is at most
// P(y) / P(mode). What the methods that work so share.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "blocks.hpp"
#include "distributions/canonical.hpp"
#include "distributions/log_ratio.hpp"
#include "distributions/rejection.hpp"

namespace tarn::statistics {

// Heights that come from a uniform number of 0 are taken a little above it, so that logarithms stay
// finite and impossible values remain impossible. Words of 59 bits still reach all they can.
inline constexpr double least_uniform = 0x1p-60;

// Ratios of the values next to a center, kept for calls of many values. They are what ratios_of
// gives: whether they are kept changes no decision.
struct near_ratios {
  static constexpr int reach = 64;
  // Calls that try fewer candidates than this compute what they need.
  static constexpr std::size_t worth = 256;

  bool kept = false;
  double center;
  double ratio[2 * reach + 1];

  void keep(const log_ratio& of_all);
};

// The value of a candidate y: origin + sign * y, at most the greatest integer.
struct image {
  double origin, sign;
};

// Room for the numbers of one block of candidates, up to whole vectors.
inline constexpr std::size_t candidate_room = block_candidates + 64;

// n values of `hat`, two words a candidate: hat.attempt(uniforms, count, out) tries `count` pairs.
template <class Hat>
void draw_under_hat(const word_source& source, const Hat& hat, std::size_t n, std::int32_t* out) {
  const canonical<double> reals(source, 0, 1);
  alignas(64) double uniforms[2 * candidate_room];
  draw_accepted(n, out, [&](std::size_t count, std::int32_t* to) {
    reals.draw(source, 2 * count, uniforms);
    // Vectors read behind the last pair.
    std::fill_n(uniforms + 2 * count, 2 * (candidate_room - block_candidates), 0.5);
    return hat.attempt(uniforms, count, to);
  });
}

}  // namespace tarn::statistics
