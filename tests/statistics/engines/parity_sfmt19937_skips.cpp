// SPDX-License-Identifier: Apache-2.0
// Skips of sfmt19937 against drawing, and against plain polynomial arithmetic where nothing can be
// drawn, under each SIMD target.
#include "../../models/jump_model.hpp"
#include "any_sfmt.hpp"

namespace {

using skips = support::on_simd_target;
using plain::block;
using tarn_test::uint128;

// Below this distance the engine makes all blocks.
constexpr std::size_t stepped = 3000 * block;

TEST_F(skips, short_ones_equal_the_model_from_any_place) {
  support::test_data data(1);
  plain::sfmt s(1);
  for (int round = 0; round < 300; ++round) {
    const std::size_t distance = data.below(4 * block);
    s.made.skip(distance);
    s.at += distance;
    ASSERT_NO_FATAL_FAILURE(s.compare_record());
    ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(data.below(10)));
  }
  for (const std::size_t distance : {0u, 1u, 2u, 4u, 5u, 622u, 623u, 624u, 625u, 1248u}) {
    s.made.skip(distance);
    s.at += distance;
    ASSERT_NO_FATAL_FAILURE(s.compare_record()) << distance;
  }
}

TEST_F(skips, where_jumps_begin_they_equal_the_model) {
  const plain::sfmt start(2);
  for (const std::size_t place : {0u, 3u, 623u}) {
    plain::sfmt s = start;
    s.set_place(place);
    for (const std::size_t distance :
         {stepped - 624, stepped - place - 1, stepped - place, stepped, stepped + 1}) {
      plain::sfmt moved = s;
      moved.made.skip(distance);
      moved.at += distance;
      ASSERT_NO_FATAL_FAILURE(moved.compare_record()) << distance << " from " << place;
    }
    s.made.skip(stepped + 12345);
    s.at += stepped + 12345;
    ASSERT_NO_FATAL_FAILURE(s.draw_and_compare(2 * block));
  }
}

TEST_F(skips, of_any_state_equal_the_model) {
  support::test_data data(3);
  for (int round = 0; round < 8; ++round) {
    std::vector<std::uint32_t> state(block);
    if (round < 4)
      state[static_cast<std::size_t>(round)] = 1u << data.below(32);
    else
      for (std::uint32_t& word : state)
        word = static_cast<std::uint32_t>(data());
    plain::sfmt s(state);
    const std::size_t distance = stepped + data.below(100000);
    s.made.skip(distance);
    s.at = distance;
    ASSERT_NO_FATAL_FAILURE(s.compare_record());
  }
}

TEST_F(skips, long_ones_add_up) {
  support::test_data data(4);
  for (int round = 0; round < 10; ++round) {
    support::any_stream once(RVX_BRNG_SFMT19937, {static_cast<std::uint32_t>(round)});
    once.skip(data.below(block));
    support::any_stream twice = once;
    const std::uint64_t a = data() >> (1 + data.below(40)), b = data() >> (1 + data.below(40));
    once.skip(a + b);
    twice.skip(a);
    twice.skip(b);
    ASSERT_EQ(once.image(), twice.image()) << a << " and " << b;
    once.skip(5000);
    twice.words(5000);
    ASSERT_EQ(once.image(), twice.image());
  }
}

// The elements `distance` places on, from the terms of t^distance.
std::vector<uint128> elements_ahead(tarn_test::sfmt_model& model, const tarn_test::jump_model& jump,
                                    std::uint64_t distance, std::size_t n) {
  std::vector<uint128> sum(n);
  for (const std::size_t term : jump.terms(distance)) {
    for (std::size_t i = 0; i < n; ++i)
      sum[i] ^= model.element(term + i);
  }
  return sum;
}

TEST_F(skips, long_ones_equal_polynomial_arithmetic) {
  plain::sfmt s(5);
  const tarn_test::jump_model jump(32 * block,
                                   [&s](std::size_t i) { return (s.word(4 * i) & 1) != 0; });
  ASSERT_EQ(jump.degree(), 32 * block);
  const struct {
    std::size_t place;
    std::uint64_t distance;
  } cases[] = {
      {0, std::uint64_t{1} << 32}, {1, (std::uint64_t{1} << 63) + 2}, {623, ~std::uint64_t{0}}};
  for (const auto& c : cases) {
    const uint128 to = uint128{c.place} + c.distance;
    const auto part = static_cast<std::size_t>(to % 4);
    constexpr std::size_t n = 2 * block;
    const std::vector<uint128> elements =
        elements_ahead(s.model, jump, static_cast<std::uint64_t>(to / 4), n / 4 + 1);
    plain::sfmt moved = s;
    moved.set_place(c.place);
    moved.made.skip(c.distance);
    const std::vector<std::uint32_t> drawn = moved.made.words(n);
    for (std::size_t i = 0; i < n; ++i)
      ASSERT_EQ(drawn[i],
                static_cast<std::uint32_t>(elements[(part + i) / 4] >> 32 * ((part + i) % 4)))
          << "word " << i << " after " << c.distance << " from " << c.place;
  }
}

}  // namespace
