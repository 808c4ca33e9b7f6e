// SPDX-License-Identifier: Apache-2.0
// r250 against the plain model, word by word and record by record, under each SIMD target; and that
// the bits of its words are linearly independent sequences whatever the seed.
#include "../block_streams.hpp"

namespace {

using rule = tarn_test::r250_rule;
using support::any_stream;

constexpr std::int64_t code = RVX_BRNG_R250;
constexpr std::uint32_t order = 250;

using r250_words = support::on_simd_target;

TEST_F(r250_words, every_count_from_several_positions) {
  support::every_count_from_several_positions<rule>(code);
}

TEST_F(r250_words, counts_next_to_block_edges) {
  support::counts_next_to_block_edges<rule>(code);
}

TEST_F(r250_words, any_split) {
  support::any_split<rule>(code);
}

TEST_F(r250_words, sparse_and_full_states) {
  support::sparse_and_full_states<rule>(code);
}

TEST_F(r250_words, equal_places_have_equal_images) {
  support::equal_places_have_equal_images<rule>(code);
}

TEST_F(r250_words, impossible_fields_are_refused) {
  support::impossible_fields_are_refused<rule>(code, 0xFFFFFFFF);
  any_stream(code, {1}).words(1);
}

void expect_start(const std::vector<std::uint32_t>& seed, const std::vector<std::uint32_t>& start) {
  any_stream s(code, seed);
  tarn_test::sequence<rule> x(start);
  const auto drawn = s.words(1000);
  for (std::size_t i = 0; i < drawn.size(); ++i)
    ASSERT_EQ(drawn[i], x.output(order + i)) << "word " << i << " of " << seed.size() << " words";
}

// Bits 31, 30, ... 0 each have a word of the 32 words 3, 10, 17, ... as their leading bit.
std::vector<std::uint32_t> with_leading_bits(std::vector<std::uint32_t> start) {
  std::size_t word = 3;
  for (unsigned bit = 32; bit-- > 0; word += 7) {
    const std::uint64_t power = std::uint64_t{1} << bit;
    start[word] = static_cast<std::uint32_t>(start[word] % power + power);
  }
  return start;
}

TEST_F(r250_words, fewer_seed_words_are_spread) {
  ASSERT_NO_FATAL_FAILURE(
      expect_start({}, with_leading_bits(tarn_test::words_from_seed(order, 1))));
  for (const std::uint32_t seed : {0u, 1u, 0xFFFFFFFFu})
    ASSERT_NO_FATAL_FAILURE(
        expect_start({seed}, with_leading_bits(tarn_test::words_from_seed(order, seed))));
  support::test_data data(4);
  for (const std::size_t n : {2, 3, 200, 249}) {
    const auto key = support::random_block(data, n);
    ASSERT_NO_FATAL_FAILURE(
        expect_start(key, with_leading_bits(tarn_test::words_from_key(order, key))));
  }
}

TEST_F(r250_words, a_whole_state_is_taken_as_given) {
  support::test_data data(5);
  auto words = support::random_block(data, order);
  ASSERT_NO_FATAL_FAILURE(expect_start(words, words));
  const auto image = any_stream(code, words).image();
  words.push_back(17);
  EXPECT_EQ(any_stream(code, words).image(), image) << "further words are ignored";

  std::vector<std::uint32_t> sparse(order, 0);
  sparse[249] = 4;
  ASSERT_NO_FATAL_FAILURE(expect_start(sparse, sparse));
}

TEST_F(r250_words, a_state_of_zeros_is_refused) {
  for (const std::size_t n : {250, 251, 600}) {
    std::vector<std::uint32_t> zeros(n, 0);
    if (n > order)
      zeros[order] = 1;  // no part of the state
    rvx_stream s = nullptr;
    EXPECT_EQ(rvxNewStreamEx(&s, code, static_cast<std::int64_t>(n), zeros.data()),
              RVX_STATUS_BAD_CODE);
    EXPECT_EQ(s, nullptr);
  }
  any_stream(code, std::vector<std::uint32_t>(249, 0)).words(1);
}

// Linearly independent words of a block, by Gaussian elimination. Blocks of one stream are
// functions of each other bit by bit, so a later block has the rank of the start words.
int rank(std::vector<std::uint32_t> rows) {
  int found = 0;
  for (unsigned bit = 0; bit < 32; ++bit) {
    const auto has_bit = [bit](std::uint32_t row) { return (row >> bit & 1) != 0; };
    const auto pivot = std::find_if(rows.begin(), rows.end(), has_bit);
    if (pivot == rows.end())
      continue;
    const std::uint32_t pivot_row = *pivot;
    rows.erase(pivot);
    for (std::uint32_t& row : rows) {
      if (has_bit(row))
        row ^= pivot_row;
    }
    ++found;
  }
  return found;
}

int rank_of_stream(const std::vector<std::uint32_t>& seed) {
  const any_stream s(code, seed);
  std::vector<std::uint32_t> rows(order);
  for (std::size_t i = 0; i < order; ++i)
    rows[i] = s.at<std::uint32_t>(16 + 4 * i);
  return rank(rows);
}

TEST_F(r250_words, bits_are_independent_whatever_the_seed) {
  EXPECT_EQ(rank_of_stream({}), 32);
  support::test_data data(6);
  for (std::uint32_t seed = 0; seed < 2000; ++seed) {
    ASSERT_EQ(rank_of_stream({seed}), 32) << seed;
    const auto key = support::random_block(data, 1 + data.below(249));
    ASSERT_EQ(rank_of_stream(key), 32) << seed;
  }
  // States that are given are left alone: there the rank shows what it finds.
  std::vector<std::uint32_t> dependent = support::random_block(data, order);
  for (std::uint32_t& w : dependent)
    w = (w & 0xFFFFFFFE) | w >> 31;  // bit 0 repeats bit 31
  EXPECT_EQ(rank_of_stream(dependent), 31);
  EXPECT_EQ(rank_of_stream(std::vector<std::uint32_t>(order, 0x10001)), 1);
}

TEST_F(r250_words, neither_skips_nor_leaps) {
  any_stream s(code, {1});
  const auto before = s.image();
  EXPECT_EQ(rvxSkipAheadStream(s, 1), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(rvxLeapfrogStream(s, 0, 2), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(s.image(), before);
  s.words(1);
}

}  // namespace
