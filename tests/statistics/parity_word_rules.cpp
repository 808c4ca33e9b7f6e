// SPDX-License-Identifier: Apache-2.0
// Uniform reals and integers of every engine against the rule of its words computed plainly: the
// word as a number, rounded once to the type of the result, times scale plus offset with one
// rounding. Bit for bit, under each SIMD target.
#include <cmath>
#include <limits>

#include "every_engine.hpp"
#include "uniform_calls.hpp"

namespace {

using support::bits;

using support::any_stream;
using support::engine_case;

// The rule of each engine, from the definition of its words.
template <class Real>
Real plain_rule(std::int64_t code, std::uint64_t word, Real lo, Real hi) {
  const bool is_float = sizeof(Real) == sizeof(float);
  const auto narrow = static_cast<std::uint32_t>(word);
  switch (code) {
    case RVX_BRNG_PHILOX4X32X10:
      return std::fma(static_cast<Real>(static_cast<std::int32_t>(narrow)),
                      (hi - lo) * Real(0x1p-32), (lo + hi) * Real(0.5));
    case RVX_BRNG_MRG32K3A:
      return std::fma(static_cast<Real>(narrow),
                      (hi - lo) / (is_float ? Real(4294967040.0) : Real(4294967087.0)), lo);
    case RVX_BRNG_MCG31:
      return std::fma(static_cast<Real>(narrow),
                      is_float ? (hi - lo) * Real(0x1p-31) : (hi - lo) / Real(2147483647.0), lo);
    case RVX_BRNG_MCG59:
      return std::fma(static_cast<Real>(word), (hi - lo) * Real(0x1p-59), lo);
    default:
      return std::fma(static_cast<Real>(narrow), (hi - lo) * Real(0x1p-32), lo);
  }
}

class word_rules : public support::on_simd_target, public testing::WithParamInterface<engine_case> {
 protected:
  const engine_case& engine() const { return GetParam(); }

  // n words of a copy of the stream.
  std::vector<std::uint64_t> words_ahead(const any_stream& s, std::size_t n) const {
    any_stream copy = s;
    const auto parts = copy.words(n, engine().parts);
    std::vector<std::uint64_t> words(n);
    for (std::size_t i = 0; i < n; ++i)
      words[i] =
          engine().parts == 2 ? parts[2 * i] | std::uint64_t{parts[2 * i + 1]} << 32 : parts[i];
    return words;
  }

  template <class Real>
  void compare(Real a, Real b, std::size_t n) {
    const bool accurate = n % 2 == 0;
    any_stream s = engine().make();
    static_cast<void>(s.words(n % 5, engine().parts));
    const auto words = words_ahead(s, n);
    any_stream reference = s;
    static_cast<void>(reference.words(n, engine().parts));
    support::results<Real> r(n);
    ASSERT_EQ(support::draw_uniform(accurate ? RVX_RNG_METHOD_UNIFORM_STD_ACCURATE : 0, s, n,
                                    r.data(), a, b),
              0);
    for (std::size_t i = 0; i < n; ++i) {
      Real x = plain_rule<Real>(engine().code & ~std::int64_t{0xFFFFF}, words[i], a, b);
      if (accurate)
        x = std::fmin(std::fmax(x, a), b);
      ASSERT_EQ(bits(r[i]), bits(x)) << "word " << words[i] << " on [" << a << ", " << b << ")";
    }
    EXPECT_TRUE(r.guards_intact());
    EXPECT_EQ(s.image(), reference.image()) << "one word for one result";
  }

