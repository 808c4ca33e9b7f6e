// SPDX-License-Identifier: Apache-2.0
// The warning of calls that do not come to an end.
#include "frame/pass_count.hpp"

#include <cstdio>
#include <string>
#include <tarn_serv.h>

#include <gtest/gtest.h>

namespace {

using kestrel::tarn::rng::detail::pass_count;

/// What is printed while a call makes `passes` passes at a level of verbose mode.
std::string printed_by(int passes, int level) {
  *tarn_serv_verbose_mode() = level;
  testing::internal::CaptureStdout();
  testing::internal::CaptureStderr();
  pass_count count;
  for (int i = 0; i < passes; ++i) {
    count.next();
  }
  std::fflush(nullptr);
  *tarn_serv_verbose_mode() = 0;
  return testing::internal::GetCapturedStdout() + testing::internal::GetCapturedStderr();
}

TEST(pass_count, warns_once_behind_ten_thousand_passes) {
  const std::string warning =
      "TARN_VERBOSE WARNING: more than 10000 passes of rejection in one call\n";
  for (const int level : {1, 2}) {
    EXPECT_EQ(printed_by(10000, level), "");
    EXPECT_EQ(printed_by(10001, level), warning);
    EXPECT_EQ(printed_by(30000, level), warning);
  }
}

TEST(pass_count, is_silent_outside_verbose_mode) {
  EXPECT_EQ(printed_by(10001, 0), "");
}

}  // namespace
