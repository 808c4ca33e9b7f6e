// SPDX-License-Identifier: Apache-2.0
// Sources of the engine nondeterministic, and the choice of one of them.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "engine.hpp"

namespace tarn::statistics::nondeterministic {

struct entropy_source {
  // Whether the source can be asked at all, without waiting.
  bool (*present)();
  // Writes n words; false if the source failed, and then some of them may be written.
  bool (*draw)(std::uint32_t* out, std::size_t n);
};

// Words of the trial that a source has to pass before it is used.
inline constexpr std::size_t trial_words = 16;

// A source is there if it says so and proves it: it draws words, and not one word all the
// time (which 16 random words do with probability 2^-480).
inline bool proves_itself(const entropy_source& source) {
  std::uint32_t words[trial_words] = {};
  if (!source.present() || !source.draw(words, trial_words))
    return false;
  return std::any_of(words, words + trial_words,
                     [&](std::uint32_t word) { return word != words[0]; });
}

// The first source that proves itself, or null.
inline const entropy_source* choose(span<entropy_source> sources) {
  const entropy_source* end = sources.data + sources.size;
  const entropy_source* found = std::find_if(sources.data, end, proves_itself);
  return found == end ? nullptr : found;
}

// Draws n words from an instruction for 64-bit numbers that may find its buffer empty: next(number)
// says whether it gave one. Ten tries are what the guides to RDRAND ask for: within them a working
// unit refills its buffer. There are also processors whose instruction, once broken, reports
// success and gives one number for ever: equal neighbours mean failure, though a working unit gives
// them with probability 2^-64 a pair.
template <class Next>
bool draw_numbers(const Next& next, std::uint32_t* out, std::size_t n) {
  constexpr int tries = 10;
  const auto get = [&next](std::uint64_t& number) {
    int left = tries;
    while (left != 0 && !next(number))
      --left;
    return left != 0;
  };
  std::uint64_t before, number;
  if (!get(before))
    return false;
  while (n != 0) {
    if (!get(number) || number == before)
      return false;
    const std::size_t count = std::min<std::size_t>(n, 2);
    std::memcpy(out, &number, count * sizeof *out);
    out += count;
    n -= count;
    before = number;
  }
  return true;
}

// The sources of this machine in the order of preference.
span<entropy_source> sources_of_machine();

// The source that all streams of the process draw from, or null. Chosen at first use.
const entropy_source* chosen_source();

}  // namespace tarn::statistics::nondeterministic
