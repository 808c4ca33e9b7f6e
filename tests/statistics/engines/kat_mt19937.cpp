// SPDX-License-Identifier: Apache-2.0
// mt19937 against published answers, reached by drawing and by skipping.
#include "../../kat/kat_file.hpp"
#include "../any_stream.hpp"

namespace {

using kat_mt19937 = support::on_simd_target;
using support::any_stream;

// Lines "at N : words" that follow the line of a seed; returns how many were compared.
std::size_t expect_answers(const std::vector<tarn::kat::line>& lines, std::size_t first,
                           const std::vector<std::uint32_t>& seed) {
  std::size_t compared = 0;
  any_stream drawn(RVX_BRNG_MT19937, seed);
  std::uint64_t place = 0;
  for (std::size_t i = first; i < lines.size() && lines[i].fields.at(0) == "at"; ++i, ++compared) {
    const std::uint64_t at = std::stoull(lines[i].fields.at(1));
    const auto expected = tarn::kat::answers(lines[i], 3, 10);
    drawn.words(at - place);
    EXPECT_EQ(drawn.words(expected.size()), expected) << "line " << lines[i].number;
    place = at + expected.size();
    any_stream skipped(RVX_BRNG_MT19937, seed);
    skipped.skip(at);
    EXPECT_EQ(skipped.words(expected.size()), expected) << "line " << lines[i].number;
  }
  return compared;
}

TEST_F(kat_mt19937, single_seeds) {
  const auto lines = tarn::kat::read_file(TARN_KAT_FOLDER, "mt19937");
  std::size_t compared = 0;
  for (std::size_t i = 0; i < lines.size(); ++i) {
    if (lines[i].fields.at(0) == "seed")
      compared += expect_answers(lines, i + 1, tarn::kat::words(lines[i], 1, 2, 10));
  }
  EXPECT_EQ(compared, 4u * 4u);
}

// Keys of one word are left out: one word is a single seed here.
TEST_F(kat_mt19937, keys_of_several_words) {
  const auto lines = tarn::kat::read_file(TARN_KAT_FOLDER, "mt19937_array");
  std::size_t compared = 0;
  for (std::size_t i = 0; i < lines.size(); ++i) {
    std::vector<std::uint32_t> key;
    if (lines[i].fields.at(0) == "array") {
      key = tarn::kat::words(lines[i], 1, lines[i].fields.size(), 16);
    } else if (lines[i].fields.at(0) == "array_1000") {
      for (std::uint32_t k = 0; k < 1000; ++k)
        key.push_back(k * 2654435761u);
    }
    if (key.size() > 1)
      compared += expect_answers(lines, i + 1, key);
  }
  EXPECT_EQ(compared, 3u * 4u);
}

}  // namespace
