// SPDX-License-Identifier: Apache-2.0
// An engine of the statistics library is one small table of functions over its state, a plain
// record of fixed layout: whoever adds an engine writes this table and nothing else. Engines know
// no distributions; the two meet in blocks of raw words (blocks.hpp).
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics {

struct word_rule;

// A read-only run of numbers that belongs to the caller.
template <class Number>
struct span {
  const Number* data;
  std::size_t size;
};

struct engine_ops {
  // How many engines share the name (sets of generators); member i has the code row code + i.
  std::uint32_t members;

  // Bytes of the state of a stream with these seed words.
  std::size_t (*state_size)(span<std::uint32_t> seed);

  // Writes a first state. Missing words have the engine's default, further ones are ignored.
  void (*seed)(void* state, std::uint32_t member, span<std::uint32_t> seed);

  // Whether `size` bytes at `state` are a state that every other function here can run on.
  bool (*accepts)(const void* state, std::size_t size);

  // Moves forward by the number of words whose 64-bit digits are given, least significant first.
  // Null if the engine cannot.
  void (*skip)(void* state, span<std::uint64_t> digits);

  // Keeps every stride-th word from word idx on (0 <= idx < stride). Null if the engine cannot.
  void (*leapfrog)(void* state, std::uint32_t idx, std::uint32_t stride);

  // Writes the next n words of the serial stream and moves the state behind them.
  void (*fill)(void* state, std::uint32_t* out, std::size_t n);

  // Whether a skip is so cheap that threads may share out one call. Needs a state of at most
  // max_parallel_state bytes without pointers.
  bool parallel;

  // How words become real numbers.
  const word_rule* rule;
};

inline constexpr std::size_t max_parallel_state = 256;

// A row of the list of engines.
struct engine_row {
  std::uint32_t code;
  bool uniform_bits;  // the words hold 32 equidistributed bits
  const engine_ops* ops;
};

// The row that a stream code belongs to, or null. The low 20 bits number the members of a set.
const engine_row* find_engine(std::uint32_t code);

inline constexpr std::uint32_t member_mask = 0xFFFFF;

}  // namespace tarn::statistics
