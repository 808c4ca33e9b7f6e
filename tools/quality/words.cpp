// SPDX-License-Identifier: Apache-2.0
// Writes words of an engine to standard output, as raw 32-bit numbers in the processor's order.
#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdio>
#include <exception>
#include <limits>
#include <optional>

#include "word_source.hpp"

namespace {

using namespace tarn::quality;

int usage() {
  std::fputs(
      "usage: quality_words ENGINE LAYOUT SEED [COUNT]\n"
      "       quality_words --list\n"
      "SEED is below 2^32; without COUNT words are written until nobody reads them; --list prints\n"
      "the engines with their layouts and the run that they belong to: both, full, or same\n",
      stderr);
  return 2;
}

template <class Number>
std::optional<Number> number(const std::string& text) {
  Number value = 0;
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  if (error != std::errc{} || stop != end)
    return std::nullopt;
  return value;
}

int write(const row& wanted, std::uint32_t seed, std::uint64_t count) {
  word_source source(wanted, seed);
  while (count != 0) {
    const std::vector<std::uint32_t>& words = source.next();
    const std::size_t part = std::min<std::uint64_t>(count, words.size());
    if (std::fwrite(words.data(), sizeof words[0], part, stdout) != part)
      return errno == EPIPE ? 0 : 1;
    count -= part;
  }
  return std::fflush(stdout) == 0 ? 0 : 1;
}

int run(const std::vector<std::string>& args) {
  if (args == std::vector<std::string>{"--list"}) {
    for (const row& each : rows())
      std::printf("%s %s %s\n", each.engine.c_str(), each.name.c_str(), each.run.c_str());
    return 0;
  }
  if (args.size() != 3 && args.size() != 4)
    return usage();
  const auto wanted = std::find_if(rows().begin(), rows().end(), [&](const row& each) {
    return each.engine == args[0] && each.name == args[1];
  });
  const auto seed = number<std::uint32_t>(args[2]);
  const auto count =
      args.size() == 4 ? number<std::uint64_t>(args[3]) : std::numeric_limits<std::uint64_t>::max();
  if (wanted == rows().end() || !seed || !count)
    return usage();
  return write(*wanted, *seed, *count);
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return run(std::vector<std::string>(argv + 1, argv + argc));
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "quality_words: %s\n", failure.what());
    return 1;
  }
}
