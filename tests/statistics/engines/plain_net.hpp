// SPDX-License-Identifier: Apache-2.0
// Digital nets in Gray-code order on a plain model: each word by the closed form, the xor of the
// direction words over the one bits of i xor i/2. Streams of sobol and niederreiter beside it.
#pragma once

#include <cstdint>
#include <vector>

#include "../any_stream.hpp"

namespace plain {

// The sequence without point 0, which ends with point 2^32 - 1.
struct net {
  std::size_t dims;
  std::vector<std::uint32_t> v;  // 32 words for each dimension, most significant first
  std::uint64_t position;        // words before the next one, those of point 0 included

  std::uint64_t index() const { return position / dims; }
  std::size_t taken() const { return static_cast<std::size_t>(position % dims); }
  std::uint64_t end() const { return (std::uint64_t{1} << 32) * dims; }

  std::uint32_t coordinate(std::uint64_t i, std::size_t d) const {
    std::uint32_t x = 0;
    for (unsigned k = 0; k < 32; ++k)
      x ^= ((i ^ i / 2) >> k & 1) != 0 ? v[32 * d + k] : 0;
    return x;
  }
  std::uint32_t next() {
    const std::uint32_t word = coordinate(index(), taken());
    ++position;
    return word;
  }
};

}  // namespace plain

namespace support {

// Offsets of the record from the start of a stream.
namespace net_record {
inline constexpr std::size_t index = 16, dims = 20, marker = 24, owed = 28, spare = 32,
                             near_point = 64, directions = 256;
inline constexpr std::size_t words_of_dimension = 33;
inline std::size_t point(std::size_t n) {
  return n <= 48 ? near_point : directions + 4 * words_of_dimension * n;
}
inline std::size_t size(std::size_t n) {
  return directions + 4 * words_of_dimension * n + (n <= 48 ? 0 : 4 * n);
}
}  // namespace net_record

class net_stream : public any_stream {
 public:
  net_stream(std::int64_t code, const std::vector<std::uint32_t>& seed) : any_stream(code, seed) {}

  std::uint32_t direction(std::size_t dim, std::size_t k) const {
    return at<std::uint32_t>(net_record::directions +
                             4 * (net_record::words_of_dimension * dim + k));
  }

  // The model at the same place, with the direction words of the record.
  plain::net model() const {
    plain::net m{at<std::uint32_t>(net_record::dims), {}, 0};
    for (std::size_t d = 0; d < m.dims; ++d)
      for (std::size_t k = 0; k < 32; ++k)
        m.v.push_back(direction(d, k));
    const auto index = at<std::uint32_t>(net_record::index);
    const auto owed = at<std::uint32_t>(net_record::owed);
    m.position = (index == 0 ? m.end() : index * m.dims) + (owed == 0 ? 0 : m.dims - owed);
    return m;
  }

  // Sets the record to the model's place, field by field.
  void place(const plain::net& m) {
    set(net_record::index, static_cast<std::uint32_t>(m.index()));
    set(net_record::owed, static_cast<std::uint32_t>((m.dims - m.taken()) % m.dims));
    for (std::size_t d = 0; d < m.dims; ++d)
      set(net_record::point(m.dims) + 4 * d, expected_coordinate(m, d));
  }

  // Whether the record says what the model says.
  testing::AssertionResult stands_at(const plain::net& m) const {
    if (at<std::uint32_t>(net_record::index) != static_cast<std::uint32_t>(m.index()))
      return testing::AssertionFailure() << "index, not " << m.index();
    if (at<std::uint32_t>(net_record::owed) != (m.dims - m.taken()) % m.dims)
      return testing::AssertionFailure() << "owed, with " << m.taken() << " taken";
    for (std::size_t d = 0; d < m.dims; ++d)
      if (at<std::uint32_t>(net_record::point(m.dims) + 4 * d) != expected_coordinate(m, d))
        return testing::AssertionFailure() << "dimension " << d << " of the current point";
    return testing::AssertionSuccess();
  }

 private:
  // At the end the current point is 0.
  static std::uint32_t expected_coordinate(const plain::net& m, std::size_t d) {
    return m.position == m.end() ? 0 : m.coordinate(m.index(), d);
  }
};

}  // namespace support
