// SPDX-License-Identifier: Apache-2.0
// The integer functions: all pairs of 8-bit operands against plain wide arithmetic, and wider
// types at the ends of their ranges and at random places against 128-bit arithmetic.
#include <algorithm>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

__extension__ using wide = __int128;
__extension__ using unsigned_wide = unsigned __int128;

// 128 bits of T's signedness: these hold every product of two T and a third T added to it.
template <typename T>
using exact = std::conditional_t<std::is_signed_v<T>, wide, unsigned_wide>;

// Division rounded towards minus infinity.
wide floor_divide(wide x, wide by) {
  return x / by - (x % by != 0 && x < 0 ? 1 : 0);
}

template <typename T>
T saturated(wide x) {
  const wide lowest = std::numeric_limits<T>::min();
  const wide highest = std::numeric_limits<T>::max();
  return static_cast<T>(std::clamp(x, lowest, highest));
}

template <typename T>
void check_pair(T x, T y) {
  constexpr int bits = 8 * static_cast<int>(sizeof(T));
  const wide a = x;
  const wide b = y;
  ASSERT_EQ(sycl::add_sat(x, y), saturated<T>(a + b)) << +x << " " << +y;
  ASSERT_EQ(sycl::sub_sat(x, y), saturated<T>(a - b)) << +x << " " << +y;
  ASSERT_EQ(sycl::hadd(x, y), static_cast<T>(floor_divide(a + b, 2))) << +x << " " << +y;
  ASSERT_EQ(sycl::rhadd(x, y), static_cast<T>(floor_divide(a + b + 1, 2))) << +x << " " << +y;
  ASSERT_EQ(sycl::max(x, y), static_cast<T>(std::max(a, b)));
  ASSERT_EQ(sycl::min(x, y), static_cast<T>(std::min(a, b)));
  ASSERT_EQ(sycl::abs_diff(x, y), static_cast<T>(std::max(a, b) - std::min(a, b)));
  const T high = static_cast<T>((exact<T>(x) * exact<T>(y)) >> bits);
  ASSERT_EQ(sycl::mul_hi(x, y), high) << +x << " " << +y;
  ASSERT_EQ(sycl::mad_hi(x, y, T(3)), static_cast<T>(static_cast<wide>(high) + 3));
  const int shift = static_cast<int>(static_cast<std::make_unsigned_t<T>>(y) % bits);
  T rotated = x;
  for (int i = 0; i < shift; ++i) {
    const bool top = (rotated >> (bits - 1)) & 1;
    rotated = static_cast<T>((static_cast<std::make_unsigned_t<T>>(rotated) << 1) | top);
  }
  ASSERT_EQ(sycl::rotate(x, y), rotated) << +x << " " << +y;
}

template <typename T>
void check_one(T x) {
  constexpr int bits = 8 * static_cast<int>(sizeof(T));
  const auto value = static_cast<std::make_unsigned_t<T>>(x);
  int ones = 0;
  int leading = bits;
  int trailing = bits;
  for (int i = 0; i < bits; ++i) {
    if ((value >> i) & 1) {
      ++ones;
      leading = bits - 1 - i;
      trailing = std::min(trailing, i);
    }
  }
  ASSERT_EQ(sycl::popcount(x), static_cast<T>(ones)) << +x;
  ASSERT_EQ(sycl::clz(x), static_cast<T>(leading)) << +x;
  ASSERT_EQ(sycl::ctz(x), static_cast<T>(trailing)) << +x;
  const wide a = x;
  ASSERT_EQ(sycl::abs(x), static_cast<T>(a < 0 ? -a : a)) << +x;
}

template <typename T>
void check_triple(T x, T y, T z) {
  const exact<T> sum = exact<T>(x) * exact<T>(y) + exact<T>(z);
  const exact<T> lowest = std::numeric_limits<T>::min();
  const exact<T> highest = std::numeric_limits<T>::max();
  ASSERT_EQ(sycl::mad_sat(x, y, z), static_cast<T>(std::clamp(sum, lowest, highest)))
      << +x << " " << +y << " " << +z;
}

