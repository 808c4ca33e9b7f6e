// SPDX-License-Identifier: Apache-2.0
// The clock, and the writing of durations at the borders between units.
#include <chrono>
#include <limits>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include "tarn_serv.h"

namespace {

std::string written(double seconds) {
  char text[64];
  tarn_serv_format_seconds(text, sizeof text, seconds);
  return text;
}

TEST(CoreTime, TheClockGoesForwardInSeconds) {
  const double start = tarn_serv_dsecnd();
  std::this_thread::sleep_for(std::chrono::milliseconds(20));
  const double elapsed = tarn_serv_dsecnd() - start;
  EXPECT_GE(elapsed, 0.019);
  EXPECT_LT(elapsed, 20.0) << "not milliseconds";
  double last = tarn_serv_dsecnd();
  for (int i = 0; i < 1000; ++i) {
    const double now = tarn_serv_dsecnd();
    ASSERT_GE(now, last);
    last = now;
  }
}

TEST(CoreTime, DurationsChooseTheirUnit) {
  EXPECT_EQ(written(0.0), "N/A");
  EXPECT_EQ(written(-1.0), "N/A");
  EXPECT_EQ(written(std::numeric_limits<double>::quiet_NaN()), "N/A");
  EXPECT_EQ(written(1.5), "1.50s");
  EXPECT_EQ(written(1.0), "1000.00ms");
  EXPECT_EQ(written(0.0125), "12.50ms");
  EXPECT_EQ(written(1e-3), "1000.00us");
  EXPECT_EQ(written(2.5e-6), "2.50us");
  EXPECT_EQ(written(1e-6), "1000ns");
  EXPECT_EQ(written(42e-9), "42ns");
}

TEST(CoreTime, ShortBuffersAreCut) {
  char text[4] = {'x', 'x', 'x', 'x'};
  tarn_serv_format_seconds(text, 3, 1234.0);
  EXPECT_STREQ(text, "12");
  EXPECT_EQ(text[3], 'x');
}

}  // namespace
