// SPDX-License-Identifier: Apache-2.0
// Rounds of words of mrg32k3a with SIMD. The round is cut into as many parts as there are lanes in
// flight; each lane is set to the start of its part by a power of the transition matrix, and all
// lanes step together.
//
// Lanes hold the values as doubles, reduced to the residue of least magnitude: with the small
// multipliers of this generator every product and difference stays below 2^53 and is exact, and a
// reduction is one rounded quotient. The quotient is below 2^21 and off by less than 2^-31, so a
// residue may pass half the modulus by 2 at most. Only the words need the one residue in
// [0, modulus), and get it with 32-bit arithmetic.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/mrg32k3a_simd.cpp"
#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/mrg32k3a.hpp"
#include "engines/mrg32k3a_lane_starts.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::mrg32k3a::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET == HWY_SCALAR

void write_round(const state& start, std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  state s = start;
  for (std::size_t i = 0; i < round_words; ++i)
    out[i] = next(s);
}

#else

using reals = hn::ScalableTag<double>;
using pairs = hn::ScalableTag<std::uint64_t>;
using words = hn::ScalableTag<std::uint32_t>;
using real_vector = hn::Vec<reals>;
using pair_vector = hn::Vec<pairs>;
using word_vector = hn::Vec<words>;

constexpr std::size_t vector_lanes = hn::MaxLanes(reals());
// Vectors in flight, to hide the latency of a step. Measured for four million words: with 64-byte
// vectors two are faster than four by half, with shorter ones four are faster by a tenth.
constexpr std::size_t in_flight = vector_lanes == 8 ? 2 : 4;
constexpr std::size_t lanes = in_flight * vector_lanes;
constexpr std::size_t part_words = round_words / lanes;

// Words that a lane makes before they are brought into order: a square of pairs of words.
constexpr std::size_t chunk_words = 2 * vector_lanes;
static_assert(part_words % chunk_words == 0);

constexpr lane_starts<lanes> starts = make_lane_starts<lanes>();

// The residue of least magnitude, of numbers whose magnitude is below 2^53. Round goes to the
// nearest integer in every rounding mode of the thread, save on SSSE3, which has no instruction
// for it and needs the usual mode.
template <std::uint32_t modulus>
HWY_INLINE real_vector reduce(real_vector v) {
  const reals d;
  const real_vector quotient = hn::Round(hn::Mul(v, hn::Set(d, 1.0 / modulus)));
  return hn::NegMulAdd(quotient, hn::Set(d, double{modulus}), v);
}

// The last three values of both recurrences.
struct lane_state {
  real_vector x[3], y[3];
};

// The values of one recurrence at the starts of the parts of the lanes from first_lane on; `value`
// are those at the start of the round.
template <std::uint32_t modulus>
HWY_INLINE void set_starts(const std::uint64_t element[3][3][lanes], std::size_t first_lane,
                           const std::uint32_t value[3], real_vector result[3]) {
  const pairs d;
  const words d_word;
  const reals d_real;
  const pair_vector low_half = hn::Set(d, 0xFFFFFFFF);
  const word_vector fold = hn::Set(d_word, 0u - modulus);
  // The bits of 2^52: with them a number below 2^52 in the low bits is a double.
  const pair_vector exponent = hn::Set(d, 0x4330000000000000);
  for (std::size_t i = 0; i < 3; ++i) {
    pair_vector sum = hn::Zero(d);
    for (std::size_t j = 0; j < 3; ++j) {
      const pair_vector lane_element = hn::Load(d, element[i][j] + first_lane);
      const pair_vector p =
          hn::MulEven(hn::BitCast(d_word, lane_element), hn::Set(d_word, value[j]));
      const pair_vector folded = hn::MulEven(hn::BitCast(d_word, hn::ShiftRight<32>(p)), fold);
      sum = hn::Add(sum, hn::Add(folded, hn::And(p, low_half)));
    }
    const real_vector real = hn::BitCast(d_real, hn::Or(sum, exponent));
    result[i] = reduce<modulus>(hn::Sub(real, hn::BitCast(d_real, exponent)));
  }
}

// One step. Returns the new values in the low halves of 64-bit lanes, as signed 32-bit numbers.
struct step_values {
  pair_vector x, y;
};
HWY_INLINE step_values step(lane_state& s) {
  const reals d;
  const pairs d_pair;
  const real_vector x = reduce<m1>(hn::NegMulAdd(hn::Set(d, double{x_step[1]}), s.x[0],
                                                 hn::Mul(hn::Set(d, double{x_step[0]}), s.x[1])));
  const real_vector y = reduce<m2>(hn::MulAdd(hn::Set(d, double{y_step[0]}), s.y[2],
                                              hn::Mul(hn::Set(d, -double{y_step[1]}), s.y[0])));
  s = {{s.x[1], s.x[2], x}, {s.y[1], s.y[2], y}};
  // 1.5 * 2^52 brings the unit to the lowest bit, for both signs.
  const real_vector shift = hn::Set(d, 6755399441055744.0);
  return {hn::BitCast(d_pair, hn::Add(x, shift)), hn::BitCast(d_pair, hn::Add(y, shift))};
}

