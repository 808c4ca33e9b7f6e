// SPDX-License-Identifier: Apache-2.0
// Normal and lognormal variates against their formulas computed plainly: by inversion bit for bit,
// by Box and Muller within units in the last place that the elementary functions may err. Under
// each SIMD target.
#include <limits>

#include "every_engine.hpp"
#include "real_words_model.hpp"
#include "statistics/common/erfinv_tables.hpp"

namespace {

using support::real_of_word;
using normal = support::on_simd_target;
namespace table = tarn::statistics::erfinv_tables;

int gaussian(std::int64_t method, rvx_stream s, std::int64_t n, float* r, float mean,
             float stddev) {
  return rvxsRngGaussian(method, s, n, r, mean, stddev);
}
int gaussian(std::int64_t method, rvx_stream s, std::int64_t n, double* r, double mean,
             double stddev) {
  return rvxdRngGaussian(method, s, n, r, mean, stddev);
}
template <class Real>
struct lognormal_law {
  Real m, s, displ, scale;
};
int lognormal(std::int64_t method, rvx_stream s, std::int64_t n, float* r,
              const lognormal_law<float>& p) {
  return rvxsRngLognormal(method, s, n, r, p.m, p.s, p.displ, p.scale);
}
int lognormal(std::int64_t method, rvx_stream s, std::int64_t n, double* r,
              const lognormal_law<double>& p) {
  return rvxdRngLognormal(method, s, n, r, p.m, p.s, p.displ, p.scale);
}

constexpr std::int64_t sines = RVX_RNG_METHOD_GAUSSIAN_BOXMULLER;
constexpr std::int64_t pairs = RVX_RNG_METHOD_GAUSSIAN_BOXMULLER2;
constexpr std::int64_t inversion = RVX_RNG_METHOD_GAUSSIAN_ICDF;

template <class Real>
constexpr long double unit = std::numeric_limits<Real>::epsilon();

// ---- By inversion ---------------------------------------------------------------------------

float plain_erfinv(float x) {
  const float ax = std::fabs(x);
  if (ax == 1)
    return std::copysign(table::float_end, x);
  const float t = std::fmin(1 - ax, 1 - 0x1p-24f);
  int exponent;
  const float m = 2 * std::frexp(t, &exponent);  // [1, 2)
  const int eighth = static_cast<int>((m - 1) * 8);
  const float* c = table::float_rows[7 - eighth - 8 * exponent];
  const float r = m - static_cast<float>(eighth) / 8 - 1.0625f;
  return std::fma(std::fma(std::fma(c[3], r, c[2]), r, c[1]), r, c[0]) * x;
}

double plain_erfinv(double x) {
  const double ax = std::fabs(x);
  if (ax == 1)
    return std::copysign(table::double_end, x);
  const double t = 1 - ax;
  int exponent;
  const double m = 2 * std::frexp(t, &exponent);
  const int sixteenth = static_cast<int>((m - 1) * 16);
  const double* c = table::double_rows[sixteenth + 16 * (exponent + 52)];
  const double d = t - std::ldexp(1 + (sixteenth + 0.5) / 16, exponent - 1);
  return std::fma(std::fma(std::fma(c[0], d, c[1]), d, c[2]), d, c[3]) * x;
}

template <class Real>
Real plain_inversion(std::uint32_t word, Real mean, Real stddev) {
  const Real x = plain_erfinv(real_of_word<Real>(word, -1, 1));
  const Real scale = stddev * static_cast<Real>(1.41421356237309504880);
  const Real product = scale * x;
  return product + mean;
}

template <class Real>
void compare_inversion() {
  support::stream s;
  s.set({31, 32}, 77, 0);
  const Real laws[][2] = {{0, 1}, {Real(-2.5), Real(0.3)}, {Real(1e6), Real(1e-3)}};
  for (const auto& [mean, stddev] : laws) {
    for (std::size_t n : {1, 2, 3, 5, 15, 16, 17, 31, 33, 70, 1023, 1025, 40000}) {
      plain::stream model = s.position();
      support::results<Real> r(n);
      ASSERT_EQ(gaussian(inversion, s, static_cast<std::int64_t>(n), r.data(), mean, stddev), 0);
      for (std::size_t i = 0; i < n; ++i)
        ASSERT_EQ(r[i], plain_inversion(model.next(), mean, stddev)) << i;
      ASSERT_TRUE(r.guards_intact());
      ASSERT_TRUE(support::same_position(s, model));
    }
  }
  const auto words = support::telling_words();
  for (std::size_t i = 0; i < words.size(); i += 4) {
    const plain::four four{words[i], words[i + 1], words[i + 2], words[i + 3]};
    const auto values = support::values_of_words<Real>(
        s, four, 4, [](auto&&... a) { return gaussian(inversion, a..., Real(0), Real(1)); });
    for (std::size_t k = 0; k < 4; ++k)
      EXPECT_EQ(values[k], plain_inversion(four[k], Real(0), Real(1))) << std::hex << four[k];
  }
}

TEST_F(normal, inversion_is_the_formula_in_float) {
  compare_inversion<float>();
}
TEST_F(normal, inversion_is_the_formula_in_double) {
  compare_inversion<double>();
}

TEST_F(normal, inversion_at_the_ends) {
  support::stream s;
  const plain::four words{0x80000000, 0x7FFFFFFF, 0, 0x7FFFFFC0};
  const auto floats = support::values_of_words<float>(
      s, words, 4, [](auto&&... a) { return gaussian(inversion, a..., 0.0f, 1.0f); });
  // 3.8325069 times the float next to the root of 2.
  EXPECT_EQ(floats, (std::vector<float>{-0x1.5ae1p2f, 0x1.5ae1p2f, 0, 0x1.5ae1p2f}));
  const auto doubles = support::values_of_words<double>(
      s, words, 4, [](auto&&... a) { return gaussian(inversion, a..., 0.0, 1.0); });
  EXPECT_NEAR(doubles[0], -5.8635847487551676 * std::sqrt(2.0), 1e-15);
  // The quantile of 1 - 2^-32, within the error of the cubics.
  EXPECT_NEAR(doubles[1], 6.230, 1e-3);
  EXPECT_EQ(doubles[2], 0);
}

// ---- By Box and Muller ----------------------------------------------------------------------

template <class Real>
struct plain_pair {
  long double sine, cosine;

