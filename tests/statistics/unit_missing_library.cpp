// SPDX-License-Identifier: Apache-2.0
// A client without the statistics library: fatal at first use, with a message that says so. The
// surroundings of this program hold the core library alone.
#include <gtest/gtest.h>

#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace {

TEST(missing_library, ends_the_process_with_status_2) {
  rvx_stream stream = nullptr;
  EXPECT_EXIT(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1), testing::ExitedWithCode(2),
              "statistics library cannot be loaded");
}

TEST(missing_library, bad_arguments_are_found_without_it) {
  rvx_stream none = nullptr;
  EXPECT_EQ(rvxDeleteStream(&none), RVX_STATUS_NULL_STREAM);
  EXPECT_EQ(rvxNewStream(&none, -1, 1), RVX_STATUS_BAD_CODE);
}

int code_seen = 0;

TEST(missing_library, an_exit_hook_may_keep_the_process) {
  const auto former = tarn_serv_set_exit_hook([](int code) { code_seen = code; });
  rvx_stream stream = nullptr;
  EXPECT_EQ(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1), RVX_STATUS_NO_ENTRY);
  tarn_serv_set_exit_hook(former);
  EXPECT_EQ(code_seen, 2);
  EXPECT_EQ(stream, nullptr);
}

}  // namespace
