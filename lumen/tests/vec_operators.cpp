// SPDX-License-Identifier: Apache-2.0
// The operators of vec against the same operators on each element, for every element type.
#include <cstddef>
#include <cstdint>
#include <type_traits>
#include <utility>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

// Whether `A op B` compiles.
#define LUMEN_TEST_HAS(name, op)                     \
  template <typename A, typename B, typename = void> \
  constexpr bool name = false;                       \
  template <typename A, typename B>                  \
  constexpr bool name<A, B, std::void_t<decltype(std::declval<A>() op std::declval<B>())>> = true;
LUMEN_TEST_HAS(has_modulo, %)
LUMEN_TEST_HAS(has_shift, <<)
LUMEN_TEST_HAS(has_sum, +)
#undef LUMEN_TEST_HAS

static_assert(has_modulo<sycl::int4, sycl::int4> && has_modulo<sycl::int4, int>);
static_assert(!has_modulo<sycl::float4, sycl::float4> && !has_modulo<sycl::float4, float>);
static_assert(has_shift<sycl::uint2, int> && !has_shift<sycl::double2, int>);
static_assert(!has_sum<sycl::float4, sycl::float2> && !has_sum<sycl::float4, sycl::int4>);

template <typename T>
struct VecOperators : testing::Test {};
using element_types =
    testing::Types<std::int8_t, std::uint8_t, std::int16_t, std::uint16_t, std::int32_t,
                   std::uint32_t, std::int64_t, std::uint64_t, float, double>;
TYPED_TEST_SUITE(VecOperators, element_types);

template <typename T>
sycl::vec<T, 8> first_operand() {
  return {T(1), T(2), T(3), T(50), T(7), T(100), T(0), T(9)};
}
template <typename T>
sycl::vec<T, 8> second_operand() {
  return {T(3), T(2), T(1), T(2), T(7), T(1), T(5), T(4)};
}

// Every form of one operator: both vecs, a scalar on either side, and the two compound ones.
#define LUMEN_TEST_BINARY(op)                             \
  do {                                                    \
    const auto both = a op b;                             \
    const auto right = a op scalar;                       \
    const auto left = scalar op b;                        \
    auto compound = a;                                    \
    compound op## = b;                                    \
    auto compound_scalar = a;                             \
    compound_scalar op## = scalar;                        \
    for (int i = 0; i < 8; ++i) {                         \
      const T want = static_cast<T>(a[i] op b[i]);        \
      EXPECT_EQ(both[i], want);                           \
      EXPECT_EQ(compound[i], want);                       \
      const T with = static_cast<T>(a[i] op scalar);      \
      EXPECT_EQ(right[i], with);                          \
      EXPECT_EQ(compound_scalar[i], with);                \
      EXPECT_EQ(left[i], static_cast<T>(scalar op b[i])); \
    }                                                     \
  } while (false)

TYPED_TEST(VecOperators, ArithmeticIsByElement) {
  using T = TypeParam;
  const auto a = first_operand<T>();
  const auto b = second_operand<T>();
  const T scalar = 2;
  LUMEN_TEST_BINARY(+);
  LUMEN_TEST_BINARY(-);
  LUMEN_TEST_BINARY(*);
  LUMEN_TEST_BINARY(/);
  if constexpr (std::is_integral_v<T>) {
    LUMEN_TEST_BINARY(%);
    LUMEN_TEST_BINARY(&);
    LUMEN_TEST_BINARY(|);
    LUMEN_TEST_BINARY(^);
    LUMEN_TEST_BINARY(<<);
    LUMEN_TEST_BINARY(>>);
    for (int i = 0; i < 8; ++i) {
      EXPECT_EQ((~a)[i], static_cast<T>(~a[i]));
    }
  }
  for (int i = 0; i < 8; ++i) {
    EXPECT_EQ((-a)[i], static_cast<T>(-a[i]));
    EXPECT_EQ((+a)[i], a[i]);
  }
}
#undef LUMEN_TEST_BINARY

#define LUMEN_TEST_COMPARISON(op)                              \
  do {                                                         \
    const auto both = a op b;                                  \
    static_assert(std::is_same_v<decltype(both), const mask>); \
    const mask right = a op scalar;                            \
    const mask left = scalar op b;                             \
    for (int i = 0; i < 8; ++i) {                              \
      EXPECT_EQ(both[i], (a[i] op b[i]) ? -1 : 0);             \
      EXPECT_EQ(right[i], (a[i] op scalar) ? -1 : 0);          \
      EXPECT_EQ(left[i], (scalar op b[i]) ? -1 : 0);           \
    }                                                          \
  } while (false)

TYPED_TEST(VecOperators, ComparisonsGiveSignedMasksOfTheSameSize) {
  using T = TypeParam;
  using word = std::conditional_t<
      sizeof(T) == 1, std::int8_t,
      std::conditional_t<sizeof(T) == 2, std::int16_t,
                         std::conditional_t<sizeof(T) == 4, std::int32_t, std::int64_t>>>;
  using mask = sycl::vec<word, 8>;
  const auto a = first_operand<T>();
  const auto b = second_operand<T>();
  const T scalar = 2;
  LUMEN_TEST_COMPARISON(==);
  LUMEN_TEST_COMPARISON(!=);
  LUMEN_TEST_COMPARISON(<);
  LUMEN_TEST_COMPARISON(>);
  LUMEN_TEST_COMPARISON(<=);
  LUMEN_TEST_COMPARISON(>=);
  // The logical operators take zero as false.
  const mask both = a && b;
  const mask either = a || T(0);
  const mask negated = !a;
  for (int i = 0; i < 8; ++i) {
    EXPECT_EQ(both[i], a[i] != T(0) && b[i] != T(0) ? -1 : 0);
    EXPECT_EQ(either[i], a[i] != T(0) ? -1 : 0);
    EXPECT_EQ(negated[i], a[i] == T(0) ? -1 : 0);
  }
}
#undef LUMEN_TEST_COMPARISON

TYPED_TEST(VecOperators, StepsReturnTheRightSide) {
  using T = TypeParam;
  sycl::vec<T, 2> v(T(1), T(5));
  const sycl::vec<T, 2> before = v++;
  EXPECT_EQ(before[0], T(1));
  EXPECT_EQ(v[1], T(6));
  EXPECT_EQ((++v)[0], T(3));
  EXPECT_EQ((v--)[0], T(3));
  EXPECT_EQ((--v)[1], T(5));
}

TEST(VecOperators, SmallUnsignedElementsWrap) {
  const sycl::uchar2 v(250, 3);
  EXPECT_EQ((v + v)[0], 244);
  EXPECT_EQ((v - sycl::uchar2(1, 4))[1], 255);
}

TEST(VecOperators, ScalarsConvertToTheElementType) {
  EXPECT_EQ((sycl::float2(1, 2) * 2)[1], 4.0F);
  EXPECT_EQ((sycl::double2(1, 2) + 0.5F)[0], 1.5);
  const sycl::vec<float, 1> one(2.0F);
  EXPECT_EQ((one + 1)[0], 3.0F);
}

TEST(VecOperators, BytesHaveBitwiseOperatorsOnly) {
  const sycl::vec<std::byte, 2> a(std::byte{0x0F}, std::byte{0xF0});
  EXPECT_EQ((a ^ a)[0], std::byte{0});
  EXPECT_EQ((~a)[1], std::byte{0x0F});
  EXPECT_FALSE((has_sum<sycl::vec<std::byte, 2>, sycl::vec<std::byte, 2>>));
}

}  // namespace
