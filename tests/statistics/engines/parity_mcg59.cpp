// SPDX-License-Identifier: Apache-2.0
// The engine mcg59 against its recurrence on plain numbers.
#include "any_stream.hpp"

namespace {

struct engine {
  using number = std::uint64_t;
  static constexpr std::int64_t code = RVX_BRNG_MCG59;
  static constexpr std::uint64_t modulus = 576460752303423488;  // 2^59
  static constexpr std::uint64_t order = modulus / 4;
  static constexpr number multiplier = 302875106592253;  // 13^13
  static bool is_unit(std::uint64_t x) { return x % 2 == 1; }
  static std::uint64_t start(std::uint64_t seed) {
    const std::uint64_t x = seed % modulus, top = modulus / 2;
    if (x % 2 == 1)
      return x;
    return x >= top ? x - top + 1 : x + top + 1;
  }
};

}  // namespace

#include "multiplicative_cases.hpp"

namespace {

TEST_F(words, have_two_parts_low_one_first) {
  stream s{7};
  model m{s.x(), s.a()};
  const std::vector<std::uint32_t> parts_of = s.words(200, 2);
  for (std::size_t i = 0; i < 200; ++i) {
    const std::uint64_t word = m.next();
    ASSERT_EQ(parts_of[2 * i], word % 0x100000000);
    ASSERT_EQ(parts_of[2 * i + 1], word / 0x100000000);
  }
}

// 32 bits are the highest of a word; 64 bits are those of two words, the first one in the low half.
TEST_F(words, uniform_bits_are_the_bits_from_27_on) {
  for (const std::int64_t stride : {1, 2, 7, 1000}) {
    for (const std::size_t n : {1u, 2u, 17u, 300u, 1025u, 5000u, 140'000u}) {
      stream s{12345};
      ASSERT_EQ(s.leapfrog(stride - 1, stride), 0);
      model m{s.x(), s.a()};
      const auto count = static_cast<std::int64_t>(n);
      support::results<std::uint32_t> narrow(n);
      ASSERT_EQ(rvxiRngUniformBits32(0, s, count, narrow.data()), 0);
      for (std::size_t i = 0; i < n; ++i)
        ASSERT_EQ(narrow[i], m.next() >> 27);
      ASSERT_TRUE(narrow.guards_intact());
      ASSERT_TRUE(s.stands_at(m));

      support::results<std::uint64_t> wide(n);
      ASSERT_EQ(rvxiRngUniformBits64(0, s, count, wide.data()), 0);
      for (std::size_t i = 0; i < n; ++i) {
        const std::uint64_t low = m.next() >> 27;
        ASSERT_EQ(wide[i], m.next() >> 27 << 32 | low);
      }
      ASSERT_TRUE(wide.guards_intact());
      ASSERT_TRUE(s.stands_at(m));
    }
  }
}

}  // namespace
