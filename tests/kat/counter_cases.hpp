// SPDX-License-Identifier: Apache-2.0
// The published answers of a counter-based engine as cases: an engine with this key and counter,
// moved by this many words, gives these words.
#pragma once

#include <algorithm>
#include <array>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

#include "kat_file.hpp"

namespace tarn::kat {

template <std::size_t KeyWords>
struct counter_case {
  std::size_t line;
  std::array<std::uint32_t, KeyWords> key;
  std::array<std::uint32_t, 4> ctr;
  std::array<std::uint64_t, 2> skip;  // words, as 64-bit digits, low one first
  std::vector<std::uint32_t> words;
};

/// Every case of `engine`.txt in `folder`: blocks, streams at positions, carries, far blocks.
template <std::size_t KeyWords>
std::vector<counter_case<KeyWords>> counter_cases(const std::string& folder,
                                                  const std::string& engine) {
  const auto take = [](const line& from, std::size_t at, auto& to) {
    const auto taken = words(from, at, at + to.size(), 16);
    std::copy(taken.begin(), taken.end(), to.begin());
  };
  std::vector<counter_case<KeyWords>> cases;
  counter_case<KeyWords> current{};  // key and counter of the stream that "at" lines speak of
  for (const line& next : read_file(folder, engine)) {
    const std::string& kind = next.fields.at(0);
    counter_case<KeyWords> one = current;
    one.line = next.number;
    if (kind == "block") {
      take(next, 1, one.ctr);
      take(next, 5, one.key);
      one.words = answers(next, 5 + KeyWords, 16);
      cases.push_back(one);
    } else if (kind == "stream" || kind == "carry") {
      take(next, 2, current.key);
      take(next, 3 + KeyWords, current.ctr);
    } else if (kind == "at" && next.fields.at(1) == "block") {
      // "at block 2^e :": that block of the sequence whose counter begins at 0; four words a block.
      const int bit = std::stoi(next.fields.at(2).substr(2)) + 2;
      one.ctr = {};
      one.skip = {0, std::uint64_t{1} << (bit - 64)};
      one.words = answers(next, 4, 16);
      cases.push_back(one);
    } else if (kind == "at") {
      one.skip = {next.fields.at(1) == "start+0" ? 0 : std::stoull(next.fields.at(1)), 0};
      one.words = answers(next, 3, 16);
      cases.push_back(one);
    } else {
      throw std::runtime_error("line " + std::to_string(next.number) + ": unknown kind " + kind);
    }
  }
  return cases;
}

}  // namespace tarn::kat
