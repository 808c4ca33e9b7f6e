// SPDX-License-Identifier: Apache-2.0
// Digital nets: states, skips and words.
#include "engines/digital_net.hpp"

#include <algorithm>
#include <cstring>

#include "engines/digital_net_record.hpp"
#include "engines/digital_net_tiles.hpp"
#include "tarn_rvx.h"

namespace tarn::statistics::net {

namespace {

constexpr std::uint64_t header_bytes = 16;  // of a stream
constexpr std::uint64_t max_stream_bytes = 0x7FFFFFFF;

// Calls that end within so many words or points are not worth the preparation of tiles.
constexpr std::size_t few_words = 64;
constexpr std::uint64_t few_points = 2;

// The number of dimensions whose state has this size, if there is one.
std::size_t dims_of(std::size_t size) {
  const std::size_t words = size / sizeof(std::uint32_t);
  const std::size_t behind = words < directions_field ? 0 : words - directions_field;
  const std::size_t dims = behind / direction_words;
  return dims <= near_dims ? dims : behind / (direction_words + 1);
}

// A field of a state that need not be aligned.
std::uint32_t read(const void* state, field f) {
  std::uint32_t word;
  std::memcpy(&word, static_cast<const unsigned char*>(state) + f * sizeof word, sizeof word);
  return word;
}

// Moves the current point from one index to another.
void move_point(const record& net, std::uint64_t from, std::uint64_t to) {
  for (std::uint64_t bits = gray_code(from) ^ gray_code(to); bits != 0; bits &= bits - 1) {
    const auto k = static_cast<unsigned>(__builtin_ctzll(bits));
    for (std::size_t d = 0; d < net.dims; ++d)
      net.point[d] ^= net.direction(d, k);
  }
}

// The words up to `to`, point by point.
void draw_points(const record& net, place to, std::uint32_t* out) {
  place at = net.position();
  for (; at.index != to.index; ++at.index) {
    out = std::copy(net.point + at.taken, net.point + net.dims, out);
    at.taken = 0;
    move_point(net, at.index, at.index + 1);
  }
  std::copy(net.point + at.taken, net.point + to.taken, out);
}

// Words of a seed before those of the user's.
constexpr std::size_t header_words = 3;

std::uint32_t dims_of(span<std::uint32_t> seed) {
  return seed.size == 0 ? 1 : seed.data[0];
}

// Bytes of the state of so many dimensions.
std::uint64_t bytes_of(std::uint64_t dims) {
  const std::uint64_t words =
      directions_field + dims * (direction_words + (dims <= near_dims ? 0 : 1));
  return words * sizeof(std::uint32_t);
}

// The same, or bad_seed if there are none or too many.
std::size_t size_of(std::uint64_t dims) {
  if (dims == 0)
    return bad_seed;
  const std::uint64_t bytes = bytes_of(dims);
  return bytes > max_stream_bytes - header_bytes ? bad_seed : static_cast<std::size_t>(bytes);
}

}  // namespace

const std::uint32_t* users_words(span<std::uint32_t> seed) {
  return seed.size <= 1 ? nullptr : seed.data + header_words;
}

std::size_t state_size(const seed_form& form, span<std::uint32_t> seed) {
  const std::uint32_t dims = dims_of(seed);
  if (seed.size <= 1)
    return dims <= form.table_dims ? size_of(dims) : bad_seed;
  const bool users = seed.size >= header_words && seed.data[1] == 1 && seed.data[2] == form.kind &&
                     (seed.size - header_words) / form.words >= dims;
  return users ? size_of(dims) : bad_seed;
}

int seed_state(void* state, const seed_form& form, span<std::uint32_t> seed,
               void (*direct)(const std::uint32_t* words, std::uint32_t* directions)) {
  const std::uint32_t dims = dims_of(seed);
  std::memset(state, 0, bytes_of(dims));
  auto* fields = static_cast<std::uint32_t*>(state);
  fields[index_field] = 1;
  fields[dims_field] = dims;
  fields[marker_field] = made_here;
  std::uint32_t* directions = fields + directions_field;
  if (const std::uint32_t* words = users_words(seed); words == nullptr) {
    std::copy_n(form.table, dims * direction_words, directions);
  } else {
    for (std::size_t d = 0; d < dims; ++d)
      direct(words + d * form.words, directions + d * direction_words);
  }
  move_point(record(state), 0, 1);
  return RVX_STATUS_OK;
}

bool accepts(const void* state, std::size_t size, std::uint32_t) {
  // The size first, and then field by field: in a damaged image the size may be wrong, and there
  // may be less than a record.
  const std::size_t dims = dims_of(size);
  return size_of(dims) == size && read(state, dims_field) == dims &&
         read(state, marker_field) == made_here && read(state, owed_field) < dims &&
         (read(state, index_field) != 0 || read(state, owed_field) == 0);
}

std::uint64_t remaining(const void* state) {
  const std::uint32_t dims = read(state, dims_field), owed = read(state, owed_field);
  const std::uint32_t index = read(state, index_field);
  const std::uint64_t points = index == 0 ? 0 : end_index - index;
  return points * dims - (owed == 0 ? 0 : dims - owed);
}

void skip(void* state, span<std::uint64_t> digits) {
  const record net(state);
  const place to = net.position_after(digits.data[0]);
  move_point(net, net.position().index, to.index);
  net.settle(to);
}

void fill(void* state, std::uint32_t* out, std::size_t n) {
  const record net(state);
  const place to = net.position_after(n);
  if (n <= few_words || to.index - net.position().index <= few_points)
    draw_points(net, to, out);
  else
    draw_tiles(net, to, out);
  net.settle(to);
}

}  // namespace tarn::statistics::net
