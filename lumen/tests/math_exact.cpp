// SPDX-License-Identifier: Apache-2.0
// Values of the math functions that are exact: limits, signs of zero, halves of pi, second
// results, and that a vec gives what its elements give.
#include <cmath>
#include <cstdint>
#include <limits>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace {

template <typename T>
struct MathExact : testing::Test {
  static constexpr T infinity = std::numeric_limits<T>::infinity();
  static constexpr T nan = std::numeric_limits<T>::quiet_NaN();
};
using real_types = testing::Types<float, double>;
TYPED_TEST_SUITE(MathExact, real_types);

// Equal with the same sign, so that +0 and -0 differ.
template <typename T>
testing::AssertionResult same(T got, T want) {
  if (got == want && std::signbit(got) == std::signbit(want)) {
    return testing::AssertionSuccess();
  }
  return testing::AssertionFailure() << got << " is not " << want;
}

TYPED_TEST(MathExact, MultiplesOfPi) {
  using T = TypeParam;
  for (int n = 0; n < 40; ++n) {
    const T whole = static_cast<T>(n);
    const T half = whole + T(0.5);
    const T alternating = n % 2 == 0 ? T(1) : T(-1);
    EXPECT_TRUE(same(sycl::sinpi(whole), T(0))) << n;
    EXPECT_TRUE(same(sycl::sinpi(-whole), T(-0.0))) << n;
    EXPECT_TRUE(same(sycl::cospi(whole), alternating)) << n;
    EXPECT_TRUE(same(sycl::cospi(-whole), alternating)) << n;
    EXPECT_TRUE(same(sycl::sinpi(half), alternating)) << n;
    EXPECT_TRUE(same(sycl::sinpi(-half), -alternating)) << n;
    EXPECT_TRUE(same(sycl::cospi(half), T(0))) << n;
    EXPECT_TRUE(same(sycl::cospi(-half), T(0))) << n;
    EXPECT_TRUE(same(sycl::tanpi(whole), alternating * T(0))) << n;
    EXPECT_TRUE(same(sycl::tanpi(half), alternating * this->infinity)) << n;
    EXPECT_TRUE(same(sycl::tanpi(-half), -alternating * this->infinity)) << n;
  }
  const T large = std::ldexp(T(1), std::numeric_limits<T>::digits + 3);
  EXPECT_TRUE(same(sycl::sinpi(large), T(0)));
  EXPECT_TRUE(same(sycl::cospi(std::numeric_limits<T>::max()), T(1)));
  EXPECT_TRUE(std::isnan(sycl::sinpi(this->infinity)));
  EXPECT_TRUE(std::isnan(sycl::cospi(-this->infinity)));
  EXPECT_TRUE(std::isnan(sycl::sinpi(this->nan)));
}

TYPED_TEST(MathExact, PowersAtTheirLimits) {
  using T = TypeParam;
  EXPECT_TRUE(std::isnan(sycl::powr(T(-1), T(2))));
  EXPECT_TRUE(std::isnan(sycl::powr(T(0), T(0))));
  EXPECT_TRUE(std::isnan(sycl::powr(this->infinity, T(0))));
  EXPECT_TRUE(std::isnan(sycl::powr(T(1), this->infinity)));
  EXPECT_TRUE(std::isnan(sycl::powr(T(1), this->nan)));
  EXPECT_TRUE(same(sycl::powr(T(-0.0), T(-3)), this->infinity));
  EXPECT_TRUE(same(sycl::powr(T(5), T(0)), T(1)));
  EXPECT_TRUE(same(sycl::pown(T(-2), 3), T(-8)));
  EXPECT_TRUE(same(sycl::pown(T(-0.0), 3), T(-0.0)));
  EXPECT_TRUE(same(sycl::rootn(T(-27), 3), T(-3)));
  EXPECT_TRUE(same(sycl::rootn(T(-8), -3), T(-0.5)));
  EXPECT_TRUE(same(sycl::rootn(T(-0.0), 3), T(-0.0)));
  EXPECT_TRUE(same(sycl::rootn(T(-0.0), 2), T(0)));
  EXPECT_TRUE(same(sycl::rootn(T(-0.0), -3), -this->infinity));
  EXPECT_TRUE(same(sycl::rootn(T(0), -2), this->infinity));
  EXPECT_TRUE(same(sycl::rootn(this->infinity, -2), T(0)));
  EXPECT_TRUE(same(sycl::rootn(-this->infinity, 3), -this->infinity));
  EXPECT_TRUE(std::isnan(sycl::rootn(T(4), 0)));
  EXPECT_TRUE(std::isnan(sycl::rootn(T(-4), 2)));
  EXPECT_TRUE(std::isnan(sycl::rootn(this->nan, 2)));
}

