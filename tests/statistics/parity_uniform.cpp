// SPDX-License-Identifier: Apache-2.0
// Uniform reals and integers against the rule computed plainly: the word as a signed number, times
// scale plus offset with one rounding. Bit for bit, under each SIMD target.
#include <cmath>
#include <limits>

#include "support.hpp"
#include "uniform_calls.hpp"

namespace {

using support::bits;

using uniform = support::on_simd_target;

constexpr plain::two key{7, 8};

template <class Real>
struct rule {
  Real scale, offset;
  rule(Real lo, Real hi) : scale((hi - lo) * Real(0x1p-32)), offset((lo + hi) * Real(0.5)) {}
  Real operator()(std::uint32_t word) const {
    return std::fma(static_cast<Real>(static_cast<std::int32_t>(word)), scale, offset);
  }
};

template <class Real>
void compare_range(support::stream& s, Real a, Real b, std::size_t n, std::size_t& unfused) {
  for (const std::int64_t method :
       {RVX_RNG_METHOD_UNIFORM_STD, RVX_RNG_METHOD_UNIFORM_STD_ACCURATE}) {
    plain::stream model = s.position();
    support::results<Real> r(n);
    ASSERT_EQ(support::draw_uniform(method, s, n, r.data(), a, b), 0);
    const rule<Real> expected(a, b);
    for (std::size_t i = 0; i < n; ++i) {
      const std::uint32_t word = model.next();
      Real x = expected(word);
      const Real product = static_cast<Real>(static_cast<std::int32_t>(word)) * expected.scale;
      unfused += bits<Real>(product + expected.offset) != bits(x);
      if (method != 0)
        x = std::fmin(std::fmax(x, a), b);
      ASSERT_EQ(bits(r[i]), bits(x)) << "word " << word << " on [" << a << ", " << b << ")";
    }
    ASSERT_TRUE(r.guards_intact());
    ASSERT_TRUE(support::same_position(s, model));
  }
}

template <class Real>
void compare_ranges() {
  support::stream s;
  support::test_data data(4);
  s.set(key, 0, 0);
  std::size_t unfused = 0;
  for (std::size_t n = 0; n <= 70; ++n)
    ASSERT_NO_FATAL_FAILURE(compare_range<Real>(s, 0, 1, std::max<std::size_t>(n, 1), unfused));
  using limits = std::numeric_limits<Real>;
  const Real ends[][2] = {{0, 1},
                          {-1, 1},
                          {Real(0.1), Real(0.3)},
                          {1, std::nextafter(Real(1), Real(2))},
                          {-limits::max() / 2, limits::max() / 2},
                          {0, limits::max()},
                          {limits::denorm_min(), 8 * limits::denorm_min()},
                          {0, limits::min()},
                          {-limits::min() * 1000, limits::min()},
                          {Real(1e6), Real(1e6 + 1)}};
  for (const auto& e : ends)
    ASSERT_NO_FATAL_FAILURE(compare_range<Real>(s, e[0], e[1], 3000, unfused));
  for (int i = 0; i < 300; ++i) {
    const auto random = [&data] {
      const int exponent = static_cast<int>(data.below(60)) - 30;
      const auto mantissa = static_cast<double>(static_cast<std::int64_t>(data()));
      return static_cast<Real>(std::ldexp(mantissa, exponent - 63));
    };
    const Real x = random(), y = random();
    if (x != y) {
      ASSERT_NO_FATAL_FAILURE(compare_range<Real>(s, std::min(x, y), std::max(x, y), 301, unfused));
    }
  }
  EXPECT_GT(unfused, 1000u) << "the ranges do not tell one rounding from two";
}

TEST_F(uniform, floats_are_the_rule_rounded_once) {
  compare_ranges<float>();
}
TEST_F(uniform, doubles_are_the_rule_rounded_once) {
  compare_ranges<double>();
}

// Ranges and words whose exact result lies so close to the middle of two floats that a sum rounded
// to double falls onto the middle: rounding it again to float goes wrong. With the offset next to 1
// the product has to be 2^-24, half a unit of the offset, up to an error below 2^-53: word * S with
// S next to 2^k / word, and the scale S * 2^(-24 - k).
TEST_F(uniform, floats_next_to_a_tie_are_rounded_once) {
  support::stream s;
  int cases = 0;
  for (std::uint32_t word = 33; word < 1024; word += 2) {
    const int k = 24 + std::ilogb(word);
    for (const std::int64_t step : {0, 1}) {
      const auto width = static_cast<float>(
          std::ldexp(static_cast<double>((std::int64_t{1} << k) / word + step), 8 - k));
      for (int ulps = -2; ulps <= 2; ++ulps) {
        const float b = static_cast<float>(1 + width / 2) + static_cast<float>(ulps) * 0x1p-22f;
        const float a = b - width;
        const rule<float> expected(a, b);
        const double product = static_cast<double>(word) * static_cast<double>(expected.scale);
        const auto twice = static_cast<float>(product + static_cast<double>(expected.offset));
        if (bits(twice) == bits(expected(word)))
          continue;
        ++cases;
        s.set(key, plain::counter_of({word, 0 - word, word, word}, key), 0);
        float r[4];
        ASSERT_EQ(rvxsRngUniform(0, s, 4, r, a, b), 0);
        ASSERT_EQ(bits(r[0]), bits(expected(word))) << word << " on [" << a << ", " << b << ")";
        ASSERT_EQ(bits(r[1]), bits(expected(0 - word)));
      }
    }
  }
  EXPECT_GE(cases, 10);
}

// Words at the ends of the range, through counters found by the inverse of Philox.
constexpr plain::four end_words{0x7FFFFFFF, 0x80000000, 0x7FFFFFC0, 0xFFFFFFFF};

TEST_F(uniform, interval_ends) {
  support::stream s;
  const auto draw_ends = [&](auto a, auto b, std::int64_t method) {
    s.set(key, plain::counter_of(end_words, key), 0);
    std::vector<decltype(a)> r(4);
    EXPECT_EQ(support::draw_uniform(method, s, 4, r.data(), a, b), 0);
    return r;
  };
  // The greatest word reads as 2^31 in float: rounding delivers the upper end itself.
  EXPECT_EQ(draw_ends(0.0f, 1.0f, 0), (std::vector<float>{1.0f, 0.0f, 1.0f, 0.5f - 0x1p-32f}));
  EXPECT_EQ(draw_ends(0.0, 1.0, 0),
            (std::vector<double>{1 - 0x1p-32, 0.0, 1 - 65 * 0x1p-32 + 0x1p-32, 0.5 - 0x1p-32}));
  // A range whose rounded map leaves it, which the accurate method mends.
  std::size_t outside = 0;
  support::test_data data(5);
  for (int i = 0; i < 2000; ++i) {
    const auto random = [&data] {
      return std::ldexp(static_cast<float>(data.below(1u << 24)),
                        -static_cast<int>(data.below(24)));
    };
    const float x0 = random(), x1 = random();
    const float a = std::min(x0, -x1), b = std::max(x0, x1 + 1);
    for (const float x : draw_ends(a, b, RVX_RNG_METHOD_UNIFORM_STD))
      outside += x < a || x > b;
    for (const float x : draw_ends(a, b, RVX_RNG_METHOD_UNIFORM_STD_ACCURATE))
      EXPECT_TRUE(a <= x && x <= b) << x << " is outside [" << a << ", " << b << "]";
  }
  EXPECT_GT(outside, 0u) << "no range here needs the accurate method";
}

std::int32_t floor_saturated(float x) {
  const float whole = std::floor(x);
  if (whole >= 0x1p31f)
    return std::numeric_limits<std::int32_t>::max();
  return whole < -0x1p31f ? std::numeric_limits<std::int32_t>::min()
                          : static_cast<std::int32_t>(whole);
}

TEST_F(uniform, integers_are_the_floor_of_the_float_rule) {
  constexpr std::int32_t least = std::numeric_limits<std::int32_t>::min();
  constexpr std::int32_t greatest = std::numeric_limits<std::int32_t>::max();
  const std::int32_t ends[][2] = {{0, 1},
                                  {-1, 1},
                                  {0, 6},
                                  {least, greatest},
                                  {least, least + 1},
                                  {greatest - 1, greatest},
                                  {-7, 1 << 24},
                                  {0, greatest},
                                  {least, 0},
                                  {least, 200}};
  support::stream s;
  for (const auto& e : ends) {
    for (std::size_t n : {1u, 3u, 8u, 17u, 1023u, 1025u, 2500u}) {
      s.set(key, plain::counter_of(end_words, key), 0);
      plain::stream model = s.position();
      support::results<std::int32_t> r(n);
      ASSERT_EQ(rvxiRngUniform(0, s, static_cast<std::int64_t>(n), r.data(), e[0], e[1]), 0);
      const rule<float> expected(static_cast<float>(e[0]), static_cast<float>(e[1]));
      for (std::size_t i = 0; i < n; ++i)
        ASSERT_EQ(r[i], floor_saturated(expected(model.next())))
            << "value " << i << " of [" << e[0] << ", " << e[1] << ")";
      ASSERT_TRUE(r.guards_intact());
      ASSERT_TRUE(support::same_position(s, model));
    }
  }
  // The case that the saturation is for really occurs: 2^31 becomes the greatest integer.
  std::int32_t first = 0;
  s.set(key, plain::counter_of(end_words, key), 0);
  ASSERT_EQ(rvxiRngUniform(0, s, 1, &first, least, greatest), 0);
  EXPECT_EQ(first, greatest);
}

}  // namespace
