// SPDX-License-Identifier: Apache-2.0
// Every generation and family against the table of architectures.
#include "architecture.hpp"

#include <limits>

#include <gtest/gtest.h>

namespace {

using namespace kestrel::tarn::gpu;
namespace forge = kestrel::tarn::forge;

architecture of(int hw, int family, std::uint32_t stepping = 0) {
  return architecture_of({static_cast<forge::hw_code>(hw), family, stepping});
}

TEST(Architecture, OfEachGeneration) {
  constexpr int expected[] = {0, 1, 0, 2, 3, 4, 5, 6, 7};
  for (int hw = 0; hw <= 8; ++hw) {
    for (int family = 0; family <= 14; ++family) {
      EXPECT_EQ(of(hw, family).arch, expected[hw]) << hw << " " << family;
    }
  }
}

TEST(Architecture, TheFirstFlagIsThatOfTheGenerationSaveForTwoFamiliesOfOne) {
  constexpr std::uint32_t expected[] = {0, 1, 0, 0, 0, 1, 1, 1, 1};
  for (int hw = 0; hw <= 8; ++hw) {
    for (int family = 0; family <= 14; ++family) {
      const bool excepted = hw == 6 && (family == 0 || family == 7);
      EXPECT_EQ(of(hw, family).flags & 1U, excepted ? 0 : expected[hw]) << hw << " " << family;
    }
  }
}

TEST(Architecture, TheSecondFlagIsThatOfTheFamilyWhateverTheGeneration) {
  constexpr bool expected[] = {false, false, false, false, false, true, true, true,
                               false, true,  true,  true,  false, true, true};
  for (int hw = 0; hw <= 8; ++hw) {
    for (int family = 0; family <= 14; ++family) {
      EXPECT_EQ((of(hw, family).flags & 2U) != 0, expected[family]) << hw << " " << family;
      EXPECT_EQ(of(hw, family).flags & ~3U, 0U);
    }
  }
}

TEST(Architecture, OfNumbersThatAreNoGeneration) {
  for (const int hw :
       {-1, 9, 100, std::numeric_limits<int>::min(), std::numeric_limits<int>::max()}) {
    EXPECT_EQ(of(hw, 0).arch, 0) << hw;
    EXPECT_EQ(of(hw, 0).flags, 0U) << hw;
  }
}

TEST(Architecture, TheSteppingPassesUnchanged) {
  for (const std::uint32_t stepping : {0U, 1U, 63U, 64U, 0xFFFFFFFFU}) {
    EXPECT_EQ(of(2, 2, stepping).stepping, stepping);
    EXPECT_EQ(of(8, 14, stepping).stepping, stepping);
  }
}

}  // namespace
