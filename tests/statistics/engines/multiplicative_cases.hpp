// SPDX-License-Identifier: Apache-2.0
// The cases of the multiplicative congruential engines against the recurrence on plain numbers. The
// source that includes this defines `engine`, a class with
//   code                    of the engine
//   number                  of a record field
//   modulus, multiplier     of the recurrence
//   order                   x^order is 1 for every unit x
//   is_unit(x)              whether x is a state
//   start(seed)             the first state of a seed of up to 64 bits
#pragma once

#include <initializer_list>
#include <vector>

#include "any_stream.hpp"

namespace {

using number = engine::number;
using tarn_test::uint128;
using words = support::on_simd_target;

constexpr std::size_t parts = sizeof(number) / sizeof(std::uint32_t);

number product(number p, number q) {
  return static_cast<number>(uint128{p} * q % engine::modulus);
}

// By the digits of the exponent from the top.
number power(number base, uint128 exponent) {
  number result = 1;
  for (int bit = 128; bit-- > 0;) {
    result = product(result, result);
    if ((exponent >> bit & 1) != 0)
      result = product(result, base);
  }
  return result;
}

struct model {
  number x, a;

  number next() {
    const number word = x;
    x = product(x, a);
    return word;
  }
  void skip(uint128 count) { x = product(x, power(a, count % engine::order)); }
};

struct stream : support::any_stream {
  stream(std::initializer_list<std::uint32_t> seed = {}) : any_stream(engine::code, seed) {}
  stream(number x, number a) : stream() {
    set(16, x);
    set(16 + sizeof x, a);
  }
  number x() const { return at<number>(16); }
  number a() const { return at<number>(16 + sizeof(number)); }
  bool stands_at(const model& m) const { return x() == m.x && a() == m.a; }

  std::vector<number> draw(std::size_t n) {
    const std::vector<std::uint32_t> numbers = words(n, parts);
    std::vector<number> drawn(n);
    for (std::size_t i = 0; i < n; ++i) {
      uint128 word = 0;
      for (std::size_t part = parts; part-- > 0;)
        word = word << 32 | numbers[i * parts + part];
      drawn[i] = static_cast<number>(word);
    }
    return drawn;
  }

  int leapfrog(std::int64_t idx, std::int64_t stride) {
    return rvxLeapfrogStream(*this, idx, stride);
  }
};

void draw_and_compare(stream& s, model& m, std::size_t n) {
  const std::vector<number> drawn = s.draw(n);
  ASSERT_EQ(drawn.size(), n);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(drawn[i], m.next()) << "word " << i << " of " << n;
  ASSERT_TRUE(s.stands_at(m)) << "after " << n << " words";
}

// States and multipliers at the edges, and some others.
std::vector<model> places() {
  const auto last = static_cast<number>(engine::modulus - 1);
  std::vector<model> all;
  for (const number x : {number{1}, number{2}, number{123456789}, last - 1, last}) {
    for (const number a : {engine::multiplier, number{1}, number{5}, last - 1, last}) {
      if (engine::is_unit(x) && engine::is_unit(a))
        all.push_back({x, a});
    }
  }
  return all;
}

TEST_F(words, every_count_from_every_place) {
  const std::vector<model> all = places();
  ASSERT_GE(all.size(), 3u * 4u);
  for (const model& place : all) {
    for (std::size_t n = 0; n <= 300; ++n) {
      stream s(place.x, place.a);
      model m = place;
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, n));
    }
  }
}

TEST_F(words, long_runs_on_one_thread_and_shared_out) {
  const int before = tarn_serv_get_max_threads();
  for (int threads : {1, 4}) {
    tarn_serv_set_max_threads(threads);
    stream s;
    model m{1, engine::multiplier};
    for (std::size_t n : {1'000'003u, 131'072u, 262'145u})
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, n)) << threads << " threads";
  }
  tarn_serv_set_max_threads(before);
}

