// SPDX-License-Identifier: Apache-2.0
// The polynomials behind the proofs of the period, against the definitions bit by bit, and the two
// proofs against each other.
#include <bitset>
#include <random>
#include <vector>

#include <gtest/gtest.h>

#include "mt2203/characteristic.hpp"
#include "mt2203/decimation.hpp"
#include "mt2203/gf2_multiply.hpp"
#include "mt2203/irreducible.hpp"
#include "mt2203/sieve.hpp"

namespace {

using namespace tarn::mt2203;
using bits = std::bitset<gf2::product_words * 64>;

bits bits_of(const std::uint64_t* word, std::size_t count) {
  bits result;
  for (std::size_t i = 0; i < 64 * count; ++i)
    result[i] = (word[i / 64] >> i % 64 & 1) != 0;
  return result;
}

bits bits_of(const gf2::polynomial& x) {
  return bits_of(x.word.data(), gf2::words);
}

bits slow_product(const gf2::polynomial& x, const gf2::polynomial& y) {
  const bits factor = bits_of(x), other = bits_of(y);
  bits result;
  for (std::size_t i = 0; i < 64 * gf2::words; ++i)
    if (factor[i])
      result ^= other << i;
  return result;
}

bits slow_remainder(bits x, const gf2::polynomial& f) {
  const bits divisor = bits_of(f);
  for (std::size_t i = x.size() - 1; i >= gf2::degree; --i)
    if (x[i])
      x ^= divisor << (i - gf2::degree);
  return x;
}

// Random coefficients below t^limit.
gf2::polynomial random_polynomial(std::mt19937_64& random, int limit) {
  gf2::polynomial x;
  for (int i = 0; i < limit; ++i)
    x.word[static_cast<std::size_t>(i / 64)] |= (random() & 1) << i % 64;
  return x;
}

// A candidate as the table's rows are: bit 31 set.
std::uint32_t random_matrix_word(std::mt19937_64& random) {
  return 0x80000000u | static_cast<std::uint32_t>(random());
}

void expect_right_products(const gf2::multiplier& way) {
  std::mt19937_64 random(1);
  const int ranges[][2] = {{0, 70}, {0, 35}, {35, 70}, {1, 2}, {17, 53}, {69, 70}};
  for (int round = 0; round < 4; ++round) {
    const gf2::polynomial x = random_polynomial(random, 64 * gf2::words);
    const gf2::polynomial y = random_polynomial(random, 64 * gf2::words);
    const bits expected = slow_product(x, y);
    for (const auto& range : ranges) {
      gf2::product out;
      out.fill(0x5555555555555555);
      way.multiply(x, y, range[0], range[1], out);
      for (int i = range[0]; i < range[1]; ++i) {
        const bits word = bits_of(&out[static_cast<std::size_t>(i)], 1);
        ASSERT_EQ(word, (expected >> static_cast<std::size_t>(64 * i)) & bits(~0ull)) << i;
      }
    }
    gf2::product square;
    square.fill(0x5555555555555555);
    way.square(x, square);
    ASSERT_EQ(bits_of(square.data(), square.size()), slow_product(x, x));
  }
}

TEST(gf2, portable_products) {
  expect_right_products(gf2::portable_multiplier);
}

TEST(gf2, carryless_products) {
  if (!gf2::carryless_available())
    GTEST_SKIP() << "this processor has no carry-less multiplication";
  expect_right_products(gf2::carryless_multiplier);
}

TEST(gf2, remainders) {
  std::mt19937_64 random(2);
  for (int round = 0; round < 4; ++round) {
    const gf2::polynomial f = random_polynomial(random, gf2::degree) + gf2::monomial(gf2::degree);
    const gf2::modulus modulo(f);
    const gf2::polynomial x = random_polynomial(random, gf2::degree);
    const gf2::polynomial y = random_polynomial(random, gf2::degree);
    EXPECT_EQ(bits_of(modulo.multiply(x, y)), slow_remainder(slow_product(x, y), f));
    EXPECT_EQ(bits_of(modulo.square(x)), slow_remainder(slow_product(x, x), f));
  }
}

TEST(gf2, coprime_finds_a_common_factor) {
  std::mt19937_64 random(3);
  const gf2::polynomial one = gf2::monomial(0);
  const gf2::polynomial factor = gf2::monomial(20) + gf2::monomial(3) + one;
  for (int round = 0; round < 20; ++round) {
    const gf2::polynomial x = random_polynomial(random, 1000) + gf2::monomial(1000);
    const gf2::polynomial odd = (x.word[0] & 1) != 0 ? x : x + one;
    const gf2::polynomial common = gf2::short_multiply(odd, factor);
    EXPECT_FALSE(coprime(common, gf2::short_multiply(random_polynomial(random, 900), factor)));
    EXPECT_FALSE(coprime(common, gf2::polynomial{}));
    EXPECT_TRUE(coprime(common, gf2::monomial(round)));
    EXPECT_TRUE(coprime(common, common + gf2::monomial(round)));
  }
}

// The recurrence itself satisfies the polynomial: so does every bit of its words.
TEST(characteristic_polynomial, annuls_the_sequence) {
  std::mt19937_64 random(4);
  for (int round = 0; round < 3; ++round) {
    const std::uint32_t a = random_matrix_word(random);
    const bits f = bits_of(characteristic_polynomial(a));
    EXPECT_TRUE(f[gf2::degree] && (f >> (gf2::degree + 1)).none());
    std::vector<std::uint32_t> x(69);
    for (std::uint32_t& word : x)
      word = static_cast<std::uint32_t>(random());
    while (x.size() < 2 * gf2::degree) {
      const std::size_t k = x.size() - 69;
      const std::uint32_t y = (x[k] & 0xFFFFFFE0) | (x[k + 1] & 0x1F);
      x.push_back(x[k + 34] ^ y >> 1 ^ (y % 2 == 1 ? a : 0));
    }
    for (std::size_t k = 1; k < 50; ++k) {  // the lower bits of word 0 are not part of the state
      std::uint32_t sum = 0;
      for (std::size_t i = 0; i <= gf2::degree; ++i)
        sum ^= f[i] ? x[k + i] : 0;
      EXPECT_EQ(sum, 0u) << k;
    }
  }
}

// t^(2^k) - t holds all factors whose degrees divide k: together those for k = 1..14 hold what the
// sieve looks for, and t and t + 1, which never divide when bit 31 is set.
TEST(sieve, finds_exactly_the_factors_of_small_degree) {
  std::mt19937_64 random(5);
  const small_factor_sieve sieve;
  const gf2::polynomial t = gf2::monomial(1);
  int passed = 0;
  constexpr int rounds = 300;
  for (int round = 0; round < rounds; ++round) {
    const std::uint32_t a = random_matrix_word(random);
    const gf2::polynomial f = characteristic_polynomial(a);
    const gf2::modulus modulo(f);
    gf2::polynomial power = t, together = gf2::monomial(0);
    for (int k = 1; k <= small_factor_sieve::highest_degree; ++k) {
      power = modulo.square(power);
      together = modulo.multiply(together, power + t);
    }
    EXPECT_EQ(sieve.passes(a), coprime(f, together)) << a;
    passed += sieve.passes(a) ? 1 : 0;
  }
  EXPECT_GT(passed, 0);
  EXPECT_LT(passed, rounds);
}

// The two proofs share no code. The lanes hold candidates that the sieve lets through, of which
// about one in 84 is irreducible, and a few that are known to be.
TEST(irreducible, agrees_with_inversive_decimation) {
  std::mt19937_64 random(6);
  const small_factor_sieve sieve;
  std::array<std::uint32_t, decimation_lanes> a;
  constexpr std::size_t irreducible_lanes = 3;
  for (std::size_t i = 0; i < a.size(); ++i)
    do {
      a[i] = random_matrix_word(random);
    } while (!sieve.passes(a[i]) || (i < irreducible_lanes && !irreducible(a[i])));
  const auto proved = irreducible_by_decimation(a);
  std::size_t found = 0;
  for (std::size_t i = 0; i < a.size(); ++i) {
    EXPECT_EQ(proved[i], irreducible(a[i])) << a[i];
    found += proved[i] ? 1 : 0;
  }
  EXPECT_GE(found, irreducible_lanes);
  EXPECT_LT(found, a.size());
}

}  // namespace
