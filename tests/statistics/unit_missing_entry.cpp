// SPDX-License-Identifier: Apache-2.0
// A client beside a statistics library that lacks an entry: what is there works, the first use of
// what is not there is fatal and names it.
#include <gtest/gtest.h>

#include "tarn_rvx.h"

namespace {

TEST(missing_entry, ends_the_process_with_status_2_and_names_the_entry) {
  rvx_stream stream = nullptr;
  ASSERT_EQ(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1), 0);
  ASSERT_NE(stream, nullptr);
  EXPECT_EQ(rvxGetStreamSize(stream), 4711) << "not the library of this test";
  EXPECT_EXIT(rvxSkipAheadStream(stream, 1), testing::ExitedWithCode(2),
              "no entry named __rvxSkipAheadStream\n");
  float r = 7;
  EXPECT_EXIT(rvxsRngUniform(0, stream, 1, &r, 0, 1), testing::ExitedWithCode(2),
              "no entry named _rvxsRngUniform\n");
}

}  // namespace
