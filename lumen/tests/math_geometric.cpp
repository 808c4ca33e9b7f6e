// SPDX-License-Identifier: Apache-2.0
// The geometric functions, with lengths at both ends of the range of float.
#include <limits>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

TEST(MathGeometric, DotAndCross) {
  const sycl::float3 a(1, 2, 3);
  const sycl::float3 b(4, -5, 6);
  EXPECT_EQ(sycl::dot(a, b), 12.0F);
  EXPECT_EQ(sycl::dot(3.0, 4.0), 12.0);
  const sycl::float3 c = sycl::cross(a, b);
  EXPECT_EQ(c.x(), 27.0F);
  EXPECT_EQ(c.y(), 6.0F);
  EXPECT_EQ(c.z(), -13.0F);
  const sycl::double4 d = sycl::cross(sycl::double4(1, 0, 0, 9), sycl::double4(0, 1, 0, 9));
  EXPECT_EQ(d.z(), 1.0);
  EXPECT_EQ(d.w(), 0.0);
}

TEST(MathGeometric, LengthNeitherOverflowsNorVanishes) {
  EXPECT_EQ(sycl::length(sycl::float2(3, 4)), 5.0F);
  EXPECT_EQ(sycl::length(-3.0F), 3.0F);
  EXPECT_FLOAT_EQ(sycl::length(sycl::float2(3e30F, 4e30F)), 5e30F);
  EXPECT_FLOAT_EQ(sycl::length(sycl::float2(3e-30F, 4e-30F)), 5e-30F);
  EXPECT_DOUBLE_EQ(sycl::length(sycl::double4(1, 1, 1, 1)), 2.0);
  EXPECT_EQ(sycl::distance(sycl::float3(1, 2, 3), sycl::float3(1, 2, 8)), 5.0F);
  EXPECT_EQ(sycl::distance(2.0, 5.0), 3.0);
}

TEST(MathGeometric, NormalizeGivesLengthOneAndKeepsZero) {
  const sycl::float2 unit = sycl::normalize(sycl::float2(3e30F, 4e30F));
  EXPECT_FLOAT_EQ(unit.x(), 0.6F);
  EXPECT_FLOAT_EQ(unit.y(), 0.8F);
  const sycl::float2 zero = sycl::normalize(sycl::float2(0, 0));
  EXPECT_EQ(zero.x(), 0.0F);
  EXPECT_EQ(sycl::normalize(-7.0), -1.0);
}

TEST(MathGeometric, FastFormsAgreeInTheMiddleOfTheRange) {
  EXPECT_FLOAT_EQ(sycl::fast_length(sycl::float2(3, 4)), 5.0F);
  EXPECT_FLOAT_EQ(sycl::fast_distance(sycl::float2(1, 1), sycl::float2(4, 5)), 5.0F);
  EXPECT_FLOAT_EQ(sycl::fast_normalize(sycl::float2(3, 4)).y(), 0.8F);
  EXPECT_EQ(sycl::fast_length(-2.0F), 2.0F);
}

}  // namespace
