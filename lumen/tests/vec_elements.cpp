// SPDX-License-Identifier: Apache-2.0
// How a vec is laid out, built, and read and written by element, half and swizzle.
// The program is compiled with SYCL_SIMPLE_SWIZZLES, which brings the named swizzles.
#include <cstddef>
#include <cstdint>
#include <type_traits>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

template <typename T, int N>
constexpr bool is_laid_out() {
  using V = sycl::vec<T, N>;
  constexpr std::size_t bytes = (N == 3 ? 4 : N) * sizeof(T);
  return sizeof(V) == bytes && alignof(V) == bytes && V::byte_size() == bytes && V::size() == N &&
         std::is_trivially_copyable_v<V>;
}

template <typename T>
constexpr bool all_lengths_are_laid_out() {
  return is_laid_out<T, 1>() && is_laid_out<T, 2>() && is_laid_out<T, 3>() && is_laid_out<T, 4>() &&
         is_laid_out<T, 8>() && is_laid_out<T, 16>();
}

static_assert(all_lengths_are_laid_out<std::int8_t>());
static_assert(all_lengths_are_laid_out<std::uint32_t>());
static_assert(all_lengths_are_laid_out<float>());
static_assert(all_lengths_are_laid_out<double>());

static_assert(std::is_same_v<sycl::uint4, sycl::vec<std::uint32_t, 4>>);
static_assert(std::is_same_v<sycl::long16, sycl::vec<std::int64_t, 16>>);
static_assert(std::is_same_v<sycl::uchar3, sycl::vec<std::uint8_t, 3>>);

// A splat is explicit, elements must fill the vec, and element types do not mix.
static_assert(!std::is_convertible_v<float, sycl::float4>);
static_assert(!std::is_constructible_v<sycl::float4, float, float, float>);
static_assert(!std::is_constructible_v<sycl::float4, sycl::float4, float>);
static_assert(!std::is_constructible_v<sycl::float4, sycl::int2, sycl::float2>);
static_assert(std::is_constructible_v<sycl::float4, sycl::float2, float, float>);
static_assert(std::is_convertible_v<sycl::vec<int, 1>, int>);
static_assert(!std::is_convertible_v<sycl::vec<int, 2>, int>);

template <typename V>
std::vector<typename V::element_type> elements(const V& v) {
  std::vector<typename V::element_type> list;
  for (int i = 0; i < static_cast<int>(V::size()); ++i) {
    list.push_back(v[i]);
  }
  return list;
}
using ints = std::vector<int>;

TEST(VecElements, ConstructorsFillInOrder) {
  EXPECT_EQ(elements(sycl::int3()), ints({0, 0, 0}));
  EXPECT_EQ(elements(sycl::int3(7)), ints({7, 7, 7}));
  const sycl::int2 pair(1, 2);
  EXPECT_EQ(elements(sycl::int8(pair, 3, sycl::int4(4, 5, 6, 7), 8)),
            ints({1, 2, 3, 4, 5, 6, 7, 8}));
  EXPECT_EQ(elements(sycl::int4(pair.yx(), pair)), ints({2, 1, 1, 2}));
  EXPECT_EQ(elements(sycl::vec(4, 5)), ints({4, 5}));
  constexpr sycl::int2 at_compile_time(3, 4);
  static_assert((at_compile_time * 2)[1] == 8);
}

TEST(VecElements, NamesReadAndWrite) {
  sycl::int4 v(10, 11, 12, 13);
  EXPECT_EQ(v.x(), 10);
  EXPECT_EQ(v.a(), 13);
  EXPECT_EQ(v.s2(), 12);
  v.y() = 5;
  v.b() += 1;
  v.s3() = -1;
  EXPECT_EQ(elements(v), ints({10, 5, 13, -1}));
  sycl::int16 wide(0);
  wide.sF() = 9;
  wide.sA() = 8;
  EXPECT_EQ(wide[15], 9);
  EXPECT_EQ(wide[10], 8);
}

