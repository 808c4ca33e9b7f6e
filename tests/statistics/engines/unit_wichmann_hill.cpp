// SPDX-License-Identifier: Apache-2.0
// The table of wichmann_hill from first principles, the seeding, and states that are refused.
#include <set>

#include "wichmann_hill_stream.hpp"

namespace {

using support::wichmann_hill_stream;
using four = wichmann_hill_stream::four;

constexpr std::size_t members = 273;

bool is_prime(std::uint32_t n) {
  for (std::uint32_t d = 2; d * d <= n; ++d) {
    if (n % d == 0)
      return false;
  }
  return n > 1;
}

std::uint64_t power(std::uint64_t a, std::uint32_t exponent, std::uint32_t p) {
  std::uint64_t result = 1;
  for (std::uint32_t bit = std::uint32_t{1} << 31; bit != 0; bit >>= 1) {
    result = result * result % p;
    if ((exponent & bit) != 0)
      result = result * a % p;
  }
  return result;
}

// For a safe prime p the order of a divides p - 1 = 2 q and is that unless it divides 2 or q.
bool is_primitive_root(std::uint32_t a, std::uint32_t p) {
  return power(a, 2, p) != 1 && power(a, (p - 1) / 2, p) != 1;
}

TEST(table, has_the_largest_primes_that_will_do_in_descending_order) {
  ASSERT_EQ(plain::wichmann_hill_members, members);
  std::uint32_t next = (std::uint32_t{1} << 24) - 1;
  const auto will_do = [](std::uint32_t p) {
    if (p % 4 != 3 || !is_prime(p) || !is_prime((p - 1) / 2))
      return false;
    int roots = 0;
    for (std::uint32_t a = 112; a <= 127; ++a)
      roots += is_primitive_root(a, p) ? 1 : 0;
    return roots >= 4;
  };
  for (const auto& row : plain::wichmann_hill_rows) {
    for (const std::uint32_t p : row.p) {
      while (!will_do(next))
        --next;
      ASSERT_EQ(p, next--);
    }
  }
}

// The primes descend strictly, so all of them differ; here what else a row has to be.
TEST(table, has_different_primitive_roots_in_each_row) {
  for (const auto& row : plain::wichmann_hill_rows) {
    EXPECT_EQ(std::set<std::uint32_t>(row.a, row.a + 4).size(), 4u) << row.p[0];
    for (std::size_t j = 0; j < 4; ++j) {
      EXPECT_GE(row.a[j], 112u);
      EXPECT_LE(row.a[j], 127u);
      EXPECT_TRUE(is_primitive_root(row.a[j], row.p[j])) << row.a[j] << " modulo " << row.p[j];
    }
  }
}

TEST(seeding, words_fill_the_components_and_missing_ones_are_1) {
  const std::vector<std::uint32_t> given = {11, 0xFFFFFFFF, 13, 0x80000000, 15};
  for (std::size_t n = 0; n <= given.size(); ++n) {
    const wichmann_hill_stream s(9,
                                 {given.begin(), given.begin() + static_cast<std::ptrdiff_t>(n)});
    const auto& row = plain::wichmann_hill_rows[9];
    for (std::size_t j = 0; j < 4; ++j) {
      EXPECT_EQ(s.state()[j], j < n ? given[j] % row.p[j] : 1) << "word " << j << " of " << n;
      EXPECT_EQ(s.multiplier()[j], row.a[j]);
    }
    EXPECT_EQ(s.at<std::uint32_t>(s.member_at), 9u);
    EXPECT_EQ(s.image().size(), wichmann_hill_stream::length);
  }
}

TEST(seeding, no_component_becomes_0) {
  const std::uint32_t* p = plain::wichmann_hill_rows[0].p;
  EXPECT_EQ(wichmann_hill_stream(0, {0, p[1], 2 * p[2], p[3] + 1}).state(), (four{1, 1, 1, 1}));
}

TEST(members, others_than_273_are_unknown) {
  rvx_stream none = nullptr;
  testing::internal::CaptureStderr();
  EXPECT_EQ(rvxNewStream(&none, RVX_BRNG_WH + 273, 1), RVX_STATUS_BAD_CODE);
  testing::internal::GetCapturedStderr();
  EXPECT_EQ(none, nullptr);
}

void expect_refused(wichmann_hill_stream& s) {
  std::uint32_t untouched = 0xA5A5A5A5;
  EXPECT_EQ(rvxiRngUniformBits(0, s, 1, &untouched), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(rvxSkipAheadStream(s, 1), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(rvxLeapfrogStream(s, 0, 2), RVX_STATUS_BAD_MARK);
  EXPECT_EQ(untouched, 0xA5A5A5A5);
}

TEST(refusal, no_residue_is_0_or_beyond_its_prime) {
  constexpr std::uint32_t member = 31;
  for (std::size_t j = 0; j < 4; ++j) {
    const std::uint32_t p = plain::wichmann_hill_rows[member].p[j];
    for (const std::uint32_t bad : {0u, p, p + 1, 0xFFFFFFFFu}) {
      wichmann_hill_stream state(member), multiplier(member);
      state.set(state.state_at + 4 * j, bad);
      expect_refused(state);
      multiplier.set(multiplier.multiplier_at + 4 * j, bad);
      expect_refused(multiplier);
    }
  }
}

TEST(refusal, a_member_has_its_own_code) {
  for (const std::uint32_t bad : {0u, 30u, 32u, 273u, 0xFFFFFFFFu}) {
    wichmann_hill_stream s(31);
    s.set(s.member_at, bad);
    expect_refused(s);
  }
}

}  // namespace
