// SPDX-License-Identifier: Apache-2.0
// Rejection methods tried candidate by candidate in plain arithmetic of more digits, for the tests
// of the kernels that try blocks of candidates in doubles.
#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>

#include <boost/multiprecision/cpp_bin_float.hpp>

#include "any_stream.hpp"

namespace model {

// For shapes so large that the terms of a test cancel in long double.
using digits_100 = boost::multiprecision::number<boost::multiprecision::cpp_bin_float<100>,
                                                 boost::multiprecision::et_off>;

inline constexpr double epsilon = std::numeric_limits<double>::epsilon();

// What becomes of one candidate.
template <class Number>
struct verdict {
  bool accepted;
  Number value;      // standard variate
  Number tolerance;  // relative error that the kernel may have, in units of `epsilon`
  Number margin;     // how far the test is from deciding otherwise
};

// The doubles of [0, 1) that the words of a stream stand for, by the uniform routine.
class uniforms {
 public:
  explicit uniforms(const support::any_stream& from) : stream_(from) {}

  template <class Number>
  Number next() {
    double u = -1;
    EXPECT_EQ(rvxdRngUniform(0, stream_, 1, &u, 0, 1), 0);
    return Number(u);
  }
  // The same with its ends moved inside.
  template <class Number>
  Number inner() {
    const auto u = next<double>();
    return Number(u == 0 ? 0x1p-64 : u == 1 ? 1 - 0x1p-53 : u);
  }

  const support::any_stream& stream() const { return stream_; }

 private:
  support::any_stream stream_;
};

// place + scale * x from n candidates accepted one after another. Every result has to be within the
// tolerance and half a unit of its type, and the stream exactly behind the last candidate tried. No
// candidate may be so close to the edge of acceptance that its verdict is a matter of rounding:
// `least_margin` is many times what rounding moves the test by.
template <class Number, class Real, class Method, class Draw>
void compare(support::any_stream& s, const Method& method, Real place, Real scale, std::size_t n,
             double least_margin, const Draw& draw) {
  uniforms u(s);
  support::results<Real> r(n);
  ASSERT_EQ(draw(s, n, r.data()), 0);
  for (std::size_t i = 0; i < n;) {
    const verdict<Number> v = method(u);
    ASSERT_GT(v.margin, least_margin) << "no case for a test: value " << i;
    if (!v.accepted)
      continue;
    const Number scaled = Number(scale) * v.value, expected = Number(place) + scaled;
    ASSERT_TRUE(std::isfinite(r[i]));
    using std::abs, std::max;
    // The product and the sum are rounded in double, the result to its type.
    const Number magnitude = max(abs(expected), abs(Number(place)));
    const Number bound =
        Number(epsilon) * (abs(scaled) * (v.tolerance + 1) + magnitude) +
        Number(std::numeric_limits<Real>::epsilon()) * abs(expected) * Number(0.5001) +
        Number(std::numeric_limits<Real>::denorm_min());
    ASSERT_LE(abs(Number(r[i]) - expected), bound)
        << "value " << i << ": " << r[i] << ", expected " << static_cast<double>(expected);
    ++i;
  }
  EXPECT_TRUE(r.guards_intact());
  EXPECT_EQ(s.image(), u.stream().image()) << "words of the candidates tried";
}

// Every combination of the words at the ends and in the middle, as the first words of a stream of
// philox4x32x10: 0 and the greatest below 1, the least above 0, next to 1/2 on both sides.
template <class Use>
void for_extreme_words(const Use& use) {
  constexpr std::uint32_t words[] = {0x80000000, 0x7FFFFFFF, 0x80000001, 0xFFFFFFFF, 0x00000001};
  constexpr plain::two key{3, 5};
  for (std::uint32_t a : words)
    for (std::uint32_t b : words)
      for (std::uint32_t c : words)
        for (std::uint32_t d : words) {
          support::any_stream s(RVX_BRNG_PHILOX4X32X10, {1});
          const plain::u128 ctr = plain::counter_of({a, b, c, d}, key);
          support::record at{{key[0], key[1]}, {}, 0};
          for (unsigned i = 0; i < 4; ++i)
            at.ctr[i] = static_cast<std::uint32_t>(ctr >> (32 * i));
          s.set(16, at);
          use(s);
        }
}

// The same values and the same stream however a sequence is cut.
template <class Real, class Draw>
void compare_cuts(const Draw& draw) {
  constexpr std::size_t n = 3000;
  support::any_stream whole(RVX_BRNG_PHILOX4X32X10, {77});
  support::any_stream cut = whole;
  support::results<Real> expected(n);
  ASSERT_EQ(draw(whole, n, expected.data()), 0);
  support::test_data data(12);
  for (std::size_t i = 0; i < n;) {
    const std::size_t count = std::min(n - i, 1 + data.below(i % 3 == 0 ? 700 : 9));
    support::results<Real> part(count);
    ASSERT_EQ(draw(cut, count, part.data()), 0);
    for (std::size_t k = 0; k < count; ++k)
      ASSERT_EQ(part[k], expected[i + k]);
    i += count;
  }
  EXPECT_EQ(cut.image(), whole.image());
}

// FNV-1a over the bits of results: one number that all SIMD targets must agree on.
template <class Real, class Draw>
void add_to_hash(std::uint64_t& hash, const Draw& draw) {
  constexpr std::size_t n = 1999;
  support::any_stream s(RVX_BRNG_PHILOX4X32X10, {20261});
  support::results<Real> r(n);
  ASSERT_EQ(draw(s, n, r.data()), 0);
  for (std::size_t i = 0; i < n; ++i) {
    const Real x = r[i];
    unsigned char bytes[sizeof x];
    std::memcpy(bytes, &x, sizeof x);
    for (const unsigned char byte : bytes)
      hash = (hash ^ byte) * 0x100000001B3;
  }
}
inline constexpr std::uint64_t empty_hash = 0xCBF29CE484222325;

}  // namespace model
