// SPDX-License-Identifier: Apache-2.0
// Chi-square variates against their definitions: sums of squares of normal variates, logarithms of
// products of uniforms, gamma variates. Under each SIMD target.
#include "every_engine.hpp"
#include "rejection_model.hpp"

namespace {

using support::any_stream;
using chi_square = support::on_simd_target;

template <class Real>
struct routines;
template <>
struct routines<float> {
  static constexpr auto chi_square = rvxsRngChiSquare;
  static constexpr auto gaussian = rvxsRngGaussian;
  static constexpr auto uniform = rvxsRngUniform;
  static constexpr auto gamma = rvxsRngGamma;
  static constexpr float log_of_zero = -103.278931f;
};
template <>
struct routines<double> {
  static constexpr auto chi_square = rvxdRngChiSquare;
  static constexpr auto gaussian = rvxdRngGaussian;
  static constexpr auto uniform = rvxdRngUniform;
  static constexpr auto gamma = rvxdRngGamma;
  static constexpr double log_of_zero = -744.44007192138122;
};

constexpr std::int64_t by_inversion = 2;

template <class Real>
void compare_squares(any_stream& s, std::size_t degrees, std::size_t n) {
  any_stream other = s;
  support::results<Real> r(n), x(n * degrees);
  ASSERT_EQ(routines<Real>::chi_square(0, s, static_cast<std::int64_t>(n), r.data(),
                                       static_cast<std::int32_t>(degrees)),
            0);
  ASSERT_EQ(routines<Real>::gaussian(by_inversion, other, static_cast<std::int64_t>(n * degrees),
                                     x.data(), 0, 1),
            0);
  for (std::size_t i = 0; i < n; ++i) {
    Real sum = 0;
    for (std::size_t j = 0; j < degrees; ++j)
      sum += x[i * degrees + j] * x[i * degrees + j];
    ASSERT_EQ(r[i], sum) << degrees << " degrees, value " << i;
  }
  EXPECT_TRUE(r.guards_intact());
  EXPECT_EQ(s.image(), other.image());
}

// Floats take the logarithm of pairs, doubles of all factors: a zero among them counts as the least
// logarithm of the type.
template <class Real>
void compare_products(any_stream& s, std::size_t degrees, std::size_t n) {
  const std::size_t factors = degrees / 2;
  const std::size_t together = sizeof(Real) == sizeof(float) ? 2 : factors;
  any_stream other = s;
  support::results<Real> r(n), u(n * factors);
  ASSERT_EQ(routines<Real>::chi_square(0, s, static_cast<std::int64_t>(n), r.data(),
                                       static_cast<std::int32_t>(degrees)),
            0);
  ASSERT_EQ(
      routines<Real>::uniform(0, other, static_cast<std::int64_t>(n * factors), u.data(), 0, 1), 0);
  for (std::size_t i = 0; i < n; ++i) {
    long double sum = 0, terms = 0;
    for (std::size_t first = 0; first < factors; first += together) {
      long double log = 0;
      bool zero = false;
      for (std::size_t j = first; j < std::min(first + together, factors); ++j) {
        zero = zero || u[i * factors + j] == 0;
        log += zero ? 0 : std::log(static_cast<long double>(u[i * factors + j]));
      }
      sum += -2 * (zero ? routines<Real>::log_of_zero : log);
      terms += 1;
    }
    // Up to 4 units of the logarithm and one of each addition, relative to the sum; each product of
    // a group has half a unit, doubled.
    const long double bound = std::numeric_limits<Real>::epsilon() *
                              (sum * (4 + terms) + static_cast<long double>(factors));
    ASSERT_LE(std::abs(r[i] - sum), bound) << degrees << " degrees, value " << i;
  }
  EXPECT_TRUE(r.guards_intact());
  EXPECT_EQ(s.image(), other.image());
}

template <class Real>
void compare_gamma(any_stream& s, std::size_t degrees, std::size_t n) {
  any_stream other = s;
  support::results<Real> r(n), expected(n);
  const auto count = static_cast<std::int64_t>(n);
  ASSERT_EQ(routines<Real>::chi_square(0, s, count, r.data(), static_cast<std::int32_t>(degrees)),
            0);
  ASSERT_EQ(
      routines<Real>::gamma(0, other, count, expected.data(), static_cast<Real>(degrees) / 2, 0, 2),
      0);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_TRUE(std::isfinite(r[i]) && r[i] >= 0);
  EXPECT_TRUE(r == expected) << degrees << " degrees";
  EXPECT_EQ(s.image(), other.image());
}

template <class Real>
void compare(any_stream& s, std::size_t degrees, std::size_t n) {
  if (degrees == 1 || degrees == 3)
    compare_squares<Real>(s, degrees, n);
  else if (degrees % 2 == 0 && degrees <= 16)
    compare_products<Real>(s, degrees, n);
  else
    compare_gamma<Real>(s, degrees, n);
}

template <class Real>
void compare_all(any_stream& s) {
  for (std::size_t degrees : {1u, 2u, 3u, 4u, 5u, 6u, 8u, 14u, 15u, 16u, 17u, 18u, 2147483647u})
    for (std::size_t n : {1u, 2u, 7u, 8u, 9u, 100u, 1023u, 1025u, 3001u})
      ASSERT_NO_FATAL_FAILURE(compare<Real>(s, degrees, n));
}

TEST_F(chi_square, floats_follow_the_definitions) {
  any_stream s(RVX_BRNG_PHILOX4X32X10, {5});
  compare_all<float>(s);
}
TEST_F(chi_square, doubles_follow_the_definitions) {
  any_stream s(RVX_BRNG_PHILOX4X32X10, {6});
  compare_all<double>(s);
}

TEST_F(chi_square, extreme_words) {
  for (std::size_t degrees : {1u, 2u, 3u, 4u, 8u, 16u})
    model::for_extreme_words([&](any_stream& s) {
      any_stream same = s;
      ASSERT_NO_FATAL_FAILURE(compare<float>(s, degrees, 3));
      ASSERT_NO_FATAL_FAILURE(compare<double>(same, degrees, 3));
    });
}

TEST_F(chi_square, every_engine) {
  for (const support::engine_case& engine : support::every_engine()) {
    if (engine.code == RVX_BRNG_NONDETERM)
      continue;
    SCOPED_TRACE(engine.name);
    any_stream s = engine.make();
    for (std::size_t degrees : {1u, 3u, 6u, 5u}) {
      ASSERT_NO_FATAL_FAILURE(compare<float>(s, degrees, 500));
      ASSERT_NO_FATAL_FAILURE(compare<double>(s, degrees, 500));
    }
  }
}

template <class Real>
void compare_cuts() {
  for (const std::int32_t degrees : {1, 2, 3, 5, 10})
    ASSERT_NO_FATAL_FAILURE(model::compare_cuts<Real>([&](rvx_stream s, std::size_t n, Real* r) {
      return routines<Real>::chi_square(0, s, static_cast<std::int64_t>(n), r, degrees);
    }));
}

TEST_F(chi_square, cuts) {
  compare_cuts<float>();
  compare_cuts<double>();
}

// The bounds leave the last bits of the logarithms open; this holds them, as all targets compute
// them. Another release of the vector functions may change it.
template <class Real>
void add_to_hash(std::uint64_t& hash) {
  for (const std::int32_t degrees : {2, 6, 16, 17})
    model::add_to_hash<Real>(hash, [&](rvx_stream s, std::size_t n, Real* r) {
      return routines<Real>::chi_square(0, s, static_cast<std::int64_t>(n), r, degrees);
    });
}

TEST_F(chi_square, bits_of_all_targets) {
  std::uint64_t hash = model::empty_hash;
  add_to_hash<float>(hash);
  add_to_hash<double>(hash);
  EXPECT_EQ(hash, 1821105713785321742u);
}

// Calls large enough for several threads give the values of many small ones.
TEST_F(chi_square, large_calls) {
  constexpr std::size_t n = 200000, part = 1000;
  for (const std::int32_t degrees : {3, 6}) {
    any_stream s(RVX_BRNG_PHILOX4X32X10, {8});
    any_stream other = s;
    support::results<double> r(n), small(part);
    ASSERT_EQ(rvxdRngChiSquare(0, s, n, r.data(), degrees), 0);
    for (std::size_t i = 0; i < n; i += part) {
      ASSERT_EQ(rvxdRngChiSquare(0, other, part, small.data(), degrees), 0);
      for (std::size_t k = 0; k < part; ++k)
        ASSERT_EQ(r[i + k], small[k]);
    }
    EXPECT_EQ(s.image(), other.image());
  }
}

}  // namespace