TEST_F(words, every_split_gives_the_serial_stream_and_one_image) {
  for (std::size_t total : {41u, 150u}) {
    stream whole{5};
    whole.draw(total);
    for (std::size_t first = 0; first <= total; ++first) {
      stream s{5};
      model m{s.x(), s.a()};
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, first));
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, total - first));
      ASSERT_EQ(s.image(), whole.image());
    }
  }
  support::test_data data(1);
  stream s{77};
  model m{s.x(), s.a()};
  for (int call = 0; call < 200; ++call)
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, data.below(3000)));
}

TEST_F(words, skips_add_up_and_equal_drawing) {
  support::test_data data(2);
  for (int round = 0; round < 300; ++round) {
    const std::size_t a = data.below(3000), b = data.below(300);
    const auto seed = static_cast<std::uint32_t>(data());
    stream once{seed}, twice{seed}, drawn{seed};
    model m{once.x(), once.a()};
    for (std::size_t i = 0; i < a + b; ++i)
      m.next();
    once.skip(a + b);
    twice.skip(a);
    twice.skip(b);
    drawn.draw(a);
    drawn.skip(b);
    ASSERT_TRUE(once.stands_at(m));
    ASSERT_EQ(twice.image(), once.image());
    ASSERT_EQ(drawn.image(), once.image());
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(drawn, m, 40));
  }
}

TEST(skips, far_ones_by_exact_powers) {
  support::test_data data(3);
  std::vector<std::uint64_t> distances = {0, 1, ~std::uint64_t{0}, engine::order};
  for (int bit : {31, 32, 57, 58, 59, 62, 63}) {
    for (std::uint64_t beside : {0, 1, 2})
      distances.push_back((std::uint64_t{1} << bit) - 1 + beside);
  }
  for (int i = 0; i < 200; ++i)
    distances.push_back(data() >> data.below(64));
  for (const model& place : places()) {
    for (const std::uint64_t distance : distances) {
      stream s(place.x, place.a);
      model m = place;
      s.skip(distance);
      m.skip(distance);
      ASSERT_TRUE(s.stands_at(m)) << distance;
    }
  }
  // The period, in two skips where it is the sum of two halves.
  stream s{99};
  const auto before = s.image();
  s.skip(engine::order / 2);
  s.skip(engine::order - engine::order / 2);
  EXPECT_EQ(s.image(), before);
}

TEST_F(words, leapfrog_picks_words) {
  support::test_data data(4);
  for (std::int64_t stride : {1, 2, 3, 4, 5, 6, 7, 64, 1000}) {
    for (int turn = 0; turn < 8; ++turn) {
      const std::int64_t idx =
          turn < 7 ? turn % stride
                   : static_cast<std::int64_t>(data.below(static_cast<std::size_t>(stride)));
      constexpr std::size_t picked = 130;
      const std::vector<number> serial =
          stream{42}.draw((picked + 1) * static_cast<std::size_t>(stride));
      stream s{42};
      ASSERT_EQ(s.leapfrog(idx, stride), 0);
      const std::vector<number> drawn = s.draw(picked);
      for (std::size_t i = 0; i < picked; ++i)
        ASSERT_EQ(drawn[i],
                  serial[static_cast<std::size_t>(idx) + i * static_cast<std::size_t>(stride)])
            << "word " << i << " of " << idx << " in " << stride;
    }
  }
}

TEST_F(words, leapfrog_by_the_longest_stride) {
  constexpr std::int64_t stride = 0x7FFFFFFF;
  for (std::int64_t idx : {std::int64_t{0}, std::int64_t{1}, stride / 2, stride - 1}) {
    stream s{7};
    model serial{s.x(), s.a()};
    ASSERT_EQ(s.leapfrog(idx, stride), 0);
    serial.skip(static_cast<std::uint64_t>(idx));
    const std::vector<number> drawn = s.draw(100);
    for (std::size_t i = 0; i < drawn.size(); ++i) {
      ASSERT_EQ(drawn[i], serial.x) << "word " << i << " from " << idx;
      serial.skip(stride);
    }
  }
}