  plain_pair(std::uint32_t first, std::uint32_t second) {
    const auto u0 = real_of_word<Real>(first, 0, 1), u1 = real_of_word<Real>(second, 0, 1);
    const long double zero_log = sizeof(Real) == 4 ? -103.278931L : -744.44007192138122L;
    const long double l = u0 == 0 ? zero_log : std::log(static_cast<long double>(u0));
    const Real t = u1 * static_cast<Real>(6.28318530717958647693);
    const long double radius = std::sqrt(-2 * l);
    sine = radius * std::sin(static_cast<long double>(t));
    cosine = radius * std::cos(static_cast<long double>(t));
  }
};

// The logarithm may err by 3.5 units, half of which the root keeps; the root itself, sine or
// cosine and the product with it by another 3, the product with the deviation by 0.5.
template <class Real>
void expect_normal(Real value, long double standard, long double mean, long double stddev) {
  const long double expected = mean + stddev * standard;
  const long double tolerance =
      unit<Real> * (6 * std::fabs(stddev * standard) + std::fabs(expected) / 2);
  ASSERT_LE(std::fabs(static_cast<long double>(value) - expected), tolerance) << value;
}

template <class Real>
void compare_pairs() {
  support::stream s;
  s.set({33, 34}, 5, 0);
  for (std::size_t n : {1, 2, 3, 4, 15, 16, 17, 33, 70, 1023, 1024, 1025, 1026, 30001}) {
    plain::stream model = s.position();
    support::results<Real> r(n);
    ASSERT_EQ(gaussian(pairs, s, static_cast<std::int64_t>(n), r.data(), Real(-3), Real(2)), 0);
    for (std::size_t i = 0; i < n; i += 2) {
      const std::uint32_t first = model.next();
      plain::stream behind = model;
      const plain_pair<Real> z(first, behind.next());
      ASSERT_NO_FATAL_FAILURE(expect_normal(r[i], z.sine, -3, 2)) << i;
      if (i + 1 == n)
        break;  // a last single value leaves its partner word where it is
      model = behind;
      ASSERT_NO_FATAL_FAILURE(expect_normal(r[i + 1], z.cosine, -3, 2)) << i;
    }
    ASSERT_TRUE(r.guards_intact());
    ASSERT_TRUE(support::same_position(s, model)) << n;
  }
}

template <class Real>
void compare_sines() {
  support::stream s;
  s.set({35, 36}, 6, 0);
  for (std::size_t n : {1, 2, 3, 15, 16, 17, 33, 511, 512, 513, 30001}) {
    plain::stream model = s.position();
    support::results<Real> r(n);
    ASSERT_EQ(gaussian(sines, s, static_cast<std::int64_t>(n), r.data(), Real(0.5), Real(3)), 0);
    for (std::size_t i = 0; i < n; ++i) {
      const std::uint32_t first = model.next();
      ASSERT_NO_FATAL_FAILURE(
          expect_normal(r[i], plain_pair<Real>(first, model.next()).sine, 0.5L, 3));
    }
    ASSERT_TRUE(r.guards_intact());
    ASSERT_TRUE(support::same_position(s, model));
  }
}

template <class Real>
void compare_telling_pairs() {
  support::stream s;
  const auto words = support::telling_words();
  for (const std::uint32_t first : words) {
    for (const std::uint32_t second : words) {
      const plain_pair<Real> z(first, second);
      const auto values = support::values_of_words<Real>(
          s, {first, second, second, first}, 2,
          [](auto&&... a) { return gaussian(pairs, a..., Real(0), Real(1)); });
      ASSERT_NO_FATAL_FAILURE(expect_normal(values[0], z.sine, 0, 1)) << first << ' ' << second;
      ASSERT_NO_FATAL_FAILURE(expect_normal(values[1], z.cosine, 0, 1)) << first << ' ' << second;
    }
  }
}

TEST_F(normal, pairs_are_the_formula) {
  compare_pairs<float>();
  compare_pairs<double>();
}
TEST_F(normal, sines_are_the_formula) {
  compare_sines<float>();
  compare_sines<double>();
}
TEST_F(normal, pairs_of_telling_words_are_the_formula) {
  compare_telling_pairs<float>();
  compare_telling_pairs<double>();
}

// ---- Lognormal ------------------------------------------------------------------------------

// y errs by `units` of the normal part and half a unit of itself; the exponential turns absolute
// errors into relative ones and adds one unit.
template <class Real>
void compare_lognormal(const lognormal_law<Real>& p, std::int64_t method) {
  support::stream s;
  s.set({37, 38}, 9, 0);
  constexpr std::size_t n = 20001;
  plain::stream model = s.position();
  support::results<Real> r(n);
  ASSERT_EQ(lognormal(method, s, n, r.data(), p), 0);
  long double cosine = 0;
  for (std::size_t i = 0; i < n; ++i) {
    long double z = cosine;
    if ((method & 1) != 0) {
      z = std::sqrt(2.0L) * plain_erfinv(real_of_word<Real>(model.next(), -1, 1));
    } else if (i % 2 == 0) {
      const std::uint32_t first = model.next();
      plain::stream behind = model;
      const plain_pair<Real> pair(first, behind.next());
      z = pair.sine;
      cosine = pair.cosine;
    } else {
      model.next();
    }
    const long double y = p.s * z + p.m;
    const long double e = std::exp(y) * p.scale, expected = e + p.displ;
    const long double y_error = 7 * std::fabs(p.s * z) + std::fabs(y);
    const long double tolerance = unit<Real> * (e * (2 + y_error) + std::fabs(expected) / 2);
    ASSERT_LE(std::fabs(static_cast<long double>(r[i]) - expected), tolerance) << i;
    if ((method & RVX_RNG_METHOD_ACCURACY_FLAG) != 0) {
      ASSERT_GE(r[i], p.displ);
    }
  }
  ASSERT_TRUE(r.guards_intact());
  ASSERT_TRUE(support::same_position(s, model));
}

TEST_F(normal, lognormal_is_the_formula) {
  for (const std::int64_t method : {0, 1, 0x40000000, 0x40000001}) {
    compare_lognormal<float>({0, 1, 0, 1}, method);
    compare_lognormal<float>({-1, 2, 3, 0.5f}, method);
    compare_lognormal<double>({0, 1, 0, 1}, method);
    compare_lognormal<double>({0.25, 3, -7, 2}, method);
  }
}

// Nothing finite leads out of the finite numbers; results that would are the greatest one.
template <class Real>
void expect_finite() {
  using limits = std::numeric_limits<Real>;
  const Real large[] = {limits::denorm_min(), 1, limits::max()};
  support::stream s;
  const auto words = support::telling_words();
  for (std::size_t i = 0; i < words.size(); i += 4) {
    const plain::four four{words[i], words[i + 1], words[i + 2], words[i + 3]};
    for (const Real mean : {-limits::max(), Real(0), limits::max()}) {
      for (const Real scale : large) {
        for (const std::int64_t method : {sines, pairs, inversion}) {
          const auto draw = [&](auto&&... a) { return gaussian(method, a..., mean, scale); };
          for (const Real x : support::values_of_words<Real>(s, four, 3, draw))
            ASSERT_TRUE(std::isfinite(x)) << mean << ' ' << scale << ' ' << method;
        }
        for (const std::int64_t method : {0, 1}) {
          const lognormal_law<Real> p{mean, scale, mean, scale};
          const auto draw = [&](auto&&... a) { return lognormal(method, a..., p); };
          for (const Real x : support::values_of_words<Real>(s, four, 3, draw))
            ASSERT_TRUE(std::isfinite(x)) << mean << ' ' << scale << ' ' << method;
        }
      }
    }
  }
}

TEST_F(normal, results_are_finite) {
  expect_finite<float>();
  expect_finite<double>();
}

TEST_F(normal, threads_make_no_difference) {
  for (const std::int64_t method : {sines, pairs, inversion}) {
    support::expect_same_on_threads<float>(
        300001, 1, [&](auto&&... a) { return gaussian(method, a..., 1.0f, 2.0f); });
    support::expect_same_on_threads<double>(
        200003, 0, [&](auto&&... a) { return gaussian(method, a..., 1.0, 2.0); });
  }
  for (const std::size_t shift : {0, 1})
    support::expect_same_on_threads<float>(
        4200001, shift, [&](auto&&... a) { return gaussian(inversion, a..., 0.0f, 1.0f); });
}

// ---- Every engine ---------------------------------------------------------------------------

class normal_engines : public support::on_simd_target,
                       public testing::WithParamInterface<support::engine_case> {};

// Two calls of a and b values equal one of a + b where no pair is cut, and as many words are used
// as values are drawn (twice as many for the sines alone).
TEST_P(normal_engines, splits_and_words) {
  if (GetParam().code == RVX_BRNG_NONDETERM)
    GTEST_SKIP() << "its words cannot be drawn again";
  for (const std::int64_t method : {sines, pairs, inversion}) {
    for (const std::size_t first : {2, 16, 30, 1024}) {
      constexpr std::size_t n = 1501;
      support::any_stream whole = GetParam().make(), cut(whole), words(whole);
      std::vector<double> one(n), two(n);
      ASSERT_EQ(gaussian(method, whole, n, one.data(), 0.0, 1.0), 0);
      ASSERT_EQ(gaussian(method, cut, static_cast<std::int64_t>(first), two.data(), 0.0, 1.0), 0);
      ASSERT_EQ(gaussian(method, cut, static_cast<std::int64_t>(n - first), &two[first], 0.0, 1.0),
                0);
      EXPECT_EQ(one, two);
      words.words(method == sines ? 2 * n : n, GetParam().parts);
      const auto expected = words.words(9, GetParam().parts);
      EXPECT_EQ(whole.words(9, GetParam().parts), expected);
      EXPECT_EQ(cut.words(9, GetParam().parts), expected);
    }
  }
}

INSTANTIATE_TEST_SUITE_P(every, normal_engines, testing::ValuesIn(support::every_engine()),
                         support::engine_name<support::engine_case>);

}  // namespace
