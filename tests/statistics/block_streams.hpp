// SPDX-License-Identifier: Apache-2.0
// Streams whose record is a block of words and a position, held against the plain model of their
// rule: the words drawn, and after every call the whole record.
#pragma once

#include <cstdint>
#include <vector>

#include <gtest/gtest.h>

#include "../models/block_model.hpp"
#include "any_stream.hpp"
#include "support.hpp"
#include "tarn_rvx.h"

namespace support {

template <class Rule>
class block_stream {
 public:
  static constexpr std::uint32_t order = Rule::order;
  using block = std::vector<std::uint32_t>;

  // Of the code, set to this block and position.
  block_stream(std::int64_t code, const block& words, std::uint32_t position,
               const Rule& rule = Rule{})
      : stream_(code, {1}), sequence_(words, rule), place_(position % order) {
    for (std::size_t i = 0; i < order; ++i)
      stream_.set(16 + 4 * i, words[i]);
    stream_.set(position_at, position);
  }

  // Draws n words between guards.
  void draw(std::size_t n) {
    results<std::uint32_t> r(n);
    ASSERT_EQ(rvxiRngUniformBits(0, stream_, static_cast<std::int64_t>(n), r.data()), 0);
    for (std::size_t i = 0; i < n; ++i)
      ASSERT_EQ(r[i], sequence_.output(place_ + i)) << "word " << i << " of " << n;
    ASSERT_TRUE(r.guards_intact());
    moved(n);
  }

  void skip(std::size_t n) {
    stream_.skip(n);
    moved(n);
  }

  // The position is 1..order: the whole of the next block is unread if it is order.
  void expect_record() {
    const std::size_t begin = place_ / order * order;
    ASSERT_EQ(stream_.template at<std::uint32_t>(position_at),
              place_ == begin ? order : place_ - begin)
        << "at word " << place_;
    for (std::size_t i = 0; i < order; ++i) {
      ASSERT_EQ(stream_.template at<std::uint32_t>(16 + 4 * i), sequence_.word(begin + i))
          << "word " << i << " of the block at " << begin;
    }
  }

  any_stream& stream() { return stream_; }

  static constexpr std::size_t position_at = 16 + 4 * order;

 private:
  void moved(std::size_t n) {
    place_ += n;
    if (n != 0) {
      ASSERT_NO_FATAL_FAILURE(expect_record());
    }
  }

