// SPDX-License-Identifier: Apache-2.0
// mt19937 against the plain model, word by word and record by record, under each SIMD target; skips
// against drawing and, where nobody can draw, against plain polynomial arithmetic.
#include "../../models/jump_model.hpp"
#include "../block_streams.hpp"

namespace {

using rule = tarn_test::mt19937_rule;
using stream = support::block_stream<rule>;
using support::any_stream;

constexpr std::int64_t code = RVX_BRNG_MT19937;
constexpr std::uint32_t order = 624;

using mt19937_words = support::on_simd_target;

TEST_F(mt19937_words, every_count_from_several_positions) {
  support::every_count_from_several_positions<rule>(code);
}

TEST_F(mt19937_words, counts_next_to_block_edges) {
  support::counts_next_to_block_edges<rule>(code);
}

TEST_F(mt19937_words, any_split) {
  support::any_split<rule>(code);
}

TEST_F(mt19937_words, sparse_and_full_states) {
  support::sparse_and_full_states<rule>(code);
}

TEST_F(mt19937_words, equal_places_have_equal_images) {
  support::equal_places_have_equal_images<rule>(code);
}

TEST_F(mt19937_words, impossible_fields_are_refused) {
  support::impossible_fields_are_refused<rule>(code, 0x80000000);
  any_stream s(code, {1});
  s.words(1);
}

// After seeding, the record holds the first block that follows the start words, all of it unread,
// at the offsets that clients read.
TEST_F(mt19937_words, seeding) {
  const auto expect_start = [](const std::vector<std::uint32_t>& seed,
                               const std::vector<std::uint32_t>& start) {
    any_stream s(code, seed);
    ASSERT_EQ(rvxGetStreamSize(s), 2516);
    ASSERT_EQ(s.at<std::uint32_t>(2512), order);
    tarn_test::sequence<rule> x(start);
    for (std::size_t i = 0; i < order; ++i)
      ASSERT_EQ(s.at<std::uint32_t>(16 + 4 * i), x.word(order + i)) << "word " << i;
    const auto drawn = s.words(2000);
    for (std::size_t i = 0; i < drawn.size(); ++i)
      ASSERT_EQ(drawn[i], x.output(order + i)) << "word " << i;
  };
  ASSERT_NO_FATAL_FAILURE(expect_start({}, tarn_test::words_from_seed(order, 1)));
  for (const std::uint32_t seed : {0u, 1u, 5489u, 0x80000000u, 0xFFFFFFFFu})
    ASSERT_NO_FATAL_FAILURE(expect_start({seed}, tarn_test::words_from_seed(order, seed)));
  support::test_data data(4);
  for (const std::size_t n : {2, 3, 4, 623, 624, 625, 1300}) {
    const auto key = support::random_block(data, n);
    ASSERT_NO_FATAL_FAILURE(expect_start(key, tarn_test::words_from_key(order, key)));
  }
  const std::vector<std::uint32_t> zeros(2, 0);
  ASSERT_NO_FATAL_FAILURE(expect_start(zeros, tarn_test::words_from_key(order, zeros)));
}

TEST_F(mt19937_words, skips_add_up_and_equal_drawing) {
  support::test_data data(5);
  for (const std::uint32_t position : support::positions(order)) {
    const auto words = support::random_block(data, order);
    for (std::size_t a = 0; a <= 3 * order; a += 1 + data.below(60)) {
      const std::size_t b = data.below(2000);
      stream in_two(code, words, position), in_one(code, words, position),
          after_drawing(code, words, position);
      ASSERT_NO_FATAL_FAILURE(in_two.skip(a));
      ASSERT_NO_FATAL_FAILURE(in_two.skip(b));
      ASSERT_NO_FATAL_FAILURE(in_one.skip(a + b));
      ASSERT_NO_FATAL_FAILURE(after_drawing.draw(a));
      ASSERT_NO_FATAL_FAILURE(after_drawing.skip(b));
      ASSERT_NO_FATAL_FAILURE(after_drawing.draw(9));
      ASSERT_NO_FATAL_FAILURE(in_two.draw(9));
    }
  }
}

void draw_and_drop(any_stream& s, std::size_t n) {
  constexpr std::size_t piece = 1'000'000;
  std::vector<std::uint32_t> words(piece);
  for (; n != 0; n -= std::min(n, piece))
    ASSERT_EQ(rvxiRngUniformBits(0, s, static_cast<std::int64_t>(std::min(n, piece)), words.data()),
              0);
}

// On both sides of the distance from which on blocks are no longer made one by one.
TEST_F(mt19937_words, long_skips_equal_drawing) {
  support::test_data data(6);
  for (const std::uint32_t position : {1u, order}) {
    stream start(code, support::random_block(data, order), position);
    for (const std::size_t blocks : {9'999, 10'000}) {
      for (const std::size_t n : {blocks * order, blocks * order + order - 1}) {
        any_stream drawn(start.stream()), skipped(start.stream());
        ASSERT_NO_FATAL_FAILURE(draw_and_drop(drawn, n));
        skipped.skip(n);
        ASSERT_EQ(skipped.image(), drawn.image()) << "position " << position << ", " << n;
      }
    }
  }
}

// Long skips from any block: the model finds the words of the block that is reached. Word 0 of such
// a block has 31 bits that obey nothing, so the model jumps from the words of the next block.
TEST_F(mt19937_words, skips_beyond_drawing) {
  support::test_data data(7);
  const auto words = support::random_block(data, order);
  tarn_test::sequence<rule> x(words);
  constexpr std::size_t degree = 19937;
  const tarn_test::jump_model model(degree,
                                    [&](std::size_t i) { return (x.word(order + i) & 1) != 0; });
  ASSERT_EQ(model.degree(), degree);

  struct skip_case {
    std::uint32_t position;
    std::uint64_t distance;
  };
  for (const auto& [position, distance] :
       {skip_case{order, 20'000 * order}, skip_case{300, std::uint64_t{1} << 32},
        skip_case{1, std::uint64_t{1} << 63}, skip_case{623, ~std::uint64_t{0}}}) {
    const std::uint64_t read = position % order;
    const std::uint64_t within = (read + distance % order) % order;
    // The distance of the block reached from the block after the first one: below 2^64 at any rate.
    const std::uint64_t blocks = distance / order + (read + distance % order) / order;
    const std::vector<std::size_t> terms = model.terms((blocks - 1) * order);
    stream s(code, words, position);
    any_stream& skipped = s.stream();
    skipped.skip(distance);
    ASSERT_EQ(skipped.at<std::uint32_t>(2512), within == 0 ? order : within);
    for (std::size_t j = 0; j < order; ++j) {
      std::uint32_t expected = 0;
      for (const std::size_t i : terms)
        expected ^= x.word(order + i + j);
      ASSERT_EQ(skipped.at<std::uint32_t>(16 + 4 * j), expected)
          << "word " << j << " after " << distance << " from " << position;
    }
    // The same in parts.
    stream t(code, words, position);
    any_stream& parts = t.stream();
    for (const std::uint64_t part : {distance / 2, std::uint64_t{1}, distance - distance / 2 - 1})
      parts.skip(part);
    ASSERT_EQ(parts.image(), skipped.image());
  }
}

}  // namespace
