// SPDX-License-Identifier: Apache-2.0
// Long runs of a digital net, tile by tile.
//
// A tile is a run of words that SIMD can handle at once: 2^m whole points, the first of which has
// an index that is a multiple of 2^m, where there are few dimensions; otherwise a strip of
// successive dimensions of one point. Since points are linear in the bits of their Gray code, tile
// h + 1 is tile h xor a row that depends on the trailing one bits of h alone: tiles step like
// points, with rows in the place of direction words.
#pragma once

#include <cstddef>
#include <cstdint>

#include "engines/digital_net_record.hpp"

namespace tarn::statistics::net {

// Words of a tile: at least as many as the widest vector has. Measured: 64 gain a tenth in calls of
// 65536 words and lose a fifth in calls of 1024, which are the usual ones.
inline constexpr std::size_t min_tile_words = 32;
inline constexpr std::size_t max_tile_words = 128;

// Copies go by so many words and may end behind a tile.
inline constexpr std::size_t copy_words = 16;

using tile_row = std::uint32_t[max_tile_words + copy_words];

struct tile_run {
  const tile_row* rows;  // rows[k] is the step behind a tile whose number ends in k one bits
  std::size_t width;     // words of a tile
  std::size_t stride;    // words from the start of a tile to the start of the next one in `out`
  std::uint64_t number;  // of the first tile
  std::size_t steps;     // 1 or more
  std::uint32_t* out;    // of the second tile; null if it is the last
};

// From the first tile on makes steps; all tiles but the last one go to `out`, the last to `last`.
void step_tiles(const tile_run& run, const tile_row& first, tile_row& last);

// Writes the words up to `to` and moves the current point there.
void draw_tiles(const record& net, place to, std::uint32_t* out);

}  // namespace tarn::statistics::net
