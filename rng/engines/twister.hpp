// SPDX-License-Identifier: Apache-2.0
// Stepping of Mersenne twisters in kernels (Matsumoto, Nishimura, "Mersenne Twister: a
// 623-dimensionally equidistributed uniform pseudo-random number generator", ACM TOMACS 8, 1998).
// The sequence lies in a ring that is longer than the state by the words that a team of work-items
// makes at once, so that a round of the team never writes what it reads. The ring is followed by
// its position, where the oldest word of the state stands; that word is the next to be delivered.
#pragma once

#include <algorithm>
#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"

namespace kestrel::tarn::rng::detail {

/// What tells twisters of one shape apart.
struct twister_constants {
  std::uint32_t matrix;  // last row of the twist matrix
  std::uint32_t mask_b;  // of the tempering shift by 7
  std::uint32_t mask_c;  // of the tempering shift by 15
};

/// A shape: `order` words of state and the lag `middle`, a team of so many work-items, how many
/// lower bits of a word are joined with the upper ones of the word before it, the first shift of
/// the tempering.
template <std::uint32_t order_, std::uint32_t middle_, std::uint32_t team_, int lower_bits,
          int first_shift_>
struct twister_shape {
  static constexpr std::uint32_t order = order_;
  static constexpr std::uint32_t middle = middle_;
  static constexpr std::uint32_t team = team_;
  static constexpr std::uint32_t ring = order + team;
  static constexpr std::uint32_t image = ring + 1;  // the ring and its position
  static constexpr std::uint32_t upper = ~std::uint32_t{0} << lower_bits;
  static constexpr int first_shift = first_shift_;
  static_assert(team <= order - middle, "a round reads the new words of earlier rounds alone");

  /// A place below 2 * ring as one of the ring.
  SYCL_EXTERNAL static std::uint32_t wrap(std::uint32_t place) {
    return place < ring ? place : place - ring;
  }
};

/// The word that comes `order` words after `first`; `second` is the one after `first`, `middle` the
/// one with the other lag.
template <typename Shape>
SYCL_EXTERNAL std::uint32_t twisted(std::uint32_t first, std::uint32_t second, std::uint32_t middle,
                                    std::uint32_t matrix) {
  const std::uint32_t joined = (first & Shape::upper) | (second & ~Shape::upper);
  return joined >> 1 ^ middle ^ ((second & 1) != 0 ? matrix : 0);
}

template <typename Shape>
SYCL_EXTERNAL std::uint32_t temper(std::uint32_t word, const twister_constants& constants) {
  word ^= word >> Shape::first_shift;
  word ^= (word << 7) & constants.mask_b;
  word ^= (word << 15) & constants.mask_c;
  return word ^ word >> 18;
}

/// The state record as it stands in the host stream's memory: a block of words, and the position of
/// the first one that has not been delivered, `order` if none has.
template <typename Shape>
struct twister_record {
  std::uint32_t words[Shape::order];
  std::uint32_t position;

  /// Whether some words of the block have been delivered, by the letter: 0 means the same as
  /// `order`, and is read so, but counts as a place inside the block.
  bool in_mid_block() const { return position < Shape::order; }
};

/// How the words of a call are shared out: every work-group makes `rounds` rounds of a team, `more`
/// rounds are left for some groups, and the last group makes `tail` words besides. A remainder of
/// exactly one round is made as a tail.
struct twister_plan {
  std::uint64_t rounds;
  std::uint64_t more;
  std::uint32_t tail;  // 0 to a whole team
};

template <typename Shape>
twister_plan twister_plan_of(std::uint64_t words, std::uint32_t groups) {
  const std::uint64_t sweep = std::uint64_t{groups} * Shape::team;
  const std::uint64_t rest = words % sweep;
  const bool has_rounds = rest > Shape::team;
  return {words / sweep, has_rounds ? rest / Shape::team : 0,
          static_cast<std::uint32_t>(has_rounds ? rest % Shape::team : rest)};
}

/// The image of a record. Where that stands inside its block, the words that complete the state are
/// made here, so that the ring begins with the next word in any case.
template <typename Shape>
void twister_image_from(const twister_record<Shape>& record, std::uint32_t matrix,
                        std::uint32_t* image) {
  std::uint32_t sequence[2 * Shape::order];
  std::copy_n(record.words, Shape::order, sequence);
  const std::uint32_t read = record.position % Shape::order;
  for (std::uint32_t i = 0; i < read; ++i) {
    sequence[i + Shape::order] =
        twisted<Shape>(sequence[i], sequence[i + 1], sequence[i + Shape::middle], matrix);
  }
  std::copy_n(sequence + read, Shape::order, image);
  std::fill_n(image + Shape::order, Shape::image - Shape::order, 0u);
}

/// The other way: the state as a whole block of which no word has been delivered.
template <typename Shape>
void twister_record_from(const std::uint32_t* image, twister_record<Shape>& record) {
  for (std::uint32_t i = 0; i < Shape::order; ++i) {
    record.words[i] = image[Shape::wrap(image[Shape::ring] + i)];
  }
  record.position = Shape::order;
}

}  // namespace kestrel::tarn::rng::detail
