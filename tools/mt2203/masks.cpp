// SPDX-License-Identifier: Apache-2.0
// See masks.hpp. After Matsumoto and Nishimura, "Dynamic Creation of Pseudorandom Number
// Generators" (MCQMC 1998, Springer 2000), section 4: k(v) depends on the mask bits that the upper
// v output bits can feel, so v goes up from 1, the bits that become visible are tried in all ways,
// and the masks with the largest k(v) go on.
#include "masks.hpp"

#include <algorithm>
#include <vector>

namespace tarn::mt2203 {

namespace {

// How many of the equally good pairs of masks go on from level v, the first that were found.
constexpr std::size_t pool_size(int v) {
  return v < 15 ? 64 : 1;
}

// Mask bit i, counted from the top.
constexpr std::uint32_t bit(int i) {
  return std::uint32_t{0x80000000} >> i;
}

// Has mask bit i an effect at all? What is shifted in from below is 0.
constexpr bool has_effect(int i, int shift) {
  return i + shift < 32;
}

using pairs = std::vector<parameters>;

pairs with_bit_of_b(const pairs& from, int i) {
  pairs result;
  for (const parameters& m : from) {
    result.push_back(m);
    result.push_back({m.a, m.b | bit(i), m.c});
  }
  return result;
}

// All ways to set the bits that output bit v adds: its own bit of c, and of b unless output bit
// v - 15 has shown that one before; and if that bit of c is set, the bit of b further down.
void branch(const parameters& from, int v, pairs& out) {
  constexpr int shift_s = mt2203_shape.shift_s, shift_t = mt2203_shape.shift_t;
  const int i = v - 1;
  pairs ways{from};
  const bool shown = i >= shift_t && (from.c & bit(i - shift_t)) != 0;
  if (has_effect(i, shift_s) && !shown)
    ways = with_bit_of_b(ways, i);
  out.insert(out.end(), ways.begin(), ways.end());
  if (!has_effect(i, shift_t))
    return;
  for (parameters& m : ways)
    m.c |= bit(i);
  if (has_effect(i + shift_t, shift_s))
    ways = with_bit_of_b(ways, i + shift_t);
  out.insert(out.end(), ways.begin(), ways.end());
}

}  // namespace

tempered find_masks(std::uint32_t a) {
  pairs pool{{a, 0, 0}};
  equidistribution quality{};
  for (int v = 1; v <= 32; ++v) {
    pairs tried;
    for (const parameters& m : pool)
      branch(m, v, tried);
    int best = 0;
    for (const parameters& m : tried) {
      const int k = dimension_of_equidistribution(mt2203_shape, m, v);
      if (k > best) {
        best = k;
        pool.clear();
      }
      if (k == best && pool.size() < pool_size(v))
        pool.push_back(m);
    }
    quality.k[static_cast<std::size_t>(v)] = best;
    quality.defect += mt2203_shape.state_bits() / v - best;
  }
  return {pool.front(), quality};
}

}  // namespace tarn::mt2203
