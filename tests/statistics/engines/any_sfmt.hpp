// SPDX-License-Identifier: Apache-2.0
// A stream of sfmt19937 beside its plain model.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "../../models/sfmt_model.hpp"
#include "any_stream.hpp"

namespace plain {

inline constexpr std::size_t block = tarn_test::sfmt_model::words;
inline constexpr std::size_t place_at = 16 + 4 * block;  // where the position stands in a stream

// The first block of the stream of a seed.
inline std::vector<std::uint32_t> first_block(std::uint32_t seed) {
  tarn_test::sfmt_model model(tarn_test::sfmt_from_seed(seed));
  std::vector<std::uint32_t> words;
  for (std::size_t i = 0; i < block; ++i)
    words.push_back(model.word(i));
  return words;
}

struct sfmt {
  explicit sfmt(std::uint32_t seed) : model(first_block(seed)), made(RVX_BRNG_SFMT19937, {seed}) {}

  // A stream whose present block is given.
  explicit sfmt(const std::vector<std::uint32_t>& present)
      : model(present), made(RVX_BRNG_SFMT19937, {1}) {
    std::array<std::uint32_t, block> words{};
    std::copy_n(present.begin(), block, words.begin());
    made.set(16, words);
  }

  // The next word is `place` words behind the start of the present block.
  void set_place(std::size_t place) {
    made.set(place_at, static_cast<std::uint32_t>(place == 0 ? block : place));
    at = place;
  }

  // Word i from the start of the first block on.
  std::uint32_t word(std::size_t i) {
    return static_cast<std::uint32_t>(model.element(i / 4) >> 32 * (i % 4));
  }

  // Draws n words and compares them and the record.
  void draw_and_compare(std::size_t n) {
    const std::vector<std::uint32_t> drawn = made.words(n);
    for (std::size_t i = 0; i < n; ++i)
      ASSERT_EQ(drawn[i], word(at + i)) << "word " << i << " of " << n;
    at += n;
    ASSERT_NO_FATAL_FAILURE(compare_record()) << "after " << n << " words";
  }

  void compare_record() {
    const auto words = made.at<std::array<std::uint32_t, block>>(16);
    for (std::size_t i = 0; i < block; ++i)
      ASSERT_EQ(words[i], word(at / block * block + i));
    ASSERT_EQ(made.at<std::uint32_t>(place_at), at % block == 0 ? block : at % block);
  }

  tarn_test::sfmt_model model;
  support::any_stream made;
  std::size_t at = 0;  // the next word
};

}  // namespace plain
