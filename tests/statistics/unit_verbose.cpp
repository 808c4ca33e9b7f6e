// SPDX-License-Identifier: Apache-2.0
// Verbose lines of the stream services, and the texts for engines.
#include <cstdio>
#include <string>

#include <gtest/gtest.h>

#include "stream_verbose.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace {

std::string output_of(void (*work)()) {
  testing::internal::CaptureStdout();
  work();
  std::fflush(stdout);
  return testing::internal::GetCapturedStdout();
}

rvx_stream stream = nullptr;

std::string pointer(const void* p) {
  char text[32];
  std::snprintf(text, sizeof text, "%p", p);
  return text;
}

TEST(verbose, lines_name_the_call) {
  *tarn_serv_verbose_mode() = 1;
  const std::string made =
      output_of([] { ASSERT_EQ(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1), 0); });
  const std::string where = pointer(stream);
  EXPECT_NE(made.find("TARN_VERBOSE rvxNewStream(" + where + ",RVX_BRNG_PHILOX4X32X10) "),
            std::string::npos)
      << made;
  const std::string skipped = output_of([] { rvxSkipAheadStream(stream, 12345678901); });
  EXPECT_EQ(skipped.rfind("TARN_VERBOSE rvxSkipAheadStream(" + where + ",12345678901) ", 0), 0u)
      << skipped;
  const std::string deleted = output_of([] { rvxDeleteStream(&stream); });
  EXPECT_EQ(deleted.rfind("TARN_VERBOSE rvxDeleteStream(" + where + ") ", 0), 0u) << deleted;

  *tarn_serv_verbose_mode() = 0;
  EXPECT_EQ(output_of([] {
              rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1);
              rvxSkipAheadStream(stream, 1);
              rvxDeleteStream(&stream);
            }),
            "");
}

TEST(verbose, engine_texts) {
  char text[tarn::rvx::engine_text_bytes];
  const auto of = [&](std::int64_t code) {
    return std::string(tarn::rvx::engine_text(code, text));
  };
  EXPECT_EQ(of(0x100000), "RVX_BRNG_MCG31");
  EXPECT_EQ(of(0x1000000), "RVX_BRNG_PHILOX4X32X10");
  EXPECT_EQ(of(0x500007), "RVX_BRNG_WH_substream7");
  EXPECT_EQ(of(0x900000), "RVX_BRNG_MT2203_substream0");
  EXPECT_EQ(of(0x9003FF), "RVX_BRNG_MT2203_substream1023");
  EXPECT_EQ(of(0x1000001), "Unknown engine");
  EXPECT_EQ(of(0xA00000), "Unknown engine");
  EXPECT_EQ(of(0), "Unknown engine");
}

}  // namespace
