// SPDX-License-Identifier: Apache-2.0
// The record of a digital net as it stands in a stream, where clients read it, and the steps from
// point to point in it. Offsets are in words from the start of the state, byte 16 of the stream.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "engines/digital_net.hpp"

namespace tarn::statistics::net {

enum field : std::size_t {
  // Of the point in progress or, when none is, of the next one. 0: at the end; who steps a record
  // by
  // himself must not take that for point 0.
  index_field,
  dims_field,        // number of dimensions
  marker_field,      // made_here
  owed_field,        // coordinates that the point in progress still owes; 0: none is in progress
  point_field = 12,  // the current point, where it fits below the directions
  directions_field = 60,  // dimension by dimension
};

// The marker of every stream that this library makes.
inline constexpr std::uint32_t made_here = 0xFFFFFFFF;

// Up to so many dimensions the point stands below the directions, with more behind them.
inline constexpr std::uint32_t near_dims = directions_field - point_field;

inline constexpr std::uint64_t end_index = std::uint64_t{1} << 32;

// A place in the sequence: of point `index`, `taken` < dims coordinates are delivered.
struct place {
  std::uint64_t index;  // 1 to end_index
  std::uint32_t taken;
};

struct record {
  explicit record(void* state)
      : words(static_cast<std::uint32_t*>(state)),
        dims(words[dims_field]),
        directions(words + directions_field),
        point(dims <= near_dims ? words + point_field : directions + dims * direction_words) {}

  place position() const {
    const std::uint32_t index = words[index_field], owed = words[owed_field];
    return {index == 0 ? end_index : index, owed == 0 ? 0 : words[dims_field] - owed};
  }

  // The place behind n more words; n is at most what remains.
  place position_after(std::uint64_t n) const {
    const place from = position();
    const std::uint64_t taken = from.taken + n;
    return {from.index + taken / dims, static_cast<std::uint32_t>(taken % dims)};
  }

  // Notes that the stream stands at `p`, whose point is there already.
  void settle(place p) const {
    words[index_field] = static_cast<std::uint32_t>(p.index);
    words[owed_field] = p.taken == 0 ? 0 : words[dims_field] - p.taken;
    if (p.index == end_index)
      std::fill_n(point, dims, 0u);
  }

  // v_(k+1) of dimension d; k <= 32.
  std::uint32_t direction(std::size_t d, unsigned k) const {
    return directions[d * direction_words + k];
  }

  std::uint32_t* words;
  std::size_t dims;
  std::uint32_t* directions;
  std::uint32_t* point;
};

// The number of trailing one bits: the direction word of the step from point i to i + 1.
inline unsigned step_of(std::uint64_t i) {
  return static_cast<unsigned>(__builtin_ctzll(~i));
}

// The bits whose direction words make up point i.
inline std::uint64_t gray_code(std::uint64_t i) {
  return i ^ i >> 1;
}

}  // namespace tarn::statistics::net
