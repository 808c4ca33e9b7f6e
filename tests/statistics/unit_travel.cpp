// SPDX-License-Identifier: Apache-2.0
// What travels from the plain names to the statistics library: seed words and pieces of long
// calls. Beside a library that records them (recording_vlx.c).
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "recording_vlx.h"
#include "tarn_rvx.h"

namespace {

const recorded& record_of(rvx_stream stream) {
  return *static_cast<const recorded*>(stream);
}

std::vector<std::uint32_t> seed_of(rvx_stream stream) {
  const recorded& record = record_of(stream);
  return {record.seed, record.seed + record.words};
}

TEST(seeds, above_31_bits_travel_as_two_words) {
  using words = std::vector<std::uint32_t>;
  rvx_stream stream = nullptr;
  const auto sent = [&](std::uint64_t seed) {
    EXPECT_EQ(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, seed), 0);
    return seed_of(stream);
  };
  EXPECT_EQ(sent(0), (words{0}));
  EXPECT_EQ(sent(0x7FFFFFFF), (words{0x7FFFFFFF}));
  EXPECT_EQ(sent(0x80000000), (words{0x80000000, 0}));
  EXPECT_EQ(sent(0xFFFFFFFF), (words{0xFFFFFFFF, 0}));
  EXPECT_EQ(sent(0x123456789ABCDEF0), (words{0x9ABCDEF0, 0x12345678}));
  EXPECT_EQ(record_of(stream).code, 0x1000000u);
  const std::uint32_t list[] = {5, 6, 7};
  EXPECT_EQ(rvxNewStreamEx(&stream, RVX_BRNG_PHILOX4X32X10, 3, list), 0);
  EXPECT_EQ(seed_of(stream), (words{5, 6, 7}));
}

TEST(long_calls, come_in_pieces_until_one_fails) {
  rvx_stream stream = nullptr;
  ASSERT_EQ(rvxNewStream(&stream, RVX_BRNG_PHILOX4X32X10, 1), 0);
  std::uint32_t r = 0;  // never written: the library of this test draws nothing
  EXPECT_EQ(rvxiRngUniformBits(0, stream, std::int64_t{5} << 30, &r), 0);
  const recorded& record = record_of(stream);
  ASSERT_EQ(record.calls, 3);
  EXPECT_EQ(record.counts[0], 0x7FFFFFFF);
  EXPECT_EQ(record.counts[1], 0x7FFFFFFF);
  EXPECT_EQ(record.counts[2], 0x40000002);
  EXPECT_EQ(record.offsets[1], std::int64_t{0x7FFFFFFF} * 4);
  EXPECT_EQ(record.offsets[2], std::int64_t{0x7FFFFFFF} * 8);

  testing::internal::CaptureStderr();
  EXPECT_EQ(rvxiRngUniformBits(0, stream, 10, &r), RVX_STATUS_NO_MEMORY);
  EXPECT_NE(testing::internal::GetCapturedStderr().find("rvxiRngUniformBits"), std::string::npos)
      << "a failure of the library is reported";
}

// A word of mcg59 has 59 bits and takes two values of the results.
TEST(long_calls, pieces_of_wide_words_lie_twice_as_far_apart) {
  rvx_stream stream = nullptr;
  ASSERT_EQ(rvxNewStream(&stream, RVX_BRNG_MCG59, 1), 0);
  std::uint32_t r = 0;
  EXPECT_EQ(rvxiRngUniformBits(0, stream, (std::int64_t{1} << 31) + 1, &r), 0);
  const recorded& record = record_of(stream);
  ASSERT_EQ(record.calls, 2);
  EXPECT_EQ(record.counts[1], 2);
  EXPECT_EQ(record.offsets[1], std::int64_t{0x7FFFFFFF} * 8);
}

}  // namespace
