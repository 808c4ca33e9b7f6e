// SPDX-License-Identifier: Apache-2.0
// Reader of the known-answer files beside this header. A file begins with '#' lines that tell its
// origin; the others are blank-separated. What is missing, empty or all zero throws: a file that
// proves nothing must not pass.
#pragma once

#include <cstdint>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

namespace tarn::kat {

struct line {
  std::size_t number;  // from 1
  std::vector<std::string> fields;
};

// The data lines of `folder`/`engine`.txt.
inline std::vector<line> read_file(const std::string& folder, const std::string& engine) {
  std::ifstream file(folder + "/" + engine + ".txt");
  if (!file)
    throw std::runtime_error("no known answers for the engine " + engine);
  std::vector<line> lines;
  bool origin = false;
  std::string text;
  for (std::size_t number = 1; std::getline(file, text); ++number) {
    if (text.rfind('#', 0) == 0) {
      origin = origin || text.find("Origin") != std::string::npos;
      continue;
    }
    std::istringstream in(text);
    line next{number, {}};
    for (std::string field; in >> field;)
      next.fields.push_back(field);
    if (!next.fields.empty())
      lines.push_back(next);
  }
  if (!origin)
    throw std::runtime_error(engine + ".txt does not tell its origin");
  if (lines.empty())
    throw std::runtime_error(engine + ".txt holds no answers");
  return lines;
}

// Fields [first, last) as numbers of the given base, each below 2^32.
inline std::vector<std::uint32_t> words(const line& from, std::size_t first, std::size_t last,
                                        int base) {
  std::vector<std::uint32_t> result;
  for (std::size_t i = first; i < last; ++i) {
    std::size_t used = 0;
    const unsigned long long value = std::stoull(from.fields.at(i), &used, base);
    if (used != from.fields[i].size() || value > 0xFFFFFFFF)
      throw std::runtime_error("line " + std::to_string(from.number) + ": bad word " +
                               from.fields[i]);
    result.push_back(static_cast<std::uint32_t>(value));
  }
  return result;
}

// The same for answers: at least one, and not all of them zero.
inline std::vector<std::uint32_t> answers(const line& from, std::size_t first, int base) {
  const std::vector<std::uint32_t> result = words(from, first, from.fields.size(), base);
  std::uint32_t any = 0;
  for (const std::uint32_t word : result)
    any |= word;
  if (any == 0)
    throw std::runtime_error("line " + std::to_string(from.number) + ": no answers, or all zero");
  return result;
}

}  // namespace tarn::kat
