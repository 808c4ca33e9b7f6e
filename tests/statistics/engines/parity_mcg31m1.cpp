// SPDX-License-Identifier: Apache-2.0
// The engine mcg31m1 against its recurrence on plain numbers.
#include "any_stream.hpp"

namespace {

struct engine {
  using number = std::uint32_t;
  static constexpr std::int64_t code = RVX_BRNG_MCG31;
  static constexpr std::uint64_t modulus = 2147483647;
  static constexpr std::uint64_t order = modulus - 1;
  static constexpr number multiplier = 1132489760;
  static bool is_unit(std::uint64_t x) { return x % modulus != 0; }
  static std::uint64_t start(std::uint64_t seed) {
    return seed % modulus == 0 ? 1 : seed % modulus;
  }
};

}  // namespace

#include "multiplicative_cases.hpp"

namespace {

TEST(uniform_bits, are_refused) {
  stream s;
  const auto before = s.image();
  support::results<std::uint64_t> r(10);
  EXPECT_EQ(rvxiRngUniformBits32(0, s, 10, reinterpret_cast<std::uint32_t*>(r.data())),
            RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(rvxiRngUniformBits64(0, s, 10, r.data()), RVX_STATUS_UNSUPPORTED);
  EXPECT_TRUE(r.untouched());
  EXPECT_EQ(s.image(), before);
}

}  // namespace