// The low halves of both, those of `first` in even places.
HWY_INLINE word_vector join(pair_vector first, pair_vector second) {
  const words d;
  return hn::OddEven(hn::BitCast(d, hn::ShiftLeft<32>(second)), hn::BitCast(d, first));
}

// The residue in [0, modulus) of a signed residue of least magnitude.
template <std::uint32_t modulus>
HWY_INLINE word_vector unsigned_residue(word_vector v) {
  const words d;
  const hn::RebindToSigned<words> d_signed;
  const auto negative = hn::BitCast(d, hn::BroadcastSignBit(hn::BitCast(d_signed, v)));
  return hn::Add(v, hn::And(negative, hn::Set(d, modulus)));
}

// The words of two steps, those of the first in even places.
HWY_INLINE word_vector combine(const step_values& first, const step_values& second) {
  const word_vector x = unsigned_residue<m1>(join(first.x, second.x));
  const word_vector y = unsigned_residue<m2>(join(first.y, second.y));
  const word_vector z = hn::Sub(x, y);
  return hn::IfThenElse(hn::Gt(x, y), z, hn::Add(z, hn::Set(words(), m1)));
}

// Writes column `lane` of the square of pairs to out + lane * part_words.
HWY_INLINE void write_columns(const pair_vector square[vector_lanes],
                              std::uint32_t* HWY_RESTRICT out) {
  const pairs d;
  const words d_word;
  const auto store = [&](std::size_t lane, pair_vector v) {
    hn::StoreU(hn::BitCast(d_word, v), d_word, out + lane * part_words);
  };
  // Of rows 2r and 2r + 1: 128-bit block b of half[odd][r] belongs to lane 2b + odd.
  constexpr std::size_t blocks = vector_lanes / 2;
  static_assert(blocks <= 4);
  pair_vector half[2][blocks];
  for (std::size_t r = 0; r < blocks; ++r) {
    half[0][r] = hn::InterleaveLower(d, square[2 * r], square[2 * r + 1]);
    half[1][r] = hn::InterleaveUpper(d, square[2 * r], square[2 * r + 1]);
  }
  for (std::size_t odd = 0; odd < 2; ++odd) {
    const pair_vector* h = half[odd];
    if constexpr (blocks == 1) {
      store(odd, h[0]);
    } else if constexpr (blocks == 2) {
      store(odd, hn::ConcatLowerLower(d, h[1], h[0]));
      store(odd + 2, hn::ConcatUpperUpper(d, h[1], h[0]));
    } else {
      const auto four_blocks = [&](std::size_t lane, pair_vector even_rows, pair_vector odd_rows) {
        store(lane, hn::OddEvenBlocks(hn::SwapAdjacentBlocks(odd_rows), even_rows));
        store(lane + 2, hn::OddEvenBlocks(odd_rows, hn::SwapAdjacentBlocks(even_rows)));
      };
      four_blocks(odd, hn::ConcatLowerLower(d, h[2], h[0]), hn::ConcatLowerLower(d, h[3], h[1]));
      four_blocks(odd + 4, hn::ConcatUpperUpper(d, h[2], h[0]),
                  hn::ConcatUpperUpper(d, h[3], h[1]));
    }
  }
}

void write_round(const state& start, std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const pairs d_pair;
  lane_state s[in_flight];
  for (std::size_t v = 0; v < in_flight; ++v) {
    set_starts<m1>(starts.x, v * vector_lanes, start.x, s[v].x);
    set_starts<m2>(starts.y, v * vector_lanes, start.y, s[v].y);
  }
  for (std::size_t done = 0; done < part_words; done += chunk_words, out += chunk_words) {
    pair_vector square[in_flight][vector_lanes];
    for (std::size_t pair = 0; pair < vector_lanes; ++pair) {
      for (std::size_t v = 0; v < in_flight; ++v) {
        const step_values first = step(s[v]);
        square[v][pair] = hn::BitCast(d_pair, combine(first, step(s[v])));
      }
    }
    for (std::size_t v = 0; v < in_flight; ++v)
      write_columns(square[v], out + v * vector_lanes * part_words);
  }
}

#endif

}  // namespace tarn::statistics::mrg32k3a::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::mrg32k3a {

HWY_EXPORT(write_round);

void write_round(const state& s, std::uint32_t* out) {
  TARN_SIMD_CALL(write_round)(s, out);
}

}  // namespace tarn::statistics::mrg32k3a
#endif