  template <class Real>
  void compare_ranges() {
    for (std::size_t n = 0; n <= 70; ++n)
      ASSERT_NO_FATAL_FAILURE(compare<Real>(0, 1, n));
    for (std::size_t n : {511u, 512u, 513u, 1023u, 1024u, 1025u, 3000u, 50001u, 200000u})
      ASSERT_NO_FATAL_FAILURE(compare<Real>(Real(-0.3), Real(0.7), n));
    support::test_data data(9);
    for (int round = 0; round < 50; ++round) {
      const auto a = static_cast<Real>(std::ldexp(static_cast<double>(data() >> 11), -50));
      const auto b = a + static_cast<Real>(std::ldexp(static_cast<double>(data() >> 11), -50));
      ASSERT_NO_FATAL_FAILURE(compare<Real>(a, b, 400 + data.below(300)));
    }
  }
};

// Those whose words can be drawn twice.
class repeated_word_rules : public word_rules {};

TEST_P(repeated_word_rules, floats) {
  compare_ranges<float>();
}

TEST_P(repeated_word_rules, doubles) {
  compare_ranges<double>();
}

TEST_P(repeated_word_rules, integers_are_the_floor_of_floats) {
  for (std::size_t n : {1u, 5u, 64u, 1025u, 5000u}) {
    any_stream s = engine().make();
    const auto words = words_ahead(s, n);
    support::results<std::int32_t> r(n);
    ASSERT_EQ(rvxiRngUniform(0, s, static_cast<std::int64_t>(n), r.data(), -1000, 77), 0);
    for (std::size_t i = 0; i < n; ++i) {
      const float x =
          plain_rule<float>(engine().code & ~std::int64_t{0xFFFFF}, words[i], -1000, 77);
      ASSERT_EQ(r[i], static_cast<std::int32_t>(std::floor(x)));
    }
    EXPECT_TRUE(r.guards_intact());
  }
}

TEST_P(word_rules, reals_lie_in_their_range_and_fill_it) {
  constexpr std::size_t n = 20000;
  any_stream s = engine().make();
  support::results<double> r(n);
  ASSERT_EQ(support::draw_uniform(0, s, n, r.data(), 2, 5), 0);
  double least = 5, greatest = 2, sum = 0;
  for (std::size_t i = 0; i < n; ++i) {
    ASSERT_TRUE(2 <= r[i] && r[i] <= 5);
    least = std::min(least, r[i]);
    greatest = std::max(greatest, r[i]);
    sum += r[i];
  }
  // For fair numbers: P(least > 2.01) < 1e-29; the mean has a deviation of 3 / sqrt(12 n) = 0.0061,
  // and 0.06 is ten of them.
  EXPECT_LT(least, 2.01);
  EXPECT_GT(greatest, 4.99);
  EXPECT_NEAR(sum / n, 3.5, 0.06);
}

INSTANTIATE_TEST_SUITE_P(each, word_rules, testing::ValuesIn(support::every_engine()),
                         support::engine_name<engine_case>);

std::vector<engine_case> repeating_engines() {
  auto chosen = support::every_engine();
  chosen.erase(std::remove_if(chosen.begin(), chosen.end(),
                              [](const engine_case& e) { return e.code == RVX_BRNG_NONDETERM; }),
               chosen.end());
  return chosen;
}
INSTANTIATE_TEST_SUITE_P(each, repeated_word_rules, testing::ValuesIn(repeating_engines()),
                         support::engine_name<engine_case>);

// Words of mcg59 of every length, in every lane: a word below 2^53 keeps all of its bits on the way
// to a float, a longer one is rounded once. Small words are too rare to meet them in a run, so each
// is put where it is wanted by a skip back, over the period of 2^57 words.
class words_of_mcg59 : public support::on_simd_target {};

TEST_F(words_of_mcg59, of_every_length_are_rounded_once) {
  constexpr std::size_t n = 33;
  for (int length = 1; length <= 59; ++length) {
    for (std::uint64_t pattern : {0ull, ~0ull, 0x5555555555555555ull, 0x10000001ull, 0x13ull}) {
      const std::uint64_t top = std::uint64_t{1} << (length - 1);
      const std::uint64_t word = top | (pattern & (top - 1)) | 1;  // words of mcg59 are odd
      const std::size_t place = static_cast<std::size_t>(length) % n;
      any_stream s(RVX_BRNG_MCG59,
                   {static_cast<std::uint32_t>(word), static_cast<std::uint32_t>(word >> 32)});
      s.skip((std::uint64_t{1} << 57) - place);
      any_stream same = s;
      support::results<float> reals(n);
      support::results<double> long_reals(n);
      ASSERT_EQ(rvxsRngUniform(0, s, n, reals.data(), 0, 1), 0);
      ASSERT_EQ(rvxdRngUniform(0, same, n, long_reals.data(), 0, 1), 0);
      ASSERT_EQ(bits(reals[place]), bits(plain_rule<float>(RVX_BRNG_MCG59, word, 0, 1))) << word;
      ASSERT_EQ(bits(long_reals[place]), bits(plain_rule<double>(RVX_BRNG_MCG59, word, 0, 1)))
          << word;
    }
  }
}

}  // namespace