TEST(VecElements, ScalarAssignmentFillsAll) {
  sycl::float2 v(1.0F, 2.0F);
  v = 3;
  EXPECT_EQ(elements(v), std::vector<float>({3, 3}));
}

TEST(VecElements, HalvesOfEveryLength) {
  const sycl::int8 v(0, 1, 2, 3, 4, 5, 6, 7);
  EXPECT_EQ(elements(sycl::int4(v.lo())), ints({0, 1, 2, 3}));
  EXPECT_EQ(elements(sycl::int4(v.hi())), ints({4, 5, 6, 7}));
  EXPECT_EQ(elements(sycl::int4(v.even())), ints({0, 2, 4, 6}));
  EXPECT_EQ(elements(sycl::int4(v.odd())), ints({1, 3, 5, 7}));
  const sycl::int2 pair(8, 9);
  const int low = pair.lo();
  const int high = pair.hi();
  EXPECT_EQ(low, 8);
  EXPECT_EQ(high, 9);
  const sycl::int3 three(1, 2, 3);
  EXPECT_EQ(elements(sycl::int2(three.lo())), ints({1, 2}));
  EXPECT_EQ(three.hi()[0], 3);
  EXPECT_EQ(elements(sycl::int2(three.even())), ints({1, 3}));
}

TEST(VecSwizzle, ReadsAnyOrderAndRepeats) {
  const sycl::int4 v(10, 11, 12, 13);
  EXPECT_EQ(elements(sycl::int4(v.wzyx())), ints({13, 12, 11, 10}));
  EXPECT_EQ(elements(sycl::int3(v.xxy())), ints({10, 10, 11}));
  EXPECT_EQ(elements(sycl::int2(v.ra())), ints({10, 13}));
  const sycl::int8 repeated = v.swizzle<3, 3, 2, 2, 1, 1, 0, 0>();
  EXPECT_EQ(elements(repeated), ints({13, 13, 12, 12, 11, 11, 10, 10}));
  EXPECT_EQ(elements(sycl::int2(v.wzyx().yx())), ints({12, 13}));
  EXPECT_EQ(elements(sycl::int2(v.hi().lo(), v.wzyx().w())), ints({12, 10}));
}

TEST(VecSwizzle, WritesThroughToTheVec) {
  sycl::int4 v(0, 1, 2, 3);
  v.wx() = sycl::int2(7, 8);
  EXPECT_EQ(elements(v), ints({8, 1, 2, 7}));
  v.yz() = 5;
  EXPECT_EQ(elements(v), ints({8, 5, 5, 7}));
  v.xy() = v.yx();  // Both sides view one vec: the right one is read first.
  EXPECT_EQ(elements(v), ints({5, 8, 5, 7}));
  v.zw() += sycl::int2(1, 2);
  v.xy() <<= 1;
  v.swizzle<3>() -= 9;
  EXPECT_EQ(elements(v), ints({10, 16, 6, 0}));
  v.hi().x() = 77;
  EXPECT_EQ(v.z(), 77);
}

TEST(VecSwizzle, MixesWithVecsAndScalars) {
  const sycl::float4 v(1, 2, 3, 4);
  EXPECT_EQ(elements(v.xy() + v.wz()), std::vector<float>({5, 5}));
  EXPECT_EQ(elements(v.xy() * 2), std::vector<float>({2, 4}));
  EXPECT_EQ(elements(1 - v.yx()), std::vector<float>({-1, 0}));
  EXPECT_EQ(elements(sycl::float2(9, 9) - v.xy()), std::vector<float>({8, 7}));
  EXPECT_EQ(elements(v * v.swizzle<1>()), std::vector<float>({2, 4, 6, 8}));
  EXPECT_EQ(elements(-v.xy()), std::vector<float>({-1, -2}));
  EXPECT_EQ(elements(v.xy() < v.yx()), ints({-1, 0}));
}

}  // namespace
