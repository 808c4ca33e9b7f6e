// SPDX-License-Identifier: Apache-2.0
// Members of mt2203 against the plain model, word by word and record by record, under each SIMD
// target.
#include "../block_streams.hpp"
#include "tables/mt2203_table.hpp"

namespace {

using rule = tarn_test::mt2203_rule;
using support::any_stream;

constexpr std::int64_t code = RVX_BRNG_MT2203;
constexpr std::uint32_t order = 69;
constexpr std::uint32_t upper = 0xFFFFFFE0;  // the bits of word 0 that belong to the state

constexpr tarn::statistics::mt2203_parameters table[tarn::statistics::mt2203_members] = {
#include "tables/mt2203_table.inc"
};

rule rule_of(std::uint32_t member) {
  return {table[member].matrix_a, table[member].mask_b, table[member].mask_c};
}

using mt2203_words = support::on_simd_target;

TEST_F(mt2203_words, every_count_from_several_positions) {
  support::every_count_from_several_positions(code, rule_of(0));
  support::every_count_from_several_positions(code + 31, rule_of(31));
}

TEST_F(mt2203_words, counts_next_to_block_edges) {
  support::counts_next_to_block_edges(code + 1, rule_of(1));
}

TEST_F(mt2203_words, any_split) {
  support::any_split(code + 2, rule_of(2));
}

TEST_F(mt2203_words, sparse_and_full_states) {
  support::sparse_and_full_states(code + 3, rule_of(3));
}

TEST_F(mt2203_words, equal_places_have_equal_images) {
  support::equal_places_have_equal_images<rule>(code + 4);
}

// After seeding, the record holds the first block that follows the start words, all of it unread,
// and the constants of the member, at the offsets that clients read.
void expect_start(std::uint32_t member, const std::vector<std::uint32_t>& seed,
                  const std::vector<std::uint32_t>& start) {
  any_stream s(code + member, seed);
  ASSERT_EQ(rvxGetStreamSize(s), 308);
  ASSERT_EQ(s.at<std::uint32_t>(292), order);
  ASSERT_EQ(s.at<std::uint32_t>(296), table[member].matrix_a);
  ASSERT_EQ(s.at<std::uint32_t>(300), table[member].mask_b);
  ASSERT_EQ(s.at<std::uint32_t>(304), table[member].mask_c);
  tarn_test::sequence<rule> x(start, rule_of(member));
  for (std::size_t i = 0; i < order; ++i)
    ASSERT_EQ(s.at<std::uint32_t>(16 + 4 * i), x.word(order + i)) << "word " << i;
  const auto drawn = s.words(300);
  for (std::size_t i = 0; i < drawn.size(); ++i)
    ASSERT_EQ(drawn[i], x.output(order + i)) << "word " << i << " of member " << member;
}

TEST_F(mt2203_words, seeding) {
  ASSERT_NO_FATAL_FAILURE(expect_start(0, {}, tarn_test::words_from_seed(order, 1)));
  for (const std::uint32_t seed : {0u, 1u, 0x1Fu, 0x80000000u, 0xFFFFFFFFu})
    ASSERT_NO_FATAL_FAILURE(expect_start(9, {seed}, tarn_test::words_from_seed(order, seed)));
  support::test_data data(4);
  for (const std::size_t n : {2, 3, 68, 69, 70, 200}) {
    const auto key = support::random_block(data, n);
    ASSERT_NO_FATAL_FAILURE(expect_start(7, key, tarn_test::words_from_key(order, key)));
  }
  const std::vector<std::uint32_t> zeros(2, 0);
  ASSERT_NO_FATAL_FAILURE(expect_start(7, zeros, tarn_test::words_from_key(order, zeros)));
}

TEST_F(mt2203_words, every_member) {
  for (std::uint32_t member = 0; member < 6024; ++member)
    ASSERT_NO_FATAL_FAILURE(
        expect_start(member, {member}, tarn_test::words_from_seed(order, member)));
}

TEST_F(mt2203_words, members_end_at_6024) {
  rvx_stream s = nullptr;
  EXPECT_NE(rvxNewStream(&s, code + 6024, 1), 0);
  EXPECT_EQ(s, nullptr);
}

TEST_F(mt2203_words, impossible_fields_are_refused) {
  support::impossible_fields_are_refused<rule>(code + 5, upper);
  any_stream s(code + 5, {1});
  s.words(1);
  for (const std::size_t field : {296, 300, 304}) {
    const auto right = s.at<std::uint32_t>(field);
    for (unsigned bit = 0; bit < 32; ++bit) {
      s.set(field, right ^ 1u << bit);
      support::expect_refused(s);
    }
    s.set(field, right);
  }
  // The right fields, of another member.
  s.set(0, static_cast<std::uint32_t>(code + 6));
  support::expect_refused(s);
  s.set(0, static_cast<std::uint32_t>(code + 5));
  s.words(1);
}

TEST_F(mt2203_words, neither_skips_nor_leaps) {
  any_stream s(code, {1});
  const auto before = s.image();
  EXPECT_EQ(rvxSkipAheadStream(s, 1), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(rvxLeapfrogStream(s, 0, 2), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(s.image(), before);
  s.words(1);
}

}  // namespace
