// SPDX-License-Identifier: Apache-2.0
// The relational functions, with NaN, infinities and both zeros on either side.
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

template <typename T>
struct MathRelational : testing::Test {};
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(MathRelational, real_types);

TYPED_TEST(MathRelational, ScalarsGiveBoolAndVecsGiveMasks) {
  using T = TypeParam;
  using word = std::conditional_t<sizeof(T) == 4, std::int32_t, std::int64_t>;
  const T nan = std::numeric_limits<T>::quiet_NaN();
  const T infinity = std::numeric_limits<T>::infinity();
  const sycl::vec<T, 8> all(T(0), T(-0.0), T(1), T(-2), infinity, -infinity, nan,
                            std::numeric_limits<T>::denorm_min());
  static_assert(std::is_same_v<decltype(sycl::isnan(T(0))), bool>);
  static_assert(std::is_same_v<decltype(sycl::isnan(all)), sycl::vec<word, 8>>);
#define LUMEN_TEST_RELATION_1(name, want)           \
  for (int i = 0; i < 8; ++i) {                     \
    const T x = all[i];                             \
    EXPECT_EQ(sycl::name(x), want) << #name << x;   \
    EXPECT_EQ(sycl::name(all)[i], (want) ? -1 : 0); \
  }
  LUMEN_TEST_RELATION_1(isnan, x != x)
  LUMEN_TEST_RELATION_1(isinf, x == infinity || x == -infinity)
  LUMEN_TEST_RELATION_1(isfinite, i < 4 || i == 7)
  LUMEN_TEST_RELATION_1(isnormal, i == 2 || i == 3)
  LUMEN_TEST_RELATION_1(signbit, i == 1 || i == 3 || i == 5)
#undef LUMEN_TEST_RELATION_1
#define LUMEN_TEST_RELATION_2(name, want)                                 \
  for (int i = 0; i < 8; ++i) {                                           \
    for (int j = 0; j < 8; ++j) {                                         \
      const T x = all[i];                                                 \
      const T y = all[j];                                                 \
      EXPECT_EQ(sycl::name(x, y), want) << #name << x << " " << y;        \
      EXPECT_EQ(sycl::name(all, sycl::vec<T, 8>(y))[i], (want) ? -1 : 0); \
    }                                                                     \
  }
  LUMEN_TEST_RELATION_2(isequal, x == y)
  LUMEN_TEST_RELATION_2(isnotequal, x != y)
  LUMEN_TEST_RELATION_2(isgreater, x > y)
  LUMEN_TEST_RELATION_2(isgreaterequal, x >= y)
  LUMEN_TEST_RELATION_2(isless, x < y)
  LUMEN_TEST_RELATION_2(islessequal, x <= y)
  LUMEN_TEST_RELATION_2(islessgreater, x < y || x > y)
  LUMEN_TEST_RELATION_2(isordered, i != 6 && j != 6)
  LUMEN_TEST_RELATION_2(isunordered, i == 6 || j == 6)
#undef LUMEN_TEST_RELATION_2
}

TEST(MathRelational, AnyAndAllLookAtTheTopBit) {
  EXPECT_TRUE(sycl::any(sycl::int4(0, 1, -1, 0)));
  EXPECT_FALSE(sycl::any(sycl::int4(1, 2, 3, 4)));
  EXPECT_TRUE(sycl::all(sycl::int2(-1, std::numeric_limits<int>::min())));
  EXPECT_FALSE(sycl::all(sycl::int2(-1, 1)));
  EXPECT_TRUE(sycl::any(-5));
  EXPECT_FALSE(sycl::all(5));
}

TEST(MathRelational, SelectTakesTheSecondWhereTheConditionHolds) {
  EXPECT_EQ(sycl::select(1, 2, true), 2);
  EXPECT_EQ(sycl::select(1.5, 2.5, false), 1.5);
  const sycl::float4 a(1, 2, 3, 4);
  const sycl::float4 b(10, 20, 30, 40);
  const sycl::float4 least = sycl::select(a, b, b < 25.0F);
  EXPECT_EQ(least.x(), 10.0F);
  EXPECT_EQ(least.z(), 3.0F);
  const sycl::float4 by_top_bit = sycl::select(a, b, sycl::uint4(0x80000000U, 1, 0, 0xFFFFFFFFU));
  EXPECT_EQ(by_top_bit.x(), 10.0F);
  EXPECT_EQ(by_top_bit.y(), 2.0F);
  EXPECT_EQ(by_top_bit.w(), 40.0F);
  EXPECT_EQ(sycl::select(a.lo(), b.hi(), sycl::int2(0, -1))[1], 40.0F);
}

TEST(MathRelational, BitselectWorksOnBitsOfAnyType) {
  EXPECT_EQ(sycl::bitselect(0x0F0F, 0x1234, 0x00FF), 0x0F34);
  EXPECT_EQ(sycl::bitselect(1.0F, -1.0F, -0.0F), -1.0F);
  EXPECT_EQ(sycl::bitselect(sycl::double2(2, 3), sycl::double2(-1, -1), sycl::double2(-0.0))[1],
            -3.0);
  EXPECT_EQ(sycl::bitselect(std::uint8_t{0xF0}, std::uint8_t{0x0F}, std::uint8_t{0x3C}), 0xCC);
}

}  // namespace