TYPED_TEST(MathExact, RoundingStepsAndExtremes) {
  using T = TypeParam;
  EXPECT_TRUE(same(sycl::rint(T(2.5)), T(2)));
  EXPECT_TRUE(same(sycl::round(T(2.5)), T(3)));
  EXPECT_TRUE(same(sycl::trunc(T(-2.5)), T(-2)));
  EXPECT_TRUE(same(sycl::ceil(T(-0.5)), T(-0.0)));
  EXPECT_TRUE(same(sycl::floor(T(-0.5)), T(-1)));
  EXPECT_TRUE(same(sycl::fmax(this->nan, T(1)), T(1)));
  EXPECT_TRUE(same(sycl::fmin(T(1), this->nan), T(1)));
  EXPECT_TRUE(same(sycl::maxmag(T(-3), T(2)), T(-3)));
  EXPECT_TRUE(same(sycl::minmag(T(-3), T(2)), T(2)));
  EXPECT_TRUE(same(sycl::maxmag(T(-3), T(3)), T(3)));
  EXPECT_TRUE(same(sycl::fdim(T(3), T(1)), T(2)));
  EXPECT_TRUE(same(sycl::copysign(T(3), T(-0.0)), T(-3)));
  EXPECT_TRUE(same(sycl::fabs(T(-0.0)), T(0)));
  EXPECT_TRUE(same(sycl::fabs(-this->infinity), this->infinity));
  EXPECT_TRUE(same(sycl::nextafter(T(1), T(2)), T(1) + std::numeric_limits<T>::epsilon()));
  EXPECT_TRUE(same(sycl::fmod(T(-7), T(4)), T(-3)));
  EXPECT_TRUE(same(sycl::remainder(T(7), T(4)), T(-1)));
  EXPECT_TRUE(same(sycl::logb(T(9)), T(3)));
  EXPECT_EQ(sycl::ilogb(T(0.1)), -4);
  EXPECT_TRUE(same(sycl::ldexp(T(3), -1), T(1.5)));
  EXPECT_TRUE(same(sycl::lgamma(T(1)), T(0)));
}

TYPED_TEST(MathExact, CommonFunctions) {
  using T = TypeParam;
  using V = sycl::vec<T, 2>;
  EXPECT_TRUE(same(sycl::clamp(T(5), T(0), T(2)), T(2)));
  EXPECT_TRUE(same(sycl::clamp(V(-5, 1), T(0), T(2))[0], T(0)));
  EXPECT_TRUE(same(sycl::mix(T(2), T(4), T(0.25)), T(2.5)));
  EXPECT_TRUE(same(sycl::mix(V(2, 0), V(4, 8), T(0.5))[1], T(4)));
  EXPECT_TRUE(same(sycl::step(T(1), T(1)), T(1)));
  EXPECT_TRUE(same(sycl::step(T(1), V(0.5, 3))[0], T(0)));
  EXPECT_TRUE(same(sycl::smoothstep(T(0), T(2), T(1)), T(0.5)));
  EXPECT_TRUE(same(sycl::smoothstep(T(0), T(2), V(-1, 3))[1], T(1)));
  EXPECT_TRUE(same(sycl::sign(T(-0.0)), T(-0.0)));
  EXPECT_TRUE(same(sycl::sign(T(-7)), T(-1)));
  EXPECT_TRUE(same(sycl::sign(this->nan), T(0)));
  EXPECT_NEAR(sycl::degrees(sycl::radians(T(90))), T(90), 90 * std::numeric_limits<T>::epsilon());
  EXPECT_TRUE(same(sycl::max(V(1, 5), T(3))[0], T(3)));
  EXPECT_TRUE(same(sycl::min(V(1, 5), V(2, 4))[1], T(4)));
}

// Stands for a multi_ptr: the functions need no more than its get().
template <typename T>
struct pointer {
  T* get() const { return target; }
  T* target;
};
template <typename T>
pointer(T*) -> pointer<T>;

