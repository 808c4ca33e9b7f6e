// SPDX-License-Identifier: Apache-2.0
// The tables of device generations, at both ends of every range and just outside.
#include <cstdint>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "hw_codes.hpp"

namespace {

using namespace kestrel::tarn::forge;

TEST(HwCodes, Numbers) {
  EXPECT_EQ(hw_unknown, 0);
  EXPECT_EQ(hw_fir, 1);
  EXPECT_EQ(hw_unserved, 2);
  EXPECT_EQ(hw_elm, 3);
  EXPECT_EQ(hw_ash, 4);
  EXPECT_EQ(hw_oak, 5);
  EXPECT_EQ(hw_yew, 6);
  EXPECT_EQ(hw_pine, 7);
  EXPECT_EQ(hw_larch, 8);
}

TEST(HwCodes, DefaultFamilies) {
  const int expected[] = {0, 1, 2, 3, 4, 5, 6, 10, 14};
  for (int hw = 0; hw <= 8; ++hw) {
    EXPECT_EQ(default_family(static_cast<hw_code>(hw)), expected[hw]) << hw;
  }
}

TEST(HwCodes, GenerationsOfFamilies) {
  const int expected[] = {0, 1, 2, 3, 4, 5, 6, 6, 6, 6, 7, 7, 7, 7, 8, 8};
  for (int family = 0; family <= 15; ++family) {
    EXPECT_EQ(hw_of_family(family), expected[family]) << family;
  }
  EXPECT_EQ(hw_of_family(-1), hw_unknown);
}

TEST(HwCodes, CoreFamilies) {
  const std::pair<std::uint32_t, int> known[] = {{12, 1},   {13, 2},   {14, 2},  {15, 3},
                                                 {16, 3},   {17, 5},   {18, 4},  {3077, 5},
                                                 {3079, 6}, {3080, 7}, {3081, 8}};
  for (const auto& [number, hw] : known) {
    EXPECT_EQ(hw_of_core_family(number), hw) << number;
  }
  for (const std::uint32_t number : {0U, 11U, 19U, 3076U, 3078U, 3082U, 0xFFFFFFFFU}) {
    EXPECT_EQ(hw_of_core_family(number), hw_unknown) << number;
  }
}

TEST(HwCodes, CoreFamiliesForWriting) {
  const std::uint32_t expected[] = {0, 12, 0, 16, 18, 0, 3079, 3080, 3081};
  for (int hw = 0; hw <= 8; ++hw) {
    EXPECT_EQ(core_family_of_hw(static_cast<hw_code>(hw)), expected[hw]) << hw;
  }
}

TEST(HwCodes, Products) {
  struct range {
    std::uint32_t first, last;
    int family;
  };
  const range ranges[] = {{0, 17, 0},       {18, 25, 1},      {26, 27, 2},      {28, 32, 3},
                          {33, 1210, 4},    {1211, 1249, 0},  {1250, 1250, 5},  {1251, 1269, 0},
                          {1270, 1270, 7},  {1271, 1271, 11}, {1272, 1272, 8},  {1273, 1273, 9},
                          {1274, 1276, 14}, {1277, 1279, 0},  {1280, 1280, 13}, {1281, 0xFFFF, 0}};
  for (const range& each : ranges) {
    for (std::uint32_t number = each.first; number <= each.last; ++number) {
      ASSERT_EQ(family_of_product(number), each.family) << number;
    }
  }
  EXPECT_EQ(family_of_product(0xFFFFFFFF), 0);
}

/// What the version tables say of major 12, release by release.
std::pair<int, int> expected_of_12(std::uint32_t release) {
  if (release < 11) {
    return {4, 4};
  }
  if (release >= 51 && release <= 59) {
    return {6, 7};
  }
  switch (release) {
    case 50:
      return {5, 5};
    case 60:
      return {7, 11};
    case 61:
      return {7, 12};
    case 65:
      return {7, 13};
    case 70:
    case 71:
      return {6, 8};
    case 73:
    case 74:
      return {6, 9};
    default:
      return {0, 0};
  }
}

TEST(HwCodes, IpVersions) {
  for (std::uint32_t major = 0; major < 1024; ++major) {
    for (std::uint32_t release = 0; release < 256; ++release) {
      const std::pair<int, int> expected = major == 9    ? std::pair{1, 1}
                                           : major == 11 ? std::pair{3, 3}
                                           : major == 12 ? expected_of_12(release)
                                           : major == 20 ? std::pair{8, 14}
                                                         : std::pair{0, 0};
      // Bits 6 to 13 mean nothing here.
      const detected_hw found = hw_of_ip_version(major << 22 | release << 14 | 0x2AU << 6 | 37U);
      ASSERT_EQ(std::pair(static_cast<int>(found.hw), found.family), expected)
          << major << " " << release;
      ASSERT_EQ(found.stepping, expected.first != 0 ? 37U : 0U) << major << " " << release;
    }
  }
}

TEST(HwCodes, TheMissingCodeComesFromTheOther) {
  const detected_hw from_family = with_missing_code({hw_unknown, 8, 3});
  EXPECT_EQ(from_family.hw, hw_yew);
  EXPECT_EQ(from_family.family, 8);
  EXPECT_EQ(from_family.stepping, 3U);
  EXPECT_EQ(with_missing_code({hw_pine, 0, 0}).family, 10);
  const detected_hw both = with_missing_code({hw_oak, 8, 0});
  EXPECT_EQ(both.hw, hw_oak);
  EXPECT_EQ(both.family, 8);
  EXPECT_EQ(with_missing_code({}).hw, hw_unknown);
  EXPECT_EQ(with_missing_code({}).family, 0);
}

}  // namespace
