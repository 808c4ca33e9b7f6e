// SPDX-License-Identifier: Apache-2.0
// Long jumps: the power of t, and the elements that it names.
#include "gf2/linear_jump.hpp"

#include <array>
#include <vector>

#include "gf2/residue.hpp"
#include "tables/minimal_polynomials.hpp"

namespace tarn::statistics {

namespace {

using residue = std::array<std::uint64_t, gf2::residue_words>;

static_assert(jump_terms == 64 * gf2::residue_words && polynomial_words == gf2::residue_words);

// The multiple of p by a power of t that has degree 19968, less its leading term. It annihilates
// what p annihilates, whatever the first 19968 - degree elements hold.
residue aligned(const jump_polynomial& p) {
  const std::size_t up = jump_terms - p.degree;  // below 64
  residue low;
  std::uint64_t carry = 0;
  for (std::size_t i = 0; i < low.size(); ++i) {
    low[i] = p.low[i] << up | carry;
    carry = up == 0 ? 0 : p.low[i] >> (64 - up);
  }
  return low;
}

// t^distance modulo that multiple, by squaring from the leading bits of the distance on; these
// need no reduction while they are a possible degree.
residue power(const jump_polynomial& p, std::uint64_t distance) {
  int rest = 0;
  while (distance >> rest >= jump_terms)
    ++rest;
  const std::uint64_t lead = distance >> rest;
  residue x{};
  x[lead / 64] = std::uint64_t{1} << lead % 64;
  const residue low = aligned(p);
  while (rest-- > 0)
    gf2::square(low.data(), static_cast<int>(distance >> rest & 1), x.data());
  return x;
}

}  // namespace

void jump(const jump_polynomial& p, std::uint64_t distance, const std::uint32_t* words,
          std::size_t stride, std::size_t count, std::uint32_t* out) {
  const residue x = power(p, distance);
  std::vector<std::uint32_t> first;
  first.reserve(jump_terms);
  for (std::uint32_t i = 0; i < jump_terms; ++i) {
    if ((x[i / 64] >> i % 64 & 1) != 0)
      first.push_back(i * static_cast<std::uint32_t>(stride));
  }
  gf2::sum_windows(words, first.data(), first.size(), count, out);
}

}  // namespace tarn::statistics