TYPED_TEST(MathExact, SecondResults) {
  using T = TypeParam;
  T part = 0;
  int number = 0;
  EXPECT_TRUE(same(sycl::fract(T(-0.25), pointer{&part}), T(0.75)));
  EXPECT_TRUE(same(part, T(-1)));
  EXPECT_LT(sycl::fract(-std::numeric_limits<T>::min(), pointer{&part}), T(1));
  EXPECT_TRUE(same(sycl::fract(-this->infinity, pointer{&part}), T(-0.0)));
  EXPECT_TRUE(same(sycl::fract(T(-3), pointer{&part}), T(-0.0)));
  EXPECT_TRUE(same(sycl::frexp(T(12), pointer{&number}), T(0.75)));
  EXPECT_EQ(number, 4);
  EXPECT_TRUE(same(sycl::frexp(this->infinity, pointer{&number}), this->infinity));
  EXPECT_EQ(number, 0);
  EXPECT_TRUE(same(sycl::modf(T(-2.5), pointer{&part}), T(-0.5)));
  EXPECT_TRUE(same(part, T(-2)));
  EXPECT_TRUE(same(sycl::sincos(T(1), pointer{&part}), sycl::sin(T(1))));
  EXPECT_TRUE(same(part, sycl::cos(T(1))));
  EXPECT_TRUE(same(sycl::remquo(T(11), T(4), pointer{&number}), T(-1)));
  EXPECT_EQ(number, 3);
  EXPECT_GT(sycl::lgamma_r(T(-0.5), pointer{&number}), T(1.26));
  EXPECT_EQ(number, -1);
  sycl::vec<int, 2> numbers;
  const auto sizes = sycl::frexp(sycl::vec<T, 2>(8, -3), pointer{&numbers});
  EXPECT_TRUE(same(sizes[1], T(-0.75)));
  EXPECT_EQ(numbers[0], 4);
  EXPECT_EQ(numbers[1], 2);
}

TYPED_TEST(MathExact, AVecGivesWhatItsElementsGive) {
  using T = TypeParam;
  const sycl::vec<T, 4> v(T(0.3), T(0.9), T(0.1), T(0.7));
  const sycl::vec<T, 4> w(T(1.5), T(-2), T(3), T(0.25));
  const sycl::vec<int, 4> n(1, -2, 3, 0);
  for (int i = 0; i < 4; ++i) {
    EXPECT_TRUE(same(sycl::log1p(v)[i], sycl::log1p(v[i])));
    EXPECT_TRUE(same(sycl::pow(v, w)[i], sycl::pow(v[i], w[i])));
    EXPECT_TRUE(same(sycl::mad(v, w, v)[i], std::fma(v[i], w[i], v[i])));
    EXPECT_TRUE(same(sycl::fmax(w, T(1))[i], sycl::fmax(w[i], T(1))));
    EXPECT_TRUE(same(sycl::ldexp(w, n)[i], sycl::ldexp(w[i], n[i])));
    EXPECT_TRUE(same(sycl::ldexp(w, 3)[i], sycl::ldexp(w[i], 3)));
    EXPECT_TRUE(same(sycl::pown(w, n)[i], sycl::pown(w[i], n[i])));
    EXPECT_EQ(sycl::ilogb(w)[i], sycl::ilogb(w[i]));
  }
  EXPECT_TRUE(same(sycl::sqrt(v.hi())[1], sycl::sqrt(v[3])));
  EXPECT_TRUE(same(sycl::fmin(v.lo(), w.hi())[1], T(0.25)));
}

TEST(MathExact, NaNsCarryTheirCode) {
  EXPECT_TRUE(std::isnan(sycl::nan(5U)));
  EXPECT_EQ(sycl::bit_cast<std::uint32_t>(sycl::nan(5U)), 0x7FC00005U);
  const std::uint64_t code = 77;
  EXPECT_EQ(sycl::bit_cast<std::uint64_t>(sycl::nan(code)), 0x7FF800000000004DU);
  EXPECT_TRUE(std::isnan(sycl::nan(sycl::uint2(1, 2))[1]));
}

TEST(MathExact, ReducedPrecisionIsForFloatAndAgrees) {
  EXPECT_EQ(sycl::native::sin(0.5F), sycl::sin(0.5F));
  EXPECT_EQ(sycl::native::divide(1.0F, 3.0F), 1.0F / 3.0F);
  EXPECT_EQ(sycl::half_precision::recip(4.0F), 0.25F);
  EXPECT_EQ(sycl::native::exp2(sycl::float2(3, 4))[1], 16.0F);
  EXPECT_EQ(sycl::native::powr(2.0F, 3.0F), 8.0F);
}

}  // namespace
