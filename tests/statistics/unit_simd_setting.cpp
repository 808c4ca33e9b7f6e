// SPDX-License-Identifier: Apache-2.0
// An unknown TARN_SIMD_TARGET, set in this program's environment, is reported once and ignored.
#include "support.hpp"

namespace {

TEST(simd_setting, an_unknown_target_is_reported_once_and_ignored) {
  EXPECT_STREQ(__rvxGetSimdTarget(), "");
  support::stream s;
  std::uint32_t words[8];
  testing::internal::CaptureStderr();
  ASSERT_EQ(rvxiRngUniformBits(0, s, 8, words), 0);
  ASSERT_EQ(rvxiRngUniformBits(0, s, 8, words), 0);
  float reals[8];
  ASSERT_EQ(rvxsRngUniform(0, s, 8, reals, 0, 1), 0);
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "TARN WARNING: TARN_SIMD_TARGET=NO_SUCH is not a target of this processor and is "
            "ignored\n");
  EXPECT_STRNE(__rvxGetSimdTarget(), "");
  EXPECT_STRNE(__rvxGetSimdTarget(), "NO_SUCH");
}

}  // namespace
