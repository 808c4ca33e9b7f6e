// SPDX-License-Identifier: Apache-2.0
// The tests that dieharder lacks and some of the engines are known to fail. Reads 32-bit words from
// standard input and prints the test's name and p-value.
#include <cstdio>
#include <string>
#include <vector>

#include "birthday_spacings.hpp"
#include "linear_complexity.hpp"

namespace {

using namespace tarn::quality;

// More than twice the complexity that the upper bits of the largest twister can have: 19968 bits of
// state, in four words of 32 bits at a time.
constexpr std::size_t bits = 200'000;
// A mean of 8.
constexpr std::size_t points = std::size_t{1} << 23;

std::vector<std::uint32_t> words(std::size_t count) {
  std::vector<std::uint32_t> read(count);
  read.resize(std::fread(read.data(), sizeof read[0], count, stdin));
  return read;
}

// The upper bit of each word.
double complexity_chance(const std::vector<std::uint32_t>& from) {
  std::vector<std::uint8_t> upper;
  for (const std::uint32_t word : from)
    upper.push_back(static_cast<std::uint8_t>(word >> 31));
  return linear_complexity_chance(upper.size(), linear_complexity(upper));
}

// Two words make the day of a point, the first one the upper half.
double spacings_chance(const std::vector<std::uint32_t>& from) {
  std::vector<std::uint64_t> days;
  for (std::size_t i = 0; i + 1 < from.size(); i += 2)
    days.push_back(std::uint64_t{from[i]} << 32 | from[i + 1]);
  const std::size_t count = days.size();
  return poisson_chance(equal_spacings(std::move(days)), expected_equal_spacings(count));
}

}  // namespace

int main(int argc, char** argv) {
  const std::string name = argc == 2 ? argv[1] : "";
  const bool complexity = name == "linear_complexity";
  if (!complexity && name != "birthday_spacings") {
    std::fputs("usage: quality_tests linear_complexity|birthday_spacings < WORDS\n", stderr);
    return 2;
  }
  const std::size_t wanted = complexity ? bits : 2 * points;
  const auto read = words(wanted);
  if (read.size() != wanted) {
    std::fprintf(stderr, "quality_tests: %zu words, not %zu\n", read.size(), wanted);
    return 1;
  }
  std::printf("%s %.8e\n", name.c_str(),
              complexity ? complexity_chance(read) : spacings_chance(read));
}