  any_stream stream_;
  tarn_test::sequence<Rule> sequence_;
  std::size_t place_;  // of the next word, from the first word of the first block on
};

inline std::vector<std::uint32_t> random_block(test_data& data, std::size_t order) {
  std::vector<std::uint32_t> words(order);
  for (std::uint32_t& w : words)
    w = static_cast<std::uint32_t>(data());
  return words;
}

// Positions next to both ends of a block, and 0, which is read as the whole block.
inline std::vector<std::uint32_t> positions(std::uint32_t order) {
  return {0, 1, 2, 15, 16, 17, order / 2, order - 17, order - 2, order - 1, order};
}

template <class Rule>
void every_count_from_several_positions(std::int64_t code, const Rule& rule = Rule{}) {
  test_data data(1);
  for (const std::uint32_t position : positions(Rule::order)) {
    const auto words = random_block(data, Rule::order);
    for (std::size_t n = 0; n <= 300; ++n) {
      block_stream<Rule> s(code, words, position, rule);
      ASSERT_NO_FATAL_FAILURE(s.draw(n)) << "position " << position;
    }
  }
}

// Counts at whose end blocks, and runs of up to 16 blocks, begin and end.
template <class Rule>
void counts_next_to_block_edges(std::int64_t code, const Rule& rule = Rule{}) {
  test_data data(2);
  for (const std::uint32_t position : {1u, Rule::order - 1, Rule::order}) {
    const auto words = random_block(data, Rule::order);
    for (const std::size_t blocks : {1, 2, 3, 4, 5, 7, 8, 9, 15, 16, 17, 18, 32, 33, 34, 65}) {
      for (std::size_t n = blocks * Rule::order - 2; n <= blocks * Rule::order + 2; ++n) {
        block_stream<Rule> s(code, words, position, rule);
        ASSERT_NO_FATAL_FAILURE(s.draw(n)) << "position " << position;
      }
    }
  }
}

template <class Rule>
void any_split(std::int64_t code, const Rule& rule = Rule{}) {
  test_data data(3);
  for (std::size_t first = 0; first <= 2 * Rule::order + 1; first += 7) {
    block_stream<Rule> s(code, random_block(data, Rule::order), Rule::order, rule);
    ASSERT_NO_FATAL_FAILURE(s.draw(first));
    ASSERT_NO_FATAL_FAILURE(s.draw(2 * Rule::order + 1 - first));
  }
  block_stream<Rule> s(code, random_block(data, Rule::order), 5, rule);
  for (int call = 0; call < 200; ++call)
    ASSERT_NO_FATAL_FAILURE(s.draw(data.below(call % 4 == 0 ? 12000 : 30)));
  ASSERT_NO_FATAL_FAILURE(s.draw(1'500'000));
}

// Blocks with a single bit set, at both ends and in the middle, and with all bits set.
template <class Rule>
void sparse_and_full_states(std::int64_t code, const Rule& rule = Rule{}) {
  constexpr std::uint32_t order = Rule::order;
  for (const std::uint32_t word : {0u, 1u, 2u, order / 2, order - 1}) {
    for (const std::uint32_t bit : {1u, 0x40000000u, 0x80000000u}) {
      std::vector<std::uint32_t> words(order, 0);
      words[word] = bit;
      if (word == 0)
        words[0] |= 0x80000000u;  // the bit that always belongs to the state
      block_stream<Rule> s(code, words, order, rule);
      ASSERT_NO_FATAL_FAILURE(s.draw(20 * order)) << "word " << word << " is " << bit;
    }
  }
  block_stream<Rule> s(code, std::vector<std::uint32_t>(order, 0xFFFFFFFF), order, rule);
  ASSERT_NO_FATAL_FAILURE(s.draw(20 * order));
}

// Images are equal wherever the same words have been drawn, in whatever calls.
template <class Rule>
void equal_places_have_equal_images(std::int64_t code) {
  constexpr std::size_t order = Rule::order;
  for (const std::size_t n : {order - 1, order, order + 1, 5 * order, 40 * order, 40 * order + 3}) {
    any_stream at_once(code, {7}), in_two(code, {7}), one_by_one(code, {7});
    at_once.words(n);
    in_two.words(n / 3);
    in_two.words(n - n / 3);
    for (std::size_t i = 0; i < n; ++i)
      one_by_one.words(1);
    ASSERT_EQ(in_two.image(), at_once.image()) << n << " words";
    ASSERT_EQ(one_by_one.image(), at_once.image()) << n << " words";
    const any_stream copy(at_once);
    ASSERT_EQ(copy.image(), at_once.image());
  }
}

// The stream as it is, or with one field changed, refuses to be used and writes nothing.
inline void expect_refused(any_stream& s) {
  results<std::uint32_t> r(3);
  EXPECT_EQ(rvxiRngUniformBits(0, s, 3, r.data()), RVX_STATUS_BAD_MARK);
  EXPECT_TRUE(r.untouched());
  EXPECT_EQ(rvxGetStreamSize(s), RVX_STATUS_BAD_MARK);
}

// Positions behind the block, states of zeros, and lengths of other records. `upper` are the bits
// of word 0 that belong to the state.
template <class Rule>
void impossible_fields_are_refused(std::int64_t code, std::uint32_t upper) {
  constexpr std::size_t order = Rule::order, position_at = block_stream<Rule>::position_at;
  any_stream s(code, {3});
  const auto size = static_cast<std::uint32_t>(rvxGetStreamSize(s));
  for (const std::uint32_t position : {Rule::order + 1, 0x80000000u, 0xFFFFFFFFu}) {
    s.set(position_at, position);
    expect_refused(s);
  }
  s.set(position_at, Rule::order);
  for (const std::uint32_t length : {0u, 16u, size - 4, size - 1, size + 1, 0xFFFFFFFFu}) {
    s.set(8, length);
    expect_refused(s);
  }
  s.set(8, size);
  EXPECT_EQ(rvxGetStreamSize(s), static_cast<int>(size));

  for (std::size_t i = 0; i < order; ++i)
    s.set(16 + 4 * i, 0u);
  expect_refused(s);
  s.set(16, ~upper);
  expect_refused(s);
  s.set(16, upper & (0 - upper));
  EXPECT_EQ(rvxGetStreamSize(s), static_cast<int>(size));
  s.set(16, 0u);
  s.set(16 + 4 * (order - 1), 1u);
  EXPECT_EQ(rvxGetStreamSize(s), static_cast<int>(size));
}

}  // namespace support
