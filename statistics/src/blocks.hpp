// SPDX-License-Identifier: Apache-2.0
// Where engines and distributions meet: blocks of about 4 KiB of words that stay in the nearest
// cache, and the sharing of a large call among threads.
//
// A distribution is a functor `producer(source, n, out, streaming)` that writes the next n values
// of its source serially and leaves the source exactly behind the words it used.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "distributions/real_words.hpp"
#include "engine.hpp"
#include "parallel.hpp"
#include "tarn_serv.h"

namespace tarn::statistics {

// A position in the serial stream of words of an engine.
struct word_source {
  const engine_ops* engine;
  void* state;
  std::size_t state_bytes;

  void fill(std::uint32_t* out, std::size_t n) const {
    if (engine->remaining != nullptr && n > engine->remaining(state))
      throw sequence_ended();
    engine->fill(state, out, n);
  }
};

// A multiple of 192 words: six vectors of 512 bits at a time, which the fastest engines make in one
// step, of four words a counter.
inline constexpr std::size_t block_words = 960;

// Results of a call above this size (bytes) are stored around the caches: they would not stay
// there, and a plain store first reads the line that it overwrites.
inline constexpr std::size_t streaming_bytes = std::size_t{16} << 20;
// Calls that use fewer words run on the calling thread: waking others costs microseconds.
inline constexpr std::size_t parallel_words = std::size_t{1} << 17;
// Words of a piece that one thread takes at a time; a multiple of block_words.
inline constexpr std::size_t piece_words = 64 * block_words;

// For one value from one word: hands blocks of words to turn(words, count, out).
template <class Value, class Turn>
void turn_blocks(const word_source& source, std::size_t n, Value* out, bool streaming,
                 const Turn& turn) {
  constexpr std::size_t line = 64;  // bytes
  alignas(line) std::uint32_t words[block_words];
  // Streaming stores want whole lines: a first short block leads up to the next line.
  const std::size_t lead = (line - reinterpret_cast<std::uintptr_t>(out) % line) % line;
  const std::size_t block = block_words / source.engine->word_parts;
  std::size_t next = streaming && lead >= sizeof(Value) ? lead / sizeof(Value) : block;
  while (n != 0) {
    const std::size_t count = std::min(n, next);
    source.fill(words, count);
    turn(words, count, out);
    out += count;
    n -= count;
    next = block;
  }
  if (streaming)
    flush_streaming();
}

// Writes n values of `words_per_value` words each by the producer, on several threads where that
// pays. The values do not depend on how the work is shared out.
template <class Value, class Producer>
void draw(const word_source& source, std::size_t n, std::size_t words_per_value, Value* out,
          const Producer& producer) {
  const bool streaming = n > streaming_bytes / sizeof(Value);
  const std::size_t words = n * words_per_value;
  // The user may have asked for all threads wherever there is more than one piece.
  const std::size_t enough = tarn_serv_get_dynamic() != 0 ? parallel_words : piece_words + 1;
  const int threads = source.engine->parallel && words >= enough ? tarn_serv_get_max_threads() : 1;
  if (threads == 1) {
    producer(source, n, out, streaming);
    return;
  }
  for_pieces(n, std::max<std::size_t>(1, piece_words / words_per_value), threads,
             [&](std::size_t first, std::size_t count) {
               alignas(16) unsigned char state[max_parallel_state];
               std::memcpy(state, source.state, source.state_bytes);
               const std::uint64_t distance = first * words_per_value;
               source.engine->skip(state, {&distance, 1});
               producer(word_source{source.engine, state, source.state_bytes}, count, out + first,
                        streaming);
             });
  const std::uint64_t distance = words;
  source.engine->skip(source.state, {&distance, 1});
}

}  // namespace tarn::statistics
