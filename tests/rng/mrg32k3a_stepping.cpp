// SPDX-License-Identifier: Apache-2.0
// The kernel-side stepping of mrg32k3a by itself: against the recurrence and its jumps in plain
// division, and the tables of powers from first principles.
#include <cmath>
#include <cstdint>
#include <cstring>
#include <random>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "engines/mrg32k3a.hpp"
#include "kat/kat_file.hpp"
#include "models/mrg32k3a_model.hpp"

namespace {

namespace detail = kestrel::tarn::rng::detail;
using plain_mrg::model;
using record = detail::tag_rvx_sycl_brng_mrg32k3a_stream_t;

record record_of(const model& place) {
  record state;
  std::memcpy(&state, &place, sizeof state);
  return state;
}

model place_of(const record& state) {
  model place{};
  std::memcpy(&place, &state, sizeof place);
  return place;
}

/// States at the ends of the ranges, then random ones.
std::vector<model> states(int random_ones) {
  constexpr auto x = static_cast<std::uint32_t>(plain_mrg::m1 - 1);
  constexpr auto y = static_cast<std::uint32_t>(plain_mrg::m2 - 1);
  std::vector<model> all = {{{x, x, x}, {y, y, y}}, {{0, x, 0}, {0, 0, y}}, {{x, 0, 0}, {y, 0, 0}},
                            {{0, 0, 1}, {0, 0, 1}}, {{1, 0, 0}, {1, 0, 0}}, {{0, x, x}, {0, y, y}}};
  std::mt19937_64 random(1);
  const auto below = [&](std::int64_t m) {
    return static_cast<std::uint32_t>(random() % static_cast<std::uint64_t>(m));
  };
  for (int i = 0; i < random_ones; ++i) {
    all.push_back({{below(plain_mrg::m1), below(plain_mrg::m1), below(plain_mrg::m1)},
                   {below(plain_mrg::m2), below(plain_mrg::m2), below(plain_mrg::m2)}});
  }
  return all;
}

TEST(mrg32k3a_step, is_the_recurrence) {
  for (model plain : states(2000)) {
    record state = record_of(plain);
    for (int i = 0; i < 20; ++i) {
      ASSERT_EQ(detail::mrg32k3a_step(&state), plain.next());
      ASSERT_TRUE(place_of(state) == plain);
    }
  }
}

// y(n) = 527612 gives the word of x(n) = 527612, as s[1] = k solves 1403580 k = 527612 mod m1.
TEST(mrg32k3a_step, of_equal_values_gives_the_modulus_and_not_zero) {
  const plain_mrg::cpp_int inverse =
      powm(plain_mrg::cpp_int(1403580), plain_mrg::cpp_int(plain_mrg::m1 - 2),
           plain_mrg::cpp_int(plain_mrg::m1));
  const auto k = static_cast<std::uint32_t>(inverse * 527612 % plain_mrg::m1);
  record state{{0, k, 0, 0, 0, 1}};
  EXPECT_EQ(detail::mrg32k3a_step(&state), 4294967087u);
  EXPECT_EQ(state.s[2], 527612u);
  EXPECT_EQ(state.s[5], 527612u);
}

TEST(mrg32k3a_skip, is_a_jump_in_plain_division) {
  std::vector<std::int64_t> distances = {0,
                                         1,
                                         7,
                                         8,
                                         9,
                                         63,
                                         64,
                                         65,
                                         511,
                                         std::int64_t{1} << 32,
                                         100,
                                         512,
                                         4095,
                                         32000000,
                                         std::int64_t{1} << 62,
                                         (std::int64_t{1} << 62) - 1,
                                         INT64_MAX};
  std::mt19937_64 random(2);
  for (int bits = 1; bits < 64; bits += 3) {
    distances.push_back(static_cast<std::int64_t>(random() >> bits));
  }
  for (const model& start : states(6)) {
    for (const std::int64_t n : distances) {
      record state = record_of(start);
      detail::mrg32k3a_skip(&state, n);
      model plain = start;
      plain.skip(n);
      ASSERT_TRUE(place_of(state) == plain) << n;
    }
  }
}

void expect_square(const std::uint32_t (&table)[3][3], const plain_mrg::square& plain) {
  for (std::size_t i = 0; i < 3; ++i) {
    for (std::size_t j = 0; j < 3; ++j) {
      ASSERT_EQ(table[i][j], plain[i][j]) << i << ", " << j;
    }
  }
}

void expect_power(const detail::mrg32k3a_power& table, const plain_mrg::cpp_int& exponent) {
  expect_square(table.x, plain_mrg::power(plain_mrg::x_step, exponent, plain_mrg::m1));
  expect_square(table.y, plain_mrg::power(plain_mrg::y_step, exponent, plain_mrg::m2));
}

TEST(mrg32k3a_powers, of_digits_in_base_8) {
  for (int level = 0; level < 21; ++level) {
    for (int digit = 1; digit < 8; ++digit) {
      SCOPED_TRACE(std::to_string(digit) + " at level " + std::to_string(level));
      expect_power(detail::mrg32k3a_octal_power(level, digit), plain_mrg::cpp_int(digit)
                                                                   << 3 * level);
    }
  }
}

TEST(mrg32k3a_powers, telling_rows) {
  expect_square(detail::mrg32k3a_octal_power(0, 2).x,
                {{{0, 0, 1}, {4294156359, 1403580, 0}, {0, 4294156359, 1403580}}});
  const auto& eighth = detail::mrg32k3a_octal_power(1, 1).x;
  EXPECT_EQ(eighth[0][0], 1527363550u);
  EXPECT_EQ(eighth[0][1], 2758233149u);
  EXPECT_EQ(eighth[0][2], 1831234280u);
}

// The published matrices, row by row.
TEST(mrg32k3a_powers, of_the_sub_sequence_distance) {
  const detail::mrg32k3a_power& jump = detail::mrg32k3a_sub_sequence_jump;
  expect_power(jump, plain_mrg::cpp_int(1) << 76);
  int published = 0;
  for (const tarn::kat::line& line : tarn::kat::read_file(TARN_KAT_FOLDER, "mrg32k3a")) {
    if (line.fields.at(0) == "matrix" && line.fields.at(1).substr(2) == "^(2^76)") {
      ++published;
      const std::vector<std::uint32_t> known = tarn::kat::answers(line, 3, 10);
      ASSERT_EQ(known.size(), 9u);
      const auto& table = line.fields[1][1] == '1' ? jump.x : jump.y;
      EXPECT_EQ(std::memcmp(table, known.data(), sizeof table), 0) << line.fields[1];
    }
  }
  EXPECT_EQ(published, 2);
}

TEST(mrg32k3a_rule, is_one_multiply_add_of_the_word) {
  using traits = detail::engine_traits<kestrel::tarn::rng::mrg32k3a>;
  namespace gpu = detail::gpu;
  const detail::word_rule<float> single = traits::rule(gpu::real_range<float>{-0.5f, 2.5f});
  EXPECT_EQ(single.a, 3.0f / 4294967040.0f);
  EXPECT_EQ(single.b, -0.5f);
  const detail::word_rule<double> twice = traits::rule(gpu::real_range<double>{-0.5, 2.5});
  EXPECT_EQ(twice.a, 3.0 / 4294967087.0);
  EXPECT_EQ(twice.b, -0.5);
  for (const std::uint32_t word :
       {1u, 12345u, 0x7FFFFFFFu, 0x80000000u, 4294967086u, 4294967087u}) {
    EXPECT_EQ(detail::unsigned_word(word, single),
              std::fma(static_cast<float>(word), single.a, -0.5f));
    EXPECT_EQ(detail::unsigned_word(word, twice),
              std::fma(static_cast<double>(word), twice.a, -0.5));
    EXPECT_EQ(detail::unsigned_word(word, detail::word_rule<std::uint32_t>{0, 0}), word);
  }
}

// The greatest word and the divisor are the same float, so that the rounding of the scale shows.
TEST(mrg32k3a_rule, may_carry_a_float_beyond_the_upper_bound) {
  using traits = detail::engine_traits<kestrel::tarn::rng::mrg32k3a>;
  const auto unit = traits::rule(detail::gpu::real_range<float>{0.0f, 1.0f});
  EXPECT_EQ(detail::unsigned_word(4294967087u, unit), 1.0f);
  const auto range = traits::rule(detail::gpu::real_range<float>{-0.5f, 0.7f});
  EXPECT_EQ(detail::unsigned_word(4294967087u, range), 0.7f + 0x1p-23f);
}

}  // namespace
