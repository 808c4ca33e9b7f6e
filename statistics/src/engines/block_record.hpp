// SPDX-License-Identifier: Apache-2.0
// Engines whose state is a whole block of a linear recurrence of order Words: the record, its
// checks and the walk over blocks. The recurrence itself comes as extend(words, count), which
// continues a sequence: words[Words + i] for i < count, rounded up to whole steps of block_step.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

namespace tarn::statistics {

// The present block, and where its unread words begin: those before `position` have been
// delivered, and position == Words says that none has. The next block is made as soon as the last
// word is delivered, so that a record of ours has 1 <= position <= Words and equal places in the
// stream have equal records. Position 0 is read as Words.
template <std::size_t Words>
struct block_record {
  std::uint32_t words[Words];
  std::uint32_t position;
};

// Words that one step of a recurrence writes: the lanes of the widest vector.
inline constexpr std::size_t block_step = 16;

constexpr std::size_t whole_steps(std::size_t count) {
  return (count + block_step - 1) / block_step * block_step;
}

// Whether a block_record<Words> at any address is one: its place exists, and the state is not zero,
// which would stay zero. Only the bits `upper` of word 0 belong to the state.
template <std::size_t Words>
bool is_block_record(const void* record, std::uint32_t upper) {
  const auto word = [record](std::size_t i) {
    std::uint32_t w;
    std::memcpy(&w, static_cast<const char*>(record) + i * sizeof w, sizeof w);
    return w;
  };
  if (word(Words) > Words)
    return false;
  bool any = (word(0) & upper) != 0;
  for (std::size_t i = 1; !any && i < Words; ++i)
    any = word(i) != 0;
  return any;
}

// The record at the first block that follows the start words.
template <std::size_t Words, class Extend>
void begin_blocks(const std::uint32_t (&start)[Words], block_record<Words>& record,
                  const Extend& extend) {
  alignas(64) std::uint32_t words[Words + whole_steps(Words)];
  std::copy_n(start, Words, words);
  extend(words, Words);
  std::copy_n(words + Words, Words, record.words);
  record.position = Words;
}

// Hands the next n words to deliver(words, count), run by run. A run is up to Run blocks, one
// behind the other: vectors never meet the end of a block in it, and bringing its last block to
// the front costs little.
template <std::size_t Run, std::size_t Words, class Extend, class Deliver>
void walk_blocks(block_record<Words>& record, std::size_t n, const Extend& extend,
                 const Deliver& deliver) {
  if (n == 0)
    return;
  const std::size_t read = record.position % Words;
  const std::size_t head = std::min(n, Words - read);
  deliver(record.words + read, head);
  record.position = static_cast<std::uint32_t>(read + head);
  if (record.position != Words)
    return;
  n -= head;
  if (n % Words != 0)
    record.position = static_cast<std::uint32_t>(n % Words);

  alignas(64) std::uint32_t words[Words + whole_steps(Run * Words)];
  std::copy_n(record.words, Words, words);
  for (bool more = true; more;) {
    // One block beyond the whole ones: the words left over lie in it, even if there are none.
    const std::size_t made = std::min(n / Words + 1, Run) * Words;
    extend(words, made);
    const std::size_t count = std::min(n, made);
    deliver(words + Words, count);
    std::copy_n(words + made, Words, words);
    n -= count;
    more = count == made;
  }
  std::copy_n(words, Words, record.words);
}

}  // namespace tarn::statistics
