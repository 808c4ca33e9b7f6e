// SPDX-License-Identifier: Apache-2.0
// convert, as, bit_cast, load and store of vec.
#include <cmath>
#include <cstdint>
#include <limits>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

using mode = sycl::rounding_mode;

TEST(VecConvert, RoundsToIntegersAsAsked) {
  const sycl::float4 v(2.5F, -2.5F, 3.5F, -0.75F);
  const auto check = [](const sycl::int4& got, int x, int y, int z, int w) {
    EXPECT_EQ(got.x(), x);
    EXPECT_EQ(got.y(), y);
    EXPECT_EQ(got.z(), z);
    EXPECT_EQ(got.w(), w);
  };
  check(v.convert<int>(), 2, -2, 3, 0);
  check(v.convert<int, mode::rtz>(), 2, -2, 3, 0);
  check(v.convert<int, mode::rte>(), 2, -2, 4, -1);
  check(v.convert<int, mode::rtp>(), 3, -2, 4, 0);
  check(v.convert<int, mode::rtn>(), 2, -3, 3, -1);
}

TEST(VecConvert, RoundsToFloatingTypesAsAsked) {
  // 2^24 + 1 lies midway between two floats, and 0.1 between two others.
  const sycl::int2 odd(16777217, -16777217);
  EXPECT_EQ((odd.convert<float>()[0]), 16777216.0F);
  EXPECT_EQ((odd.convert<float, mode::rtp>()[0]), 16777218.0F);
  EXPECT_EQ((odd.convert<float, mode::rtn>()[0]), 16777216.0F);
  EXPECT_EQ((odd.convert<float, mode::rtp>()[1]), -16777216.0F);
  EXPECT_EQ((odd.convert<float, mode::rtn>()[1]), -16777218.0F);
  EXPECT_EQ((odd.convert<float, mode::rtz>()[1]), -16777216.0F);
  const sycl::double2 tenth(0.1, -0.1);
  EXPECT_LT((tenth.convert<float, mode::rtn>()[0]), 0.1);
  EXPECT_GT((tenth.convert<float, mode::rtp>()[0]), 0.1);
  EXPECT_LT((tenth.convert<float, mode::rtz>()[0]), 0.1);
  EXPECT_GT((tenth.convert<float, mode::rtz>()[1]), -0.1);
  const sycl::double2 huge(1e300, -1e300);
  EXPECT_EQ((huge.convert<float, mode::rtz>()[0]), std::numeric_limits<float>::max());
  EXPECT_EQ((huge.convert<float, mode::rtn>()[1]), -std::numeric_limits<float>::infinity());
  const sycl::vec<std::uint64_t, 2> top(~std::uint64_t{0}, 1);
  EXPECT_LT((top.convert<double, mode::rtz>()[0]), 18446744073709551616.0);
  EXPECT_EQ((top.convert<double>()[0]), 18446744073709551616.0);
}

TEST(VecConvert, ExactValuesStayInEveryMode) {
  const sycl::float2 v(4.0F, -0.5F);
  EXPECT_EQ((v.convert<double, mode::rtp>()[1]), -0.5);
  EXPECT_EQ((v.convert<double, mode::rtn>()[0]), 4.0);
  EXPECT_EQ((sycl::uchar2(200, 3).convert<std::int8_t>()[0]), -56);
}

TEST(VecBits, AsKeepsBitsAndOrder) {
  const sycl::float4 v(1.0F, -2.0F, 0.0F, 4.0F);
  const auto bits = v.as<sycl::uint4>();
  EXPECT_EQ(bits[0], 0x3F800000U);
  EXPECT_EQ(bits[1], 0xC0000000U);
  EXPECT_EQ((bits.as<sycl::float4>()[3]), 4.0F);
  EXPECT_EQ((v.lo().as<sycl::uint2>()[1]), 0xC0000000U);
  const auto bytes = sycl::uint2(0x04030201U, 0x08070605U).as<sycl::uchar8>();
  for (int i = 0; i < 8; ++i) {
    EXPECT_EQ(bytes[i], i + 1);
  }
  EXPECT_EQ(sycl::bit_cast<std::uint64_t>(1.0), 0x3FF0000000000000U);
  static_assert(sycl::bit_cast<std::uint32_t>(1.0F) == 0x3F800000U);
}

TEST(VecMemory, LoadAndStoreCountWholeVecsAndNeedNoAlignment) {
  alignas(16) float source[13];
  for (int i = 0; i < 13; ++i) {
    source[i] = static_cast<float>(i);
  }
  sycl::float4 v;
  v.load(2, source + 1);
  EXPECT_EQ(v.x(), 9.0F);
  EXPECT_EQ(v.w(), 12.0F);
  float target[12] = {};
  v.store(1, target + 1);
  EXPECT_EQ(target[4], 0.0F);
  EXPECT_EQ(target[5], 9.0F);
  EXPECT_EQ(target[8], 12.0F);
  EXPECT_EQ(target[9], 0.0F);
  sycl::float3 three;
  three.load(1, source);  // Three elements apart, although each takes the room of four.
  EXPECT_EQ(three.x(), 3.0F);
}

TEST(VecMemory, MultiPtrsOfEitherDecorationWork) {
  using space = sycl::access::address_space;
  using decorated = sycl::access::decorated;
  float memory[8] = {0, 1, 2, 3, 4, 5, 6, 7};
  const float* const read_only = memory;
  const auto raw = sycl::address_space_cast<space::global_space, decorated::no>(memory);
  const auto marked = sycl::address_space_cast<space::global_space, decorated::yes>(read_only);
  sycl::float4 v;
  v.load(1, marked);
  EXPECT_EQ(v.x(), 4.0F);
  (v + 1).store(0, raw);
  EXPECT_EQ(memory[3], 8.0F);
  v.odd().store(3, raw);
  EXPECT_EQ(memory[6], 5.0F);
  v.odd().load(0, raw);
  EXPECT_EQ(v.w(), 6.0F);
  int exponent = 0;
  const auto place = sycl::address_space_cast<space::private_space, decorated::no>(&exponent);
  EXPECT_EQ(sycl::frexp(8.0F, place), 0.5F);
  EXPECT_EQ(exponent, 4);
}

}  // namespace
