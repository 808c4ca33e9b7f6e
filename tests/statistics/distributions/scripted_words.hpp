// SPDX-License-Identifier: Apache-2.0
// Values of routines with one word a value, for words of one's choice: the numbers i / 2^32 of
// [0, 1) in their order, i = 0, 1, ... 2^32 - 1, through counters found by the inverse of Philox.
// So the law of a routine can be measured without a sample: where each value begins tells how many
// of the 2^32 words lead to it.
#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <vector>

#include "support.hpp"

namespace support {

constexpr std::uint64_t word_count = std::uint64_t{1} << 32;

// The word that philox reads as i / 2^32: its words are signed, around the middle.
inline std::uint32_t word_at(std::uint64_t i) {
  return static_cast<std::uint32_t>(i) ^ 0x80000000u;
}

// A routine: draws n values from the stream.
using routine = std::function<int(rvx_stream, std::int64_t n, std::int32_t* r)>;

class scripted {
 public:
  explicit scripted(routine draw) : draw_(std::move(draw)) {}

  using four = std::array<std::uint64_t, 4>;

  std::array<std::int32_t, 4> values(const four& i) {
    s_.set(key,
           plain::counter_of({word_at(i[0]), word_at(i[1]), word_at(i[2]), word_at(i[3])}, key), 0);
    std::array<std::int32_t, 4> r{};
    EXPECT_EQ(draw_(s_, 4, r.data()), 0);
    return r;
  }
  std::int32_t value(std::uint64_t i) { return values({i, i, i, i})[0]; }

  // For each value of first, first + 1, ... last the least i whose value is at least that one, 2^32
  // if there is none. The values must not fall as i grows.
  std::vector<std::uint64_t> steps(std::int32_t first, std::int32_t last) {
    std::vector<std::uint64_t> least;
    for (std::int32_t k = first; k <= last; k += 4) {
      four low{}, high;
      high.fill(word_count);
      for (int round = 0; round < 33; ++round) {
        four middle;
        for (unsigned lane = 0; lane < 4; ++lane)
          middle[lane] = std::min((low[lane] + high[lane]) / 2, word_count - 1);
        const auto found = values(middle);
        for (unsigned lane = 0; lane < 4; ++lane) {
          if (low[lane] == high[lane])
            continue;
          if (found[lane] >= k + static_cast<std::int32_t>(lane))
            high[lane] = middle[lane];
          else
            low[lane] = middle[lane] + 1;
        }
      }
      for (unsigned lane = 0; lane < 4 && k + static_cast<std::int32_t>(lane) <= last; ++lane)
        least.push_back(low[lane]);
    }
    return least;
  }

 private:
  static constexpr plain::two key{11, 12};
  routine draw_;
  stream s_;
};

}  // namespace support
