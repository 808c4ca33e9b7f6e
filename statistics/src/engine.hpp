// SPDX-License-Identifier: Apache-2.0
// An engine of the statistics library is one small table of functions over its state, a plain
// record of fixed layout: whoever adds an engine writes this table and nothing else. Engines know
// no distributions; the two meet in blocks of raw words (blocks.hpp).
#pragma once

#include <cstddef>
#include <cstdint>
#include <exception>

#include "statistics/common/engine_code.hpp"

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

  // 32-bit parts of one word: 1, or 2 with the low part first.
  std::uint32_t word_parts;

  // Bytes of the state of a stream with these seed words, or bad_seed.
  std::size_t (*state_size)(span<std::uint32_t> seed);

  // Writes a first state of state_size(seed) bytes. Missing words have the engine's default,
  // further ones are ignored. 0 or a negative status.
  int (*seed)(void* state, std::uint32_t member, span<std::uint32_t> seed);

  // Whether `size` bytes at `state` are a state of that member that every other function here can
  // run on. Asked at every call on a stream, so it looks at a few fields, not at tables.
  bool (*accepts)(const void* state, std::size_t size, std::uint32_t member);

  // Words that are left of a finite sequence. Null if the sequence has no end.
  std::uint64_t (*remaining)(const void* state);

  // Moves forward by the number of words whose 64-bit digits are given, least significant first;
  // never past the end of a finite sequence. Null if the engine cannot.
  void (*skip)(void* state, span<std::uint64_t> digits);

  // Keeps every stride-th word from word idx on (0 <= idx < stride). Null if the engine cannot.
  void (*leapfrog)(void* state, std::uint32_t idx, std::uint32_t stride);

  // Writes the next n words of the serial stream, word_parts numbers each, and moves the state
  // behind them. n is at most the words that remain. Throws source_failed only.
  void (*fill)(void* state, std::uint32_t* out, std::size_t n);

  // Whether a skip is so cheap that threads may share out one call. Needs a state of at most
  // max_parallel_state bytes without pointers.
  bool parallel;

  // How words become real numbers.
  const word_rule* rule;
};

// state_size of seed words that no stream can be made of.
inline constexpr std::size_t bad_seed = ~std::size_t{0};

// An engine that takes its words from outside found its source dry.
struct source_failed : std::exception {};
// More words were wanted than a finite sequence has left.
struct sequence_ended : std::exception {};

inline constexpr std::size_t max_parallel_state = 256;

// A row of the list of engines.
struct engine_row {
  std::uint32_t code;
  std::uint32_t word_bits;  // significant bits of a word
  bool skip_list;           // skips by counts of several digits
  bool uniform_bits;        // the words hold 32 equidistributed bits
  const engine_ops* ops;
};

// The row that a stream code belongs to, or null. The low 20 bits number the members of a set.
const engine_row* find_engine(std::uint32_t code);

}  // namespace tarn::statistics
