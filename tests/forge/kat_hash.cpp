// SPDX-License-Identifier: Apache-2.0
// The checksum of device binaries: values worked out apart from the library (integers without
// width, once in Python and once in a shell, agreeing), and the model over longer data.
#include <cstddef>
#include <cstdint>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "binary_hash.hpp"

namespace {

using kestrel::tarn::forge::binary_hash;
using tarn_test::byte_vector;

struct answer {
  std::size_t length;
  std::uint32_t rising;  // of the bytes 0x11, 0x22, 0x33, ...
  std::uint32_t high;    // of the bytes 0xF0, 0xF1, 0xF2, ...
};

constexpr answer answers[] = {
    {0, 0xB5C0FBCF, 0xB5C0FBCF}, {1, 0xA1858C3E, 0xC164F76B}, {2, 0x91DD7BDF, 0x45C377F5},
    {3, 0x0BEFDFC9, 0x5B4A4256}, {4, 0xF16DBF6C, 0x22E557B9}, {5, 0xD4D66557, 0x049817FE},
    {6, 0x5BE57CA1, 0x99F3CFD0}, {7, 0x65DBE118, 0xDE4CBC7A}, {8, 0x718389F7, 0xEC225256},
    {9, 0x43DEC008, 0xE9F25F5F},
};

TEST(BinaryHash, ShortData) {
  for (const answer& each : answers) {
    byte_vector rising(each.length);
    for (std::size_t i = 0; i < each.length; ++i) {
      rising[i] = static_cast<std::uint8_t>(0x11 * (i + 1));
    }
    EXPECT_EQ(binary_hash(rising.data(), rising.size()), each.rising) << each.length;
    const byte_vector high = tarn_test::counting(each.length, 0xF0);
    EXPECT_EQ(binary_hash(high.data(), high.size()), each.high) << each.length;
  }
}

TEST(BinaryHash, ZerosCount) {
  const byte_vector zeros(4);
  EXPECT_EQ(binary_hash(zeros.data(), 4), 0xDC12D2FF);
  EXPECT_EQ(binary_hash(zeros.data(), 3), 0x57FBE621);
  EXPECT_EQ(binary_hash(nullptr, 0), 0xB5C0FBCF);
}

TEST(BinaryHash, EveryLengthAndAlignmentAsTheModel) {
  const byte_vector bytes = tarn_test::counting(300, 0x35);
  for (std::size_t begin = 0; begin < 4; ++begin) {
    for (std::size_t length = 0; length + begin < bytes.size(); ++length) {
      const byte_vector part = tarn_test::cut(bytes, begin, begin + length);
      ASSERT_EQ(binary_hash(&bytes[begin], length), tarn_test::model_hash(part))
          << begin << " " << length;
    }
  }
}

}  // namespace