template <typename T>
struct IntegerOf8Bits : testing::Test {};
using types_of_8_bits = testing::Types<std::int8_t, std::uint8_t>;
TYPED_TEST_SUITE(IntegerOf8Bits, types_of_8_bits);

TYPED_TEST(IntegerOf8Bits, AllOperands) {
  using T = TypeParam;
  for (int i = 0; i < 256; ++i) {
    check_one(static_cast<T>(i));
    for (int j = 0; j < 256; ++j) {
      check_pair(static_cast<T>(i), static_cast<T>(j));
      for (int k = 0; k < 256; k += 15) {
        check_triple(static_cast<T>(i), static_cast<T>(j), static_cast<T>(k));
      }
      if (this->HasFatalFailure()) {
        return;
      }
    }
  }
}

template <typename T>
struct IntegerOfMoreBits : testing::Test {};
using wider_types = testing::Types<std::int16_t, std::uint16_t, std::int32_t, std::uint32_t,
                                   std::int64_t, std::uint64_t, long long, unsigned long long>;
TYPED_TEST_SUITE(IntegerOfMoreBits, wider_types);

TYPED_TEST(IntegerOfMoreBits, EndsOfTheRangeAndRandomPlaces) {
  using T = TypeParam;
  using limits = std::numeric_limits<T>;
  std::vector<T> places = {limits::min(),
                           static_cast<T>(limits::min() + 1),
                           T(-1),
                           T(0),
                           T(1),
                           T(2),
                           static_cast<T>(limits::max() - 1),
                           limits::max(),
                           static_cast<T>(limits::max() / 2),
                           static_cast<T>(limits::max() / 2 + 1)};
  std::uint64_t state = 42;
  for (int i = 0; i < 60; ++i) {
    state = state * 6364136223846793005U + 1442695040888963407U;
    places.push_back(static_cast<T>(state >> (i % 48)));
  }
  for (const T x : places) {
    check_one(x);
    for (const T y : places) {
      check_pair(x, y);
      for (const T z : {limits::min(), T(-1), T(0), T(5), limits::max()}) {
        check_triple(x, y, z);
      }
      if (this->HasFatalFailure()) {
        return;
      }
    }
  }
}

TEST(MathInteger, UpsampleJoinsHalves) {
  EXPECT_EQ(sycl::upsample(std::int8_t{-1}, std::uint8_t{2}), std::int16_t{-254});
  EXPECT_EQ(sycl::upsample(std::uint16_t{0x1234}, std::uint16_t{0x5678}), 0x12345678U);
  EXPECT_EQ(sycl::upsample(std::int32_t{-2}, std::uint32_t{7}), std::int64_t{-8589934585});
  const sycl::ulong2 wide_pair = sycl::upsample(sycl::uint2(1, 0), sycl::uint2(2, 3));
  EXPECT_EQ(wide_pair[0], 0x100000002U);
  EXPECT_EQ(wide_pair[1], 3U);
}

TEST(MathInteger, ProductsOf24Bits) {
  EXPECT_EQ(sycl::mul24(-1000, 2000), -2000000);
  EXPECT_EQ(sycl::mul24(0xFFFFFFU, 0xFFFFFFU), 0xFE000001U);
  EXPECT_EQ(sycl::mad24(3, 4, 5), 17);
  EXPECT_EQ(sycl::mad24(sycl::int2(1, 2), sycl::int2(3, 4), sycl::int2(5, 6))[1], 14);
}

TEST(MathInteger, VecsAndClamp) {
  const sycl::uchar4 v(250, 3, 0, 128);
  EXPECT_EQ(sycl::add_sat(v, sycl::uchar4(10))[0], 255);
  EXPECT_EQ(sycl::clz(v)[1], 6);
  EXPECT_EQ(sycl::max(v, std::uint8_t{5})[2], 5);
  EXPECT_EQ(sycl::clamp(v, std::uint8_t{4}, std::uint8_t{130})[0], 130);
  EXPECT_EQ(sycl::clamp(7, 1, 5), 5);
  EXPECT_EQ(sycl::mad_sat(v, v, v)[3], 255);
  EXPECT_EQ(sycl::rotate(v.lo(), v.odd())[0], 215);
}

}  // namespace