TEST_F(words, leapfrogs_compose_and_skips_move_in_the_new_stream) {
  const std::vector<number> serial = stream{11}.draw(40'000);
  stream s{11};
  ASSERT_EQ(s.leapfrog(3, 5), 0);
  ASSERT_EQ(s.leapfrog(2, 7), 0);
  stream direct{11};
  ASSERT_EQ(direct.leapfrog(3 + 2 * 5, 5 * 7), 0);
  EXPECT_EQ(s.image(), direct.image());
  const std::vector<number> drawn = s.draw(50);
  s.skip(100);
  const std::vector<number> later = s.draw(50);
  for (std::size_t i = 0; i < 50; ++i) {
    ASSERT_EQ(drawn[i], serial[13 + 35 * i]);
    ASSERT_EQ(later[i], serial[13 + 35 * (i + 150)]);
  }
}

TEST(seeds, are_numbers_of_two_words) {
  support::test_data data(5);
  std::vector<std::uint64_t> seeds = {0, 1, 2, 3, 0x7FFFFFFF, 0xFFFFFFFF, ~std::uint64_t{0}};
  for (int bit : {31, 32, 58, 59}) {
    for (std::uint64_t beside : {0, 1, 2})
      seeds.push_back((std::uint64_t{1} << bit) - 1 + beside);
  }
  for (std::uint64_t multiple : {1, 2, 7})
    seeds.push_back(multiple * engine::modulus);
  for (int i = 0; i < 100; ++i)
    seeds.push_back(data());
  for (const std::uint64_t seed : seeds) {
    const auto low = static_cast<std::uint32_t>(seed);
    const auto high = static_cast<std::uint32_t>(seed >> 32);
    EXPECT_EQ(stream{low}.x(), engine::start(low)) << seed;
    EXPECT_EQ((stream{low, high}.x()), engine::start(seed)) << seed;
    EXPECT_EQ((stream{low, high, 17, 18}.x()), engine::start(seed)) << seed;
  }
}

TEST(records, hold_the_next_word_and_the_multiplier) {
  stream s;
  EXPECT_EQ(rvxGetStreamSize(s), static_cast<int>(16 + 2 * sizeof(number)));
  EXPECT_EQ(s.x(), 1u);
  EXPECT_EQ(s.a(), engine::multiplier);
  EXPECT_EQ(s.draw(1)[0], 1u);
  EXPECT_EQ(s.x(), engine::multiplier);
  ASSERT_EQ(s.leapfrog(0, 2), 0);
  EXPECT_EQ(s.a(), power(engine::multiplier, 2));
}

TEST(records, impossible_fields_are_refused) {
  std::vector<number> impossible = {0, static_cast<number>(engine::modulus),
                                    static_cast<number>(engine::modulus + 1),
                                    static_cast<number>(~number{0})};
  if (!engine::is_unit(2))
    impossible.push_back(2);
  for (const number bad : impossible) {
    for (const bool of_x : {true, false}) {
      stream s;
      const number x = of_x ? bad : 1, a = of_x ? engine::multiplier : bad;
      s.set(16, x);
      s.set(16 + sizeof x, a);
      support::results<std::uint32_t> r(2 * 40);
      EXPECT_EQ(rvxiRngUniformBits(0, s, 40, r.data()), RVX_STATUS_BAD_MARK) << bad;
      EXPECT_TRUE(r.untouched());
      EXPECT_EQ(rvxSkipAheadStream(s, 1), RVX_STATUS_BAD_MARK);
      EXPECT_EQ(s.leapfrog(0, 2), RVX_STATUS_BAD_MARK);
      EXPECT_TRUE(s.x() == x && s.a() == a);
    }
  }
}

}  // namespace
