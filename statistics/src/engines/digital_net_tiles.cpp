// SPDX-License-Identifier: Apache-2.0
// Cutting a call into strips and tiles.
#include "engines/digital_net_tiles.hpp"

#include <algorithm>
#include <cstring>

#include "engines/digital_net_record.hpp"

namespace tarn::statistics::net {

namespace {

// One call: where it begins and ends, and how it is laid out in tiles.
struct call {
  const record& net;
  place from, to;
  std::uint32_t* out;
  unsigned group;  // a tile has 2^group points

  std::size_t stride() const { return net.dims << group; }  // words from tile to tile
  std::uint64_t first_tile() const { return from.index >> group; }
  std::uint64_t last_tile() const { return to.index >> group; }
  // Words of the first tile before the call, and of the last tile within it.
  std::size_t begin() const { return in_tile(from) * net.dims + from.taken; }
  std::size_t end() const { return in_tile(to) * net.dims + to.taken; }
  // The number of a point within its tile.
  std::size_t in_tile(place p) const {
    return static_cast<std::size_t>(p.index) & ((std::size_t{1} << group) - 1);
  }
};

// Dimensions [first, first + count) of a call; all of them if a tile has several points.
struct strip {
  std::size_t first, count;
};

// Repeats `count` words until there are `words` of them, `count` times a power of two. Twice as
// many again and again, in copies of one size: a call of memcpy would take longer than they do.
void repeat(tile_row& row, std::size_t count, std::size_t words) {
  for (; count < words; count *= 2) {
    for (std::size_t i = 0; i < count; i += copy_words) {
      std::uint32_t copy[copy_words];
      std::memcpy(copy, row + i, sizeof copy);
      std::memcpy(row + count + i, copy, sizeof copy);
    }
  }
}

// The tile that the current point belongs to: its first point, then twice as many points again and
// again. Within the tile, point i + 2^b is point i xor point 2^b of the sequence for i < 2^b.
void make_first_tile(const call& c, strip s, tile_row& tile) {
  const record& net = c.net;
  for (std::size_t d = 0; d < s.count; ++d)
    tile[d] = net.point[s.first + d];
  for (std::uint64_t bits = gray_code(c.in_tile(c.from)); bits != 0; bits &= bits - 1)
    for (std::size_t d = 0; d < s.count; ++d)
      tile[d] ^= net.direction(s.first + d, static_cast<unsigned>(__builtin_ctzll(bits)));

  tile_row jump;
  for (unsigned b = 0; b < c.group; ++b) {
    for (std::size_t d = 0; d < s.count; ++d)
      jump[d] = net.direction(s.first + d, b) ^ (b == 0 ? 0 : net.direction(s.first + d, b - 1));
    const std::size_t words = s.count << b;
    repeat(jump, s.count, words);
    for (std::size_t i = 0; i < words; ++i)
      tile[words + i] = tile[i] ^ jump[i];
  }
}

// The rows for steps that change the low `bits` bits of a tile's number. All points of a tile step
// alike: in their Gray code, bit k of the tile's number and the highest bit within the tile change.
void make_rows(const call& c, strip s, unsigned bits, tile_row* rows) {
  for (std::size_t d = 0; d < s.count; ++d) {
    const std::uint32_t within = c.group == 0 ? 0 : c.net.direction(s.first + d, c.group - 1);
    for (unsigned k = 0; k < bits; ++k)
      rows[k][d] = c.net.direction(s.first + d, c.group + k) ^ within;
  }
  for (unsigned k = 0; k < bits; ++k)
    repeat(rows[k], s.count, s.count << c.group);
}

// Copies words [begin, end) of a row of tiles, as far as they lie in the strip's tile, to out.
void copy_part(const tile_row& tile, strip s, std::size_t width, std::size_t begin, std::size_t end,
               std::uint32_t* out) {
  const std::size_t first = std::max(begin, s.first);
  const std::size_t last = std::min(end, s.first + width);
  if (first < last)
    std::copy(tile + (first - s.first), tile + (last - s.first), out + (first - begin));
}

void draw_strip(const call& c, strip s) {
  alignas(64) tile_row tile, last;
  alignas(64) tile_row rows[direction_words];
  const std::size_t width = s.count << c.group;
  const std::uint64_t number = c.first_tile();
  const auto steps = static_cast<std::size_t>(c.last_tile() - number);
  make_first_tile(c, s, tile);
  const std::uint32_t* end_point = tile;
  if (steps == 0) {
    copy_part(tile, s, width, c.begin(), c.end(), c.out);
  } else {
    copy_part(tile, s, width, c.begin(), c.stride(), c.out);
    std::uint32_t* second = c.out + (c.stride() - c.begin());
    const auto bits = 64 - static_cast<unsigned>(__builtin_clzll(number ^ c.last_tile()));
    make_rows(c, s, bits, rows);
    std::uint32_t* out = steps == 1 ? nullptr : second + s.first;
    step_tiles({rows, width, c.stride(), number, steps, out}, tile, last);
    copy_part(last, s, width, 0, c.end(), second + (steps - 1) * c.stride());
    end_point = last;
  }
  std::copy_n(end_point + c.in_tile(c.to) * c.net.dims, s.count, c.net.point + s.first);
}

}  // namespace

void draw_tiles(const record& net, place to, std::uint32_t* out) {
  call c{net, net.position(), to, out, 0};
  while (c.stride() < min_tile_words)
    ++c.group;
  const std::size_t strips = (net.dims + max_tile_words - 1) / max_tile_words;
  for (std::size_t i = 0; i < strips; ++i) {
    const std::size_t first = net.dims * i / strips;
    draw_strip(c, {first, net.dims * (i + 1) / strips - first});
  }
}

}  // namespace tarn::statistics::net
