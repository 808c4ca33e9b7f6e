// SPDX-License-Identifier: Apache-2.0
// Raw words of ars5 against the plain model: every small count, every place in a block, every carry
// of the counter, splits, skips, images and refusals, under each SIMD target.
#include "any_stream.hpp"
#include "plain_ars5.hpp"

namespace {

using plain::u128;
using words = support::on_simd_target;

// Where the fields stand in a stream.
constexpr std::size_t key_at = 16, ctr_at = 32, idx_at = 48, length = 52;

struct ars5 : support::any_stream {
  ars5() : any_stream(RVX_BRNG_ARS5, {0x12345678, 0x9ABCDEF0, 0x0FEDCBA9, 0x87654321}) {}

  void set_position(u128 ctr, std::uint32_t idx) {
    set(ctr_at, ctr);
    set(idx_at, idx);
  }

  // Read by the rule: the next word has the index 4 * ctr - idx.
  plain::ars5_stream position() const {
    const auto idx = at<std::uint32_t>(idx_at);
    return {at<std::array<std::uint64_t, 2>>(key_at), at<u128>(ctr_at) - (idx + 3) / 4,
            (4 - idx % 4) % 4};
  }

  bool stands_at(const plain::ars5_stream& p) const {
    const plain::ars5_stream q = position();
    return at<std::uint32_t>(idx_at) <= 3 && q.key == p.key && q.block == p.block &&
           q.word == p.word;
  }
};

// Draws n words and compares them and the stream's new place.
void draw_and_compare(ars5& s, plain::ars5_stream& model, std::size_t n) {
  const std::vector<std::uint32_t> drawn = s.words(n);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(drawn[i], model.next()) << "word " << i << " of " << n;
  if (n != 0) {
    ASSERT_TRUE(s.stands_at(model)) << "after " << n << " words";
  }
}

TEST_F(words, every_count_from_every_place_in_a_block) {
  ars5 s;
  for (std::uint32_t idx = 0; idx <= 4; ++idx) {
    for (std::size_t n = 0; n <= 300; ++n) {
      s.set_position(1000, idx);
      plain::ars5_stream model = s.position();
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, n)) << "idx " << idx;
    }
  }
}

TEST_F(words, counters_carry_next_to_each_word_of_the_counter) {
  ars5 s;
  for (unsigned bit : {32u, 64u, 96u, 128u}) {
    const u128 edge = bit == 128 ? 0 : u128{1} << bit;
    for (unsigned before = 0; before <= 40; ++before) {
      for (std::uint32_t idx = 0; idx <= 4; ++idx) {
        s.set_position(edge - before, idx);
        plain::ars5_stream model = s.position();
        ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, 200))
            << "2^" << bit << " - " << before << ", idx " << idx;
      }
    }
  }
}

TEST_F(words, every_split_gives_the_serial_stream_and_the_same_image) {
  ars5 s, whole;
  for (std::size_t total : {41u, 150u}) {
    whole.set_position(5, 0);
    whole.words(total);
    for (std::size_t first = 0; first <= total; ++first) {
      s.set_position(5, 0);
      plain::ars5_stream model = s.position();
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, first));
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, total - first));
      ASSERT_EQ(s.image(), whole.image()) << first << " of " << total;
    }
  }
  support::test_data data(1);
  s.set_position(77, 0);
  plain::ars5_stream model = s.position();
  for (int call = 0; call < 100; ++call)
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, data.below(3000)));
}

TEST_F(words, skips_add_up_and_equal_drawing) {
  ars5 s;
  support::test_data data(2);
  for (int round = 0; round < 1000; ++round) {
    const u128 ctr = round % 2 == 0 ? u128{data()} << 64 | data() : u128{data.below(3)} - 1;
    const auto idx = static_cast<std::uint32_t>(data.below(5));
    const std::size_t a = data.below(300), b = data.below(300);

    s.set_position(ctr, idx);
    plain::ars5_stream model = s.position();
    model.skip((a + b) / 4, static_cast<unsigned>((a + b) % 4));
    s.skip(a);
    s.skip(b);
    ASSERT_TRUE(s.stands_at(model));

    s.set_position(ctr, idx);
    s.skip(a + b);
    ASSERT_TRUE(s.stands_at(model));

    s.set_position(ctr, idx);
    s.words(a);
    s.skip(b);
    ASSERT_TRUE(s.stands_at(model));
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, 9));
  }
}

