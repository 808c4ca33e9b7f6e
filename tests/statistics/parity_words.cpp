// SPDX-License-Identifier: Apache-2.0
// Raw words of philox4x32x10 against the plain model: every small count, every place in a block,
// every carry of the counter, every split, and skips, under each SIMD target.
#include "support.hpp"

namespace {

using plain::u128;
using words = support::on_simd_target;

constexpr plain::two key{0x12345678, 0x9ABCDEF0};

// Draws n words and compares them, the guards and the stream's new place.
void draw_and_compare(support::stream& s, plain::stream& model, std::size_t n) {
  support::results<std::uint32_t> r(n);
  ASSERT_EQ(rvxiRngUniformBits(0, s, static_cast<std::int64_t>(n), r.data()), 0);
  for (std::size_t i = 0; i < n; ++i) {
    const std::uint32_t expected = model.next();
    ASSERT_EQ(r[i], expected) << "word " << i << " of " << n;
  }
  ASSERT_TRUE(r.guards_intact());
  if (n != 0) {
    ASSERT_TRUE(support::same_position(s, model)) << "after " << n << " words";
  }
}

TEST_F(words, every_count_from_every_place_in_a_block) {
  support::stream s;
  for (std::uint32_t idx = 0; idx <= 4; ++idx) {
    for (std::size_t n = 0; n <= 300; ++n) {
      s.set(key, 1000, idx);
      plain::stream model = s.position();
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, n)) << "idx " << idx;
    }
  }
}

TEST_F(words, counters_carry_next_to_each_word_of_the_counter) {
  support::stream s;
  for (unsigned bit : {32u, 64u, 96u, 128u}) {
    const u128 edge = bit == 128 ? 0 : u128{1} << bit;
    for (unsigned before = 0; before <= 40; ++before) {
      for (std::uint32_t idx : {0u, 1u, 3u, 4u}) {
        s.set(key, edge - before, idx);
        plain::stream model = s.position();
        ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, 200))
            << "2^" << bit << " - " << before << ", idx " << idx;
      }
    }
  }
}

TEST_F(words, every_split_gives_the_serial_stream) {
  support::stream s;
  for (std::size_t total : {41u, 150u}) {
    for (std::size_t first = 0; first <= total; ++first) {
      s.set(key, 5, 0);
      plain::stream model = s.position();
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, first));
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, total - first));
    }
  }
  support::test_data data(1);
  s.set(key, 77, 0);
  plain::stream model = s.position();
  for (int call = 0; call < 200; ++call)
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, data.below(3000)));
}

TEST_F(words, skips_add_up_and_equal_drawing) {
  support::stream s;
  support::test_data data(2);
  for (int round = 0; round < 2000; ++round) {
    const u128 ctr = round % 2 == 0 ? u128{data()} << 64 | data() : u128{data.below(3)} - 1;
    const auto idx = static_cast<std::uint32_t>(data.below(5));
    const std::size_t a = data.below(300), b = data.below(300);

    s.set(key, ctr, idx);
    plain::stream model = s.position();
    model.skip((a + b) / 4, static_cast<unsigned>((a + b) % 4));
    ASSERT_EQ(rvxSkipAheadStream(s, static_cast<std::int64_t>(a)), 0);
    ASSERT_EQ(rvxSkipAheadStream(s, static_cast<std::int64_t>(b)), 0);
    ASSERT_TRUE(support::same_position(s, model));

    s.set(key, ctr, idx);
    ASSERT_EQ(rvxSkipAheadStream(s, static_cast<std::int64_t>(a + b)), 0);
    ASSERT_TRUE(support::same_position(s, model));

    s.set(key, ctr, idx);
    support::results<std::uint32_t> drawn(a);
    ASSERT_EQ(rvxiRngUniformBits(0, s, static_cast<std::int64_t>(a), drawn.data()), 0);
    ASSERT_EQ(rvxSkipAheadStream(s, static_cast<std::int64_t>(b)), 0);
    ASSERT_TRUE(support::same_position(s, model));
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, 9));
  }
}

TEST_F(words, long_skips_wrap_at_the_period) {
  support::stream s;
  support::test_data data(3);
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

    s.set(key, u128{data()} << 64 | data(), static_cast<std::uint32_t>(data.below(5)));
    plain::stream model = s.position();
    model.skip(blocks, odd);
    ASSERT_EQ(rvxSkipAheadStreamEx(s, count, digits), 0);
    ASSERT_TRUE(support::same_position(s, model)) << count << " digits";
  }
  ASSERT_NO_FATAL_FAILURE({
    plain::stream model = s.position();
    draw_and_compare(s, model, 5);
  });
}

TEST_F(words, uniform_bits_of_32_and_64_bits_are_the_words) {
  support::stream s;
  for (std::uint32_t idx = 0; idx <= 4; ++idx) {
    for (std::size_t n : {1u, 2u, 3u, 7u, 64u, 1025u}) {
      s.set(key, 9, idx);
      plain::stream model = s.position();
      support::results<std::uint64_t> wide(n);
      ASSERT_EQ(rvxiRngUniformBits64(0, s, static_cast<std::int64_t>(n), wide.data()), 0);
      for (std::size_t i = 0; i < n; ++i) {
        const std::uint64_t r0 = model.next(), r1 = model.next();
        ASSERT_EQ(wide[i], r1 << 32 | r0);
      }
      ASSERT_TRUE(wide.guards_intact());

      support::results<std::uint32_t> narrow(n);
      ASSERT_EQ(rvxiRngUniformBits32(0, s, static_cast<std::int64_t>(n), narrow.data()), 0);
      for (std::size_t i = 0; i < n; ++i)
        ASSERT_EQ(narrow[i], model.next());
      ASSERT_TRUE(narrow.guards_intact());
      ASSERT_TRUE(support::same_position(s, model));
    }
  }
}

TEST(seeding, words_fill_key_then_counter) {
  const std::uint32_t given[8] = {11, 12, 13, 14, 15, 16, 17, 18};
  for (std::int64_t n = 0; n <= 8; ++n) {
    rvx_stream made = nullptr;
    ASSERT_EQ(rvxNewStreamEx(&made, RVX_BRNG_PHILOX4X32X10, n, given), 0);
    support::record r;
    std::memcpy(&r, static_cast<char*>(made) + 16, sizeof r);
    const std::uint32_t taken[6] = {r.key[0], r.key[1], r.ctr[0], r.ctr[1], r.ctr[2], r.ctr[3]};
    for (std::int64_t i = 0; i < 6; ++i)
      EXPECT_EQ(taken[i], i < n ? given[i] : 0) << "word " << i << " of " << n;
    EXPECT_EQ(r.idx, 0u);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(made) % 64, 0u);
    rvxDeleteStream(&made);
  }
}

TEST(seeding, a_long_seed_is_two_words) {
  const std::uint64_t seed = 0x89ABCDEF01234567;
  support::stream s(seed);
  EXPECT_EQ(s.state().key[0], 0x01234567u);
  EXPECT_EQ(s.state().key[1], 0x89ABCDEFu);
}

}  // namespace
