// SPDX-License-Identifier: Apache-2.0
// Alignment, zeroing, growing and refusals of the memory services.
#include <cstddef>
#include <cstdint>
#include <cstring>

#include <gtest/gtest.h>

#include "tarn_serv.h"

namespace {

bool is_aligned(const void* block, std::size_t alignment) {
  return reinterpret_cast<std::uintptr_t>(block) % alignment == 0;
}

TEST(CoreMemory, EveryAlignmentIsMet) {
  for (std::size_t alignment = 1; alignment <= (1U << 20); alignment *= 2) {
    void* const block = tarn_serv_malloc(100, alignment);
    ASSERT_NE(block, nullptr) << alignment;
    EXPECT_TRUE(is_aligned(block, alignment)) << alignment;
    std::memset(block, 1, 100);
    tarn_serv_free(block);
  }
}

TEST(CoreMemory, BadAlignmentsAreRefused) {
  for (const std::size_t alignment :
       {std::size_t{0}, std::size_t{3}, std::size_t{48}, SIZE_MAX, SIZE_MAX / 2 + 1}) {
    EXPECT_EQ(tarn_serv_malloc(8, alignment), nullptr) << alignment;
    EXPECT_EQ(tarn_serv_calloc(1, 8, alignment), nullptr) << alignment;
    EXPECT_EQ(tarn_serv_realloc(nullptr, 8, alignment), nullptr) << alignment;
  }
}

TEST(CoreMemory, OverflowingSizesAreRefused) {
  EXPECT_EQ(tarn_serv_malloc(SIZE_MAX, 64), nullptr);
  EXPECT_EQ(tarn_serv_malloc(SIZE_MAX - 63, 64), nullptr);
  EXPECT_EQ(tarn_serv_calloc(SIZE_MAX / 2, 3, 64), nullptr);
  EXPECT_EQ(tarn_serv_calloc(std::size_t{1} << 32, std::size_t{1} << 32, 8), nullptr);
}

TEST(CoreMemory, CallocGivesZeros) {
  // A dirty block of the same size goes back first, so that zeros are not there by luck.
  void* const dirty = tarn_serv_malloc(1021 * 8, 128);
  std::memset(dirty, 0xA5, 1021 * 8);
  tarn_serv_free(dirty);
  auto* const block = static_cast<unsigned char*>(tarn_serv_calloc(1021, 8, 128));
  ASSERT_NE(block, nullptr);
  EXPECT_TRUE(is_aligned(block, 128));
  for (int i = 0; i < 1021 * 8; ++i) {
    ASSERT_EQ(block[i], 0);
  }
  tarn_serv_free(block);
}

TEST(CoreMemory, ReallocKeepsContentsAndAlignment) {
  for (const std::size_t alignment : {std::size_t{1}, std::size_t{16}, std::size_t{4096}}) {
    auto* block = static_cast<unsigned char*>(tarn_serv_malloc(10, alignment));
    ASSERT_NE(block, nullptr);
    for (unsigned char i = 0; i < 10; ++i) {
      block[i] = i;
    }
    for (const std::size_t size : {std::size_t{100}, std::size_t{100000}, std::size_t{5}}) {
      block = static_cast<unsigned char*>(tarn_serv_realloc(block, size, alignment));
      ASSERT_NE(block, nullptr);
      EXPECT_TRUE(is_aligned(block, alignment));
      for (unsigned char i = 0; i < 5; ++i) {
        ASSERT_EQ(block[i], i);
      }
    }
    EXPECT_EQ(tarn_serv_realloc(block, SIZE_MAX, alignment), nullptr);
    EXPECT_EQ(block[4], 4) << "a refused block is still the caller's";
    tarn_serv_free(block);
  }
}

TEST(CoreMemory, SizeZeroIsAValidBlock) {
  void* const block = tarn_serv_malloc(0, 32);
  EXPECT_NE(block, nullptr);
  tarn_serv_free(block);
  tarn_serv_free(nullptr);
}

}  // namespace