TEST_F(words, skips_cross_every_carry) {
  ars5 s;
  support::test_data data(3);
  for (unsigned bit : {32u, 63u, 64u, 96u, 128u}) {
    const u128 edge = bit == 128 ? 0 : u128{1} << bit;
    for (std::uint32_t idx = 0; idx <= 4; ++idx) {
      for (std::uint64_t count = 0; count <= 12; ++count) {
        s.set_position(edge - 1, idx);
        plain::ars5_stream model = s.position();
        model.skip(0, static_cast<unsigned>(count));
        s.skip(count);
        ASSERT_TRUE(s.stands_at(model)) << "2^" << bit << ", idx " << idx << " by " << count;

        // Down from the edge by a long way and over it.
        const std::uint64_t distance = data();
        s.set_position(edge - (distance >> 3), idx);
        model = s.position();
        model.skip(distance >> 2, static_cast<unsigned>(distance % 4));
        s.skip(distance);
        ASSERT_TRUE(s.stands_at(model)) << "2^" << bit << ", idx " << idx << " by " << distance;
      }
    }
  }
}

TEST_F(words, long_skips_wrap_at_the_period) {
  ars5 s;
  support::test_data data(4);
  for (int round = 0; round < 2000; ++round) {
    const std::uint64_t digits[4] = {data(), data(), data(), data()};
    const auto count = static_cast<std::int64_t>(data.below(5));
    u128 blocks = 0;  // the count divided by 4, modulo 2^128
    if (count > 0)
      blocks += digits[0] >> 2;
    if (count > 1)
      blocks += u128{digits[1]} << 62;
    if (count > 2)
      blocks += u128{digits[2]} << 126;
    const auto odd = static_cast<unsigned>(count > 0 ? digits[0] & 3 : 0);

    s.set_position(u128{data()} << 64 | data(), static_cast<std::uint32_t>(data.below(5)));
    plain::ars5_stream model = s.position();
    model.skip(blocks, odd);
    ASSERT_EQ(rvxSkipAheadStreamEx(s, count, digits), 0);
    ASSERT_TRUE(s.stands_at(model)) << count << " digits";
  }
  plain::ars5_stream model = s.position();
  ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, 5));
}

TEST(seeding, words_fill_key_then_counter) {
  const std::vector<std::uint32_t> given = {11, 12, 13, 14, 15, 16, 17, 18, 19, 20};
  for (std::size_t n = 0; n <= given.size(); ++n) {
    const support::any_stream s(RVX_BRNG_ARS5,
                                {given.begin(), given.begin() + static_cast<std::ptrdiff_t>(n)});
    for (std::size_t i = 0; i < 8; ++i)
      EXPECT_EQ(s.at<std::uint32_t>(key_at + 4 * i), i < n ? given[i] : 0)
          << "word " << i << " of " << n;
    EXPECT_EQ(s.at<std::uint32_t>(idx_at), 0u);
    EXPECT_EQ(s.image().size(), length);
  }
}

TEST(refusal, a_block_has_no_five_unread_words) {
  ars5 s;
  std::uint32_t untouched = 0xA5A5A5A5;
  for (const std::uint32_t idx : {5u, 6u, 0x80000000u, 0xFFFFFFFFu}) {
    s.set(idx_at, idx);
    EXPECT_EQ(rvxiRngUniformBits(0, s, 1, &untouched), RVX_STATUS_BAD_MARK);
    EXPECT_EQ(rvxSkipAheadStream(s, 1), RVX_STATUS_BAD_MARK);
  }
  EXPECT_EQ(untouched, 0xA5A5A5A5);
}

}  // namespace
