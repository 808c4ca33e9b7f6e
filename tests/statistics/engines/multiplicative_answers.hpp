// SPDX-License-Identifier: Apache-2.0
// Published answers of the multiplicative congruential engines. A file gives the states after 1,
// 2, ... steps; these engines deliver the start state first, so an answer "at N" is word N + 1.
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

#include "../../kat/kat_file.hpp"
#include "any_stream.hpp"

namespace multiplicative {

struct answer {
  std::uint64_t start;  // word 0
  std::uint64_t index;  // of the first of the words
  std::vector<std::uint64_t> words;
};

inline std::uint64_t number(const std::string& field) {
  std::size_t used = 0;
  const unsigned long long value = std::stoull(field, &used);
  if (used != field.size())
    throw std::runtime_error("bad number " + field);
  return value;
}

// Lines "first START : words" and "at N : words".
inline std::vector<answer> answers(const std::string& engine) {
  std::vector<answer> all;
  std::uint64_t start = 0;
  for (const tarn::kat::line& line : tarn::kat::read_file(TARN_KAT_FOLDER, engine)) {
    const bool first = line.fields.at(0) == "first";
    if ((!first && line.fields[0] != "at") || line.fields.at(2) != ":" || line.fields.size() < 4)
      throw std::runtime_error("line " + std::to_string(line.number) + " is of no known form");
    if (first)
      start = number(line.fields[1]);
    answer next{start, first ? 1 : number(line.fields[1]) + 1, {}};
    for (std::size_t i = 3; i < line.fields.size(); ++i)
      next.words.push_back(number(line.fields[i]));
    all.push_back(next);
  }
  return all;
}

inline std::uint64_t word(const std::vector<std::uint32_t>& drawn, std::size_t i,
                          std::size_t parts) {
  return parts == 1 ? drawn.at(i) : drawn.at(2 * i) | std::uint64_t{drawn.at(2 * i + 1)} << 32;
}

// Draws the answer's words after a skip to its index, and, where that is near, after drawing all
// the words before it.
inline void expect_answer(std::int64_t code, std::size_t parts, const answer& known) {
  constexpr std::uint64_t near = 2'000'000;
  const std::vector<std::uint32_t> seed = {static_cast<std::uint32_t>(known.start),
                                           static_cast<std::uint32_t>(known.start >> 32)};
  support::any_stream skipped(code, seed);
  skipped.skip(known.index);
  const auto words = skipped.words(known.words.size(), parts);
  for (std::size_t i = 0; i < known.words.size(); ++i)
    EXPECT_EQ(word(words, i, parts), known.words[i]) << "word " << known.index + i;

  if (known.index < near) {
    support::any_stream drawn(code, seed);
    const auto index = static_cast<std::size_t>(known.index);
    const auto all = drawn.words(index + known.words.size(), parts);
    EXPECT_EQ(word(all, 0, parts), known.start);
    for (std::size_t i = 0; i < known.words.size(); ++i)
      EXPECT_EQ(word(all, index + i, parts), known.words[i]) << "word " << index + i;
    EXPECT_EQ(drawn.image(), skipped.image());
  }
}

// All `count` answers of an engine.
inline void expect_answers(const std::string& engine, std::int64_t code, std::size_t parts,
                           std::size_t count) {
  const auto all = answers(engine);
  ASSERT_EQ(all.size(), count);
  for (const answer& known : all)
    expect_answer(code, parts, known);
}

}  // namespace multiplicative
