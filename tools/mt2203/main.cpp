// SPDX-License-Identifier: Apache-2.0
// The command line of mt2203_table.
#include <algorithm>
#include <charconv>
#include <cstdio>
#include <exception>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "generate.hpp"
#include "gf2_multiply.hpp"
#include "member.hpp"
#include "table_file.hpp"
#include "verify.hpp"

namespace {

using namespace tarn::mt2203;
using arguments = std::vector<std::string>;

constexpr int usage_error = 2;

int usage() {
  std::fputs(
      "usage: mt2203_table [--portable] --generate LO HI\n"
      "       mt2203_table [--portable] --generate-file FILE [--threads N]\n"
      "       mt2203_table [--portable] --verify FILE [LO HI] [--second-method]\n"
      "ids LO to HI are at most 6023; --portable: without the processor's carry-less multiply\n",
      stderr);
  return usage_error;
}

// Removes the word from the arguments; whether it was there.
bool take(arguments& from, const char* word) {
  const auto at = std::find(from.begin(), from.end(), word);
  if (at == from.end())
    return false;
  from.erase(at);
  return true;
}

std::optional<std::uint32_t> number(const std::string& text, std::uint32_t least,
                                    std::uint32_t most) {
  std::uint32_t value = 0;
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  if (error != std::errc{} || stop != end || value < least || value > most)
    return std::nullopt;
  return value;
}

struct range {
  std::uint32_t first, last;
};

std::optional<range> ids(const std::string& low, const std::string& high) {
  const auto first = number(low, 0, members - 1);
  const auto last = first ? number(high, *first, members - 1) : std::nullopt;
  if (!last)
    return std::nullopt;
  return range{*first, *last};
}

int generate(const arguments& args) {
  const auto wanted = args.size() == 3 ? ids(args[1], args[2]) : std::nullopt;
  if (!wanted)
    return usage();
  const member_finder finder;
  for (std::uint32_t id = wanted->first; id <= wanted->last; ++id)
    std::fputs(row_text(finder.find(id)).c_str(), stdout);
  return 0;
}

int generate_file(const arguments& args) {
  const bool counted = args.size() == 4 && args[2] == "--threads";
  if (args.size() != 2 && !counted)
    return usage();
  const auto threads = counted ? number(args[3], 1, 1024) : std::thread::hardware_concurrency();
  if (!threads)
    return usage();
  generate_table(args[1], *threads);
  return 0;
}

int verify(arguments args) {
  const bool second_method = take(args, "--second-method");
  const auto wanted = args.size() == 2   ? range{0, members - 1}
                      : args.size() == 4 ? ids(args[2], args[3])
                                         : std::nullopt;
  if (!wanted)
    return usage();
  return verify_table(args[1], wanted->first, wanted->last, second_method) ? 0 : 1;
}

int run(arguments args) {
  if (take(args, "--portable"))
    gf2::force_portable_multiplier();
  const std::string command = args.empty() ? "" : args[0];
  if (command == "--generate")
    return generate(args);
  if (command == "--generate-file")
    return generate_file(args);
  if (command == "--verify")
    return verify(args);
  return usage();
}

}  // namespace

int main(int argc, char** argv) {
  try {
    return run(arguments(argv + 1, argv + argc));
  } catch (const std::exception& failure) {
    std::fprintf(stderr, "mt2203_table: %s\n", failure.what());
    return 1;
  }
}
