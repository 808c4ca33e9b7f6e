// SPDX-License-Identifier: Apache-2.0
// Raw words of sfmt19937 against the plain model: counts, places in a block, splits, any state,
// seeds, refusals, under each SIMD target.
#include "any_sfmt.hpp"

namespace {

using words = support::on_simd_target;
using plain::block;

TEST_F(words, every_count_from_many_places_in_a_block) {
  const plain::sfmt start(1);
  for (const std::size_t place : {0u, 1u, 2u, 3u, 4u, 7u, 135u, 136u, 300u, 489u, 620u, 623u}) {
    for (std::size_t n = 0; n <= 300; ++n) {
      plain::sfmt s = start;
      s.set_place(place);
      ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(n)) << "from " << place;
    }
  }
}

TEST_F(words, runs_around_the_ends_of_blocks) {
  const plain::sfmt start(2);
  for (const std::size_t place : {0u, 1u, 5u, 312u, 623u}) {
    for (const std::size_t end : {1u, 2u, 3u, 7u}) {
      for (std::size_t n = end * block - place - 5; n <= end * block - place + 5; ++n) {
        plain::sfmt s = start;
        s.set_place(place);
        ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(n)) << "from " << place;
      }
    }
  }
  plain::sfmt s = start;
  for (const std::size_t n : {200001u, 31u, 100000u})
    ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(n));
}

TEST_F(words, splits_give_the_serial_stream_and_equal_images) {
  support::test_data data(3);
  plain::sfmt s(3);
  for (int call = 0; call < 300; ++call)
    ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(data.below(2500)));
  for (int round = 0; round < 200; ++round) {
    const std::size_t total = data.below(3 * block), first = data.below(total + 1);
    support::any_stream whole = s.made, cut = s.made;
    whole.words(total);
    cut.words(first);
    cut.words(total - first);
    ASSERT_EQ(whole.image(), cut.image()) << first << " of " << total;
  }
}

TEST_F(words, results_at_any_multiple_of_four_bytes) {
  for (std::size_t shift = 0; shift < 16; ++shift) {
    support::any_stream s(RVX_BRNG_SFMT19937, {4}), same = s;
    constexpr std::size_t n = 4 * block;
    const std::vector<std::uint32_t> expected = same.words(n);
    support::results<std::uint32_t> r(n + shift);
    ASSERT_EQ(rvxiRngUniformBits(0, s, n, r.data() + shift), 0);
    for (std::size_t i = 0; i < n; ++i)
      ASSERT_EQ(r[shift + i], expected[i]);
    for (std::size_t i = 0; i < shift; ++i)
      ASSERT_EQ(r[i], 0xA5A5A5A5u);
    ASSERT_TRUE(r.guards_intact());
  }
}

TEST_F(words, any_state_but_zero) {
  support::test_data data(5);
  for (int round = 0; round < 100; ++round) {
    std::vector<std::uint32_t> state(block);
    if (round < 50) {  // one bit, in the first and in other words
      state[round < 25 ? data.below(4) : data.below(block)] = 1u << data.below(32);
    } else {
      for (std::uint32_t& word : state)
        word = static_cast<std::uint32_t>(data());
    }
    plain::sfmt s(state);
    s.set_place(data.below(block));
    ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(5 * block));
  }
}

TEST_F(words, the_place_0_is_the_whole_block) {
  support::any_stream s(RVX_BRNG_SFMT19937, {6}), same = s;
  EXPECT_EQ(s.at<std::uint32_t>(plain::place_at), block);
  s.set(plain::place_at, std::uint32_t{0});
  EXPECT_EQ(s.words(1), same.words(1));
  EXPECT_EQ(s.image(), same.image());
  s.set(plain::place_at, std::uint32_t{0});
  same.set(plain::place_at, static_cast<std::uint32_t>(block));
  EXPECT_EQ(s.words(2 * block), same.words(2 * block));
  EXPECT_EQ(s.image(), same.image());
}

TEST(record, lies_at_fixed_offsets) {
  support::any_stream s(RVX_BRNG_SFMT19937, {7});
  EXPECT_EQ(rvxGetStreamSize(s), 16 + 2500);
  EXPECT_EQ(plain::place_at, 16u + 2496u);
}

TEST(record, impossible_fields_are_refused) {
  support::any_stream s(RVX_BRNG_SFMT19937, {8});
  const auto refused = [&s] {
    support::results<std::uint32_t> r(8);
    return rvxiRngUniformBits(0, s, 8, r.data()) == RVX_STATUS_BAD_MARK && r.untouched() &&
           rvxSkipAheadStream(s, 1) == RVX_STATUS_BAD_MARK;
  };
  for (const std::uint32_t place : {625u, 626u, 0x80000000u, 0xFFFFFFFFu}) {
    s.set(plain::place_at, place);
    EXPECT_TRUE(refused()) << place;
  }
  s.set(plain::place_at, 1u);
  s.set(16, std::array<std::uint32_t, block>{});
  EXPECT_TRUE(refused());
  s.set(16 + 4 * (block - 1), 1u);
  EXPECT_FALSE(refused());
}

TEST(seeding, none_is_1_and_one_word_is_the_seed) {
  EXPECT_EQ(support::any_stream(RVX_BRNG_SFMT19937, {}).words(2 * block),
            support::any_stream(RVX_BRNG_SFMT19937, {1}).words(2 * block));
  int changed = 0;  // by the certification
  for (std::uint32_t seed : {0u, 1u, 2u, 3u, 4u, 5u, 6u, 7u, 1234u, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
    changed += tarn_test::sfmt_from_seed(seed)[0] != seed ? 1 : 0;
    plain::sfmt s(seed);
    ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(2 * block)) << "seed " << seed;
  }
  EXPECT_GT(changed, 0);
  EXPECT_LT(changed, 11);
}

TEST(seeding, several_words_are_a_key) {
  support::test_data data(9);
  for (const std::size_t n : {2u, 3u, 4u, 5u, 622u, 623u, 624u, 625u, 1247u, 1248u, 5000u}) {
    for (int kind = 0; kind < 3; ++kind) {
      std::vector<std::uint32_t> key(n, kind == 0 ? 0 : 0xFFFFFFFF);
      for (std::uint32_t& word : key)
        word = kind == 2 ? static_cast<std::uint32_t>(data()) : word;
      support::any_stream s(RVX_BRNG_SFMT19937, key);
      tarn_test::sfmt_model model(tarn_test::sfmt_from_key(key));
      const std::vector<std::uint32_t> drawn = s.words(2 * block);
      for (std::size_t i = 0; i < drawn.size(); ++i)
        ASSERT_EQ(drawn[i], model.word(i)) << "word " << i << " from a key of " << n;
    }
  }
}

TEST(seeding, a_long_seed_is_a_key_of_two_words) {
  rvx_stream made = nullptr;
  ASSERT_EQ(rvxNewStream(&made, RVX_BRNG_SFMT19937, 0x89ABCDEF01234567), 0);
  std::uint32_t first = 0;
  EXPECT_EQ(rvxiRngUniformBits(0, made, 1, &first), 0);
  EXPECT_EQ(first, support::any_stream(RVX_BRNG_SFMT19937, {0x01234567, 0x89ABCDEF}).words(1)[0]);
  rvxDeleteStream(&made);
}

}  // namespace
