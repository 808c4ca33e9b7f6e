// SPDX-License-Identifier: Apache-2.0
// A serial model of mt2203 on a GPU queue, from the description of the method alone: as many
// generators as the device has compute units, each with a ring of 101 words and a position. A call
// is cut into runs of whole rounds of 32 words, one run from each generator; the last generator
// takes the rounds that are left, and the words that do not make a round. After a call with such
// words only the last position has moved.
#pragma once

#include <cstdint>
#include <cstring>
#include <vector>

#include "every_engine.hpp"

namespace tarn_test {

class mt2203_generator {
 public:
  /// Member `index` of the family, from a fresh stream, whose whole block is unread.
  template <typename Seed>
  mt2203_generator(std::uint32_t index, const Seed& seed) : ring_(101) {
    const plain_stream stream(0x900000 + index, seed);
    const auto* bytes = static_cast<const unsigned char*>(static_cast<rvx_stream>(stream));
    std::uint32_t position = 0;
    std::memcpy(ring_.data(), bytes + 16, 69 * sizeof(std::uint32_t));
    std::memcpy(&position, bytes + 292, sizeof position);
    std::memcpy(constants_, bytes + 296, sizeof constants_);
    EXPECT_EQ(position, 69u);
  }

  /// The next words, word by word; `moves` says whether the position goes along.
  std::vector<std::uint32_t> draw(std::uint64_t n, bool moves) {
    std::vector<std::uint32_t> words;
    std::size_t place = position_;
    for (std::uint64_t i = 0; i < n; ++i, place = (place + 1) % 101) {
      const std::uint32_t oldest = ring_[place];
      const std::uint32_t after = ring_[(place + 1) % 101];
      const std::uint32_t joined = oldest / 32 * 32 + after % 32;
      ring_[(place + 69) % 101] =
          joined / 2 ^ ring_[(place + 34) % 101] ^ (after % 2 == 1 ? constants_[0] : 0);
      words.push_back(tempered(oldest));
    }
    if (moves) {
      position_ = place;
    }
    return words;
  }

 private:
  std::uint32_t tempered(std::uint32_t x) const {
    x ^= x >> 12;
    x ^= x << 7 & constants_[1];
    x ^= x << 15 & constants_[2];
    return x ^ x >> 18;
  }

  std::vector<std::uint32_t> ring_;
  std::size_t position_ = 0;
  std::uint32_t constants_[3] = {0, 0, 0};
};

class mt2203_family {
 public:
  template <typename Seed>
  mt2203_family(std::uint32_t generators, const Seed& seed) {
    for (std::uint32_t i = 0; i < generators; ++i) {
      generators_.emplace_back(i, seed);
    }
  }

  /// The words of a call that takes `words` of them, and `ahead` more from the last generator that
  /// the call does not count: the partner of an odd last word.
  std::vector<std::uint32_t> draw(std::uint64_t words, std::uint64_t ahead = 0) {
    const std::uint64_t count = generators_.size();
    const std::uint64_t rounds = words / (32 * count);
    std::uint64_t left = words % (32 * count);
    std::uint64_t more = 0;
    if (left > 32) {
      more = left / 32;
      left = left % 32;
    }
    std::vector<std::uint32_t> all;
    for (std::uint64_t i = 0; i < count; ++i) {
      const bool last = i + 1 == count;
      const std::uint64_t run = 32 * rounds + (last ? 32 * more + left : 0);
      auto part = generators_[i].draw(run, last || left == 0);
      if (last && ahead != 0) {
        const auto partner = mt2203_generator(generators_[i]).draw(ahead, true);
        part.insert(part.end(), partner.begin(), partner.end());
      }
      all.insert(all.end(), part.begin(), part.end());
    }
    return all;
  }

 private:
  std::vector<mt2203_generator> generators_;
};

}  // namespace tarn_test
