// SPDX-License-Identifier: Apache-2.0
// exponential, rayleigh, weibull, gumbel, laplace and cauchy against their formulas in extended
// precision, within units in the last place that the elementary functions may err. Under each SIMD
// target.
#include <functional>
#include <limits>
#include <string>

#include "every_engine.hpp"
#include "real_words_model.hpp"

namespace {

using support::real_of_word;
using closed_forms = support::on_simd_target;

template <class Real>
using draw_function = std::function<int(std::int64_t method, rvx_stream s, std::int64_t n, Real* r,
                                        Real place, Real scale)>;

// A standard variate in extended precision, and its error in units of `unit`.
struct standard {
  long double value, error;
};

template <class Real>
struct law {
  std::string name;
  draw_function<Real> draw;
  std::size_t words;
  bool accurate;  // whether there is an accurate method
  std::function<standard(std::uint32_t first, std::uint32_t second)> value;
};

template <class Real>
constexpr long double unit = std::numeric_limits<Real>::epsilon();

template <class Real>
long double log_of(Real u) {
  const long double zero_log = sizeof(Real) == 4 ? -103.278931L : -744.44007192138122L;
  return u == 0 ? zero_log : std::log(static_cast<long double>(u));
}

// The library's logarithm and tangent err by 3.5 units at most, the others by 1.
template <class Real>
struct formulas {
  static long double minus_log(std::uint32_t word) {
    return -log_of(real_of_word<Real>(word, 0, 1));
  }
  static standard exponential(std::uint32_t word, std::uint32_t) {
    return {minus_log(word), 3.5L * minus_log(word)};
  }
  static standard rayleigh(std::uint32_t word, std::uint32_t) {
    const long double root = std::sqrt(minus_log(word));
    return {root, 2.5L * root};
  }
  // The error of -ln(u) is one of its logarithm, and that logarithm errs by 3.5 units more.
  static standard gumbel(std::uint32_t word, std::uint32_t) {
    const long double l = minus_log(word);
    if (l == 0)
      return {log_of(Real(0)), 0.5L * 104};
    const long double w = std::log(l);
    return {w, 3.5L + 3.5L * std::fabs(w)};
  }
  static standard laplace(std::uint32_t first, std::uint32_t second) {
    const long double l = minus_log(first);
    return {real_of_word<Real>(second, 0, 1) > Real(0.5) ? -l : l, 3.5L * l};
  }
  static standard cauchy(std::uint32_t word, std::uint32_t) {
    constexpr auto quarter_turn = static_cast<Real>(1.57079632679489661923);
    const auto u = real_of_word<Real>(word, -quarter_turn, quarter_turn);
    const long double t = std::tan(static_cast<long double>(u));
    return {t, 3.5L * std::fabs(t)};
  }
  // (-l)^(1/alpha) = exp(y) with y = ln(-l) / alpha: the errors of y, of 1/alpha, the product and
  // the logarithm, are relative ones of the result.
  static standard weibull(std::uint32_t word, Real alpha) {
    const long double l = minus_log(word);
    if (l == 0)
      return {0, 0};
    const long double y = std::log(l) / alpha, value = std::exp(y);
    return {value, value * (2 + 4.5L / alpha + 5 * std::fabs(y))};
  }
};

template <class Real>
std::vector<law<Real>> laws() {
  using f = formulas<Real>;
  const auto pick = [](auto* of_float, auto* of_double) {
    return [=](std::int64_t method, rvx_stream s, std::int64_t n, Real* r, Real a, Real b) {
      if constexpr (sizeof(Real) == 4)
        return of_float(method, s, n, r, a, b);
      else
        return of_double(method, s, n, r, a, b);
    };
  };
  std::vector<law<Real>> all{
      {"exponential", pick(rvxsRngExponential, rvxdRngExponential), 1, true, f::exponential},
      {"rayleigh", pick(rvxsRngRayleigh, rvxdRngRayleigh), 1, true, f::rayleigh},
      {"gumbel", pick(rvxsRngGumbel, rvxdRngGumbel), 1, false, f::gumbel},
      {"laplace", pick(rvxsRngLaplace, rvxdRngLaplace), 2, false, f::laplace},
      {"cauchy", pick(rvxsRngCauchy, rvxdRngCauchy), 1, false, f::cauchy}};
  for (const Real alpha : {Real(0.3), Real(1), Real(2.5), Real(100)}) {
    const auto draw = [alpha](std::int64_t method, rvx_stream s, std::int64_t n, Real* r, Real a,
                              Real b) {
      if constexpr (sizeof(Real) == 4)
        return rvxsRngWeibull(method, s, n, r, alpha, a, b);
      else
        return rvxdRngWeibull(method, s, n, r, alpha, a, b);
    };
    all.push_back({"weibull of shape " + std::to_string(alpha), draw, 1, true,
                   [alpha](std::uint32_t word, std::uint32_t) { return f::weibull(word, alpha); }});
  }
  return all;
}

template <class Real>
void expect_value(Real x, const standard& z, Real place, Real scale, bool accurate) {
  long double expected = place + scale * z.value;
  const long double tolerance =
      unit<Real> * (scale * (z.error + std::fabs(z.value) / 2) + std::fabs(expected) / 2);
  if (accurate)
    expected = std::max(expected, static_cast<long double>(place));
  ASSERT_LE(std::fabs(static_cast<long double>(x) - expected), tolerance) << x;
  if (accurate) {
    ASSERT_GE(x, place);
  }
}

template <class Real>
void compare_law(const law<Real>& l, Real place, Real scale, std::int64_t method) {
  support::stream s;
  s.set({41, 42}, 8, 0);
  for (std::size_t n : {1, 2, 3, 4, 15, 16, 17, 33, 70, 511, 513, 1023, 1025, 20011}) {
    plain::stream model = s.position();
    support::results<Real> r(n);
    ASSERT_EQ(l.draw(method, s, static_cast<std::int64_t>(n), r.data(), place, scale), 0);
    for (std::size_t i = 0; i < n; ++i) {
      const std::uint32_t first = model.next();
      const std::uint32_t second = l.words == 2 ? model.next() : 0;
      ASSERT_NO_FATAL_FAILURE(expect_value(r[i], l.value(first, second), place, scale, method != 0))
          << i;
    }
    ASSERT_TRUE(r.guards_intact());
    ASSERT_TRUE(support::same_position(s, model)) << n;
  }
}

template <class Real>
void compare_telling_words(const law<Real>& l) {
  support::stream s;
  const auto words = support::telling_words();
  for (std::size_t i = 0; i < words.size(); i += 4) {
    const plain::four w{words[i], words[i + 1], words[i + 2], words[i + 3]};
    const std::size_t n = 4 / l.words;
    const auto values = support::values_of_words<Real>(
        s, w, n, [&](auto&&... a) { return l.draw(0, a..., Real(0), Real(1)); });
    for (std::size_t k = 0; k < n; ++k) {
      const standard z = l.value(w[k * l.words], w[k * l.words + l.words - 1]);
      // Beyond the finite numbers the greatest one stands; below the normal ones bits are lost.
      if (std::fabs(z.value) > static_cast<long double>(std::numeric_limits<Real>::max())) {
        ASSERT_EQ(values[k], std::numeric_limits<Real>::max());
      } else if (std::fabs(z.value) < static_cast<long double>(std::numeric_limits<Real>::min())) {
        ASSERT_LE(std::fabs(values[k]), std::numeric_limits<Real>::min());
      } else {
        ASSERT_NO_FATAL_FAILURE(expect_value<Real>(values[k], z, 0, 1, false)) << std::hex << w[k];
      }
    }
  }
}

template <class Real>
void compare_laws() {
  for (const auto& l : laws<Real>()) {
    SCOPED_TRACE(l.name);
    for (const std::int64_t method : {0, RVX_RNG_METHOD_ACCURACY_FLAG}) {
      if (method != 0 && !l.accurate)
        continue;
      ASSERT_NO_FATAL_FAILURE(compare_law<Real>(l, 0, 1, method));
      ASSERT_NO_FATAL_FAILURE(compare_law<Real>(l, Real(-3.7), Real(2.25), method));
      ASSERT_NO_FATAL_FAILURE(compare_law<Real>(l, 1000, Real(1e-3), method));
    }
    ASSERT_NO_FATAL_FAILURE(compare_telling_words(l));
  }
}

TEST_F(closed_forms, are_their_formulas_in_float) {
  compare_laws<float>();
}
TEST_F(closed_forms, are_their_formulas_in_double) {
  compare_laws<double>();
}

// Values known by hand: u = 0, 1 and 1/2, and the ends of cauchy's range, where the float quarter
// turn lies beyond the true one.
TEST_F(closed_forms, ends) {
  support::stream s;
  const plain::four words{0x80000000, 0x7FFFFFFF, 0, 0x80000000};
  const auto draw = [&](auto routine) {
    return support::values_of_words<float>(
        s, words, 3, [&](auto&&... a) { return routine(0, a..., 1.0f, 2.0f); });
  };
  const auto exponential = draw(rvxsRngExponential);
  EXPECT_EQ(exponential[0], 1 + 2 * 103.278931f);
  EXPECT_EQ(exponential[1], 1);
  EXPECT_NEAR(exponential[2], 1 + 2 * std::log(2.0f), 1e-6);  // four units
  const auto gumbel = draw(rvxsRngGumbel);
  EXPECT_NEAR(gumbel[0], 1 + 2 * std::log(103.278931f), 4e-6);
  EXPECT_EQ(gumbel[1], 1 - 2 * 103.278931f);
  const auto cauchy = draw(rvxsRngCauchy);
  EXPECT_NEAR(cauchy[0], 2 * 22877332.0, 20);
  EXPECT_NEAR(cauchy[1], -2 * 22877332.0, 20);
  EXPECT_EQ(cauchy[2], 1);
}

template <class Real>
void expect_finite() {
  using limits = std::numeric_limits<Real>;
  support::stream s;
  const auto words = support::telling_words();
  for (const auto& l : laws<Real>()) {
    for (std::size_t i = 0; i < words.size(); i += 4) {
      const plain::four w{words[i], words[i + 1], words[i + 2], words[i + 3]};
      for (const Real place : {-limits::max(), Real(0), limits::max()}) {
        for (const Real scale : {limits::denorm_min(), Real(1), limits::max()}) {
          const auto draw = [&](auto&&... a) { return l.draw(0, a..., place, scale); };
          for (const Real x : support::values_of_words<Real>(s, w, 4 / l.words, draw))
            ASSERT_TRUE(std::isfinite(x)) << l.name << ' ' << place << ' ' << scale;
        }
      }
    }
  }
}

TEST_F(closed_forms, results_are_finite) {
  expect_finite<float>();
  expect_finite<double>();
}

// Shapes so small that the power leaves the finite numbers, or its exponent does.
TEST_F(closed_forms, small_shapes_of_weibull_are_finite) {
  support::stream s;
  const auto words = support::telling_words();
  std::size_t greatest = 0, none = 0;
  for (const float alpha : {std::numeric_limits<float>::denorm_min(), 1e-30f, 1e-3f}) {
    for (std::size_t i = 0; i < words.size(); i += 4) {
      const plain::four w{words[i], words[i + 1], words[i + 2], words[i + 3]};
      const auto draw = [&](auto&&... a) { return rvxsRngWeibull(0, a..., alpha, 0.0f, 1.0f); };
      for (const float x : support::values_of_words<float>(s, w, 4, draw)) {
        ASSERT_TRUE(std::isfinite(x)) << alpha;
        greatest += x == std::numeric_limits<float>::max();
        none += x == 0;
      }
    }
  }
  EXPECT_GT(greatest, 10u);
  EXPECT_GT(none, 10u);
}

TEST_F(closed_forms, threads_make_no_difference) {
  for (const auto& l : laws<float>())
    support::expect_same_on_threads<float>(
        200001, 1, [&](auto&&... a) { return l.draw(0, a..., 0.0f, 1.0f); });
  for (const std::size_t shift : {0, 1})
    support::expect_same_on_threads<float>(
        4200001, shift, [&](auto&&... a) { return rvxsRngExponential(0, a..., 0.0f, 1.0f); });
}

class closed_form_engines : public support::on_simd_target,
                            public testing::WithParamInterface<support::engine_case> {};

TEST_P(closed_form_engines, splits_and_words) {
  if (GetParam().code == RVX_BRNG_NONDETERM)
    GTEST_SKIP() << "its words cannot be drawn again";
  for (const auto& l : laws<double>()) {
    for (const std::size_t first : {1, 17, 1024}) {
      constexpr std::size_t n = 1501;
      support::any_stream whole = GetParam().make(), cut(whole), words(whole);
      std::vector<double> one(n), two(n);
      ASSERT_EQ(l.draw(0, whole, n, one.data(), 0.0, 1.0), 0);
      ASSERT_EQ(l.draw(0, cut, static_cast<std::int64_t>(first), two.data(), 0.0, 1.0), 0);
      ASSERT_EQ(l.draw(0, cut, static_cast<std::int64_t>(n - first), &two[first], 0.0, 1.0), 0);
      EXPECT_EQ(one, two) << l.name;
      words.words(l.words * n, GetParam().parts);
      const auto expected = words.words(9, GetParam().parts);
      EXPECT_EQ(whole.words(9, GetParam().parts), expected) << l.name;
      EXPECT_EQ(cut.words(9, GetParam().parts), expected) << l.name;
    }
  }
}

INSTANTIATE_TEST_SUITE_P(every, closed_form_engines, testing::ValuesIn(support::every_engine()),
                         support::engine_name<support::engine_case>);

}  // namespace
