// SPDX-License-Identifier: Apache-2.0
// Published points and direction words of digital nets against streams.
#pragma once

#include <algorithm>
#include <string>

#include "../../kat/kat_file.hpp"
#include "plain_net.hpp"

namespace support {

// Compares each "point I : ..." line of the file with the stream of so many dimensions; the lines
// "dims ..." before it name the dimensions. The words around the point are drawn with it, so that
// it is met within a run as well. There are `count` such points.
inline void compare_points(std::int64_t code, const std::string& file, std::uint32_t max_dims,
                           std::size_t count) {
  std::size_t compared = 0;
  std::vector<std::uint32_t> dims;
  for (const tarn::kat::line& next : tarn::kat::read_file(TARN_KAT_FOLDER, file)) {
    if (next.fields.at(0) == "dims") {
      dims = tarn::kat::words(next, 1, next.fields.size(), 10);
      continue;
    }
    ASSERT_EQ(next.fields.at(0), "point");
    const std::uint64_t index = std::stoull(next.fields.at(1));
    if (index == 0)
      continue;  // left out by these engines
    const auto expected = tarn::kat::answers(next, 3, 10);
    ASSERT_EQ(expected.size(), dims.size());
    const std::uint32_t all = *std::max_element(dims.begin(), dims.end());
    ASSERT_LE(all, max_dims);
    const std::uint64_t first = index < 6 ? 1 : index - 5;
    const std::uint64_t last = std::min<std::uint64_t>(index + 5, 0xFFFFFFFF);
    net_stream s(code, {all});
    s.skip((first - 1) * all);
    const auto drawn = s.words(static_cast<std::size_t>(last - first + 1) * all);
    for (std::size_t i = 0; i < dims.size(); ++i)
      EXPECT_EQ(drawn[static_cast<std::size_t>(index - first) * all + dims[i] - 1], expected[i])
          << "line " << next.number << ", dimension " << dims[i];
    ++compared;
  }
  EXPECT_EQ(compared, count);
}

// Compares the `count` "dim D : v_1 ... v_32" lines with the record of a stream with all
// dimensions, and the hash over all of them: FNV-1a of 64 bits with the file's own initial value.
inline void compare_directions(std::int64_t code, const std::string& file, std::uint32_t dims,
                               std::size_t count) {
  std::size_t compared = 0;
  const net_stream s(code, {dims});
  bool hashed = false;
  for (const tarn::kat::line& next : tarn::kat::read_file(TARN_KAT_FOLDER, file)) {
    if (next.fields.at(0) == "fnv1a64") {
      std::uint64_t hash = 1469598103934665603;
      for (std::size_t d = 0; d < dims; ++d)
        for (std::size_t k = 0; k < 32; ++k)
          for (unsigned byte = 0; byte < 4; ++byte)
            hash = (hash ^ (s.direction(d, k) >> 8 * byte & 0xFF)) * 0x100000001B3;
      EXPECT_EQ(hash, std::stoull(next.fields.at(1), nullptr, 16));
      hashed = true;
      continue;
    }
    ASSERT_EQ(next.fields.at(0), "dim");
    const std::size_t dim = std::stoull(next.fields.at(1));
    ASSERT_LE(dim, dims);
    const auto expected = tarn::kat::answers(next, 3, 16);
    ASSERT_EQ(expected.size(), 32u);
    for (std::size_t k = 0; k < 32; ++k)
      EXPECT_EQ(s.direction(dim - 1, k), expected[k]) << "dimension " << dim << ", word " << k;
    EXPECT_EQ(s.direction(dim - 1, 32), 0u);
    ++compared;
  }
  EXPECT_TRUE(hashed);
  EXPECT_EQ(compared, count);
}

}  // namespace support
