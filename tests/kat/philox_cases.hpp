// SPDX-License-Identifier: Apache-2.0
// The published answers of philox4x32x10 as cases: an engine with this key and counter, moved by
// this many words, gives these words.
#pragma once

#include <array>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

#include "kat_file.hpp"

namespace tarn::kat {

struct philox_case {
  std::size_t line;
  std::array<std::uint32_t, 2> key;
  std::array<std::uint32_t, 4> ctr;
  std::array<std::uint64_t, 2> skip;  // words, as 64-bit digits, low one first
  std::vector<std::uint32_t> words;
};

/// Every case of philox4x32x10.txt in `folder`: blocks, streams at positions, carries, far blocks.
inline std::vector<philox_case> philox_cases(const std::string& folder) {
  const auto key_of = [](const line& from, std::size_t at) {
    const auto k = words(from, at, at + 2, 16);
    return std::array<std::uint32_t, 2>{k[0], k[1]};
  };
  const auto ctr_of = [](const line& from, std::size_t at) {
    const auto c = words(from, at, at + 4, 16);
    return std::array<std::uint32_t, 4>{c[0], c[1], c[2], c[3]};
  };
  std::vector<philox_case> cases;
  philox_case current{};  // key and counter of the stream that "at" lines speak of
  for (const line& next : read_file(folder, "philox4x32x10")) {
    const std::string& kind = next.fields.at(0);
    if (kind == "block") {
      cases.push_back({next.number, key_of(next, 5), ctr_of(next, 1), {}, answers(next, 7, 16)});
    } else if (kind == "stream" || kind == "carry") {
      current.key = key_of(next, 2);
      current.ctr = ctr_of(next, 5);
    } else if (kind == "at" && next.fields.at(1) == "block") {
      // "at block 2^e :": that block of the sequence whose counter begins at 0; four words a block.
      const int bit = std::stoi(next.fields.at(2).substr(2)) + 2;
      cases.push_back({next.number,
                       current.key,
                       {},
                       {0, std::uint64_t{1} << (bit - 64)},
                       answers(next, 4, 16)});
    } else if (kind == "at") {
      const std::uint64_t at = next.fields.at(1) == "start+0" ? 0 : std::stoull(next.fields.at(1));
      cases.push_back({next.number, current.key, current.ctr, {at, 0}, answers(next, 3, 16)});
    } else {
      throw std::runtime_error("line " + std::to_string(next.number) + ": unknown kind " + kind);
    }
  }
  return cases;
}

}  // namespace tarn::kat
