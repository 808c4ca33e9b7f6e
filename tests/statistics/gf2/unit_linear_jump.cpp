// SPDX-License-Identifier: Apache-2.0
// The table of minimal polynomials from first principles, and the jump and its kernels against
// drawing and against arithmetic bit by bit, under each SIMD target.
#include "../../kat/kat_file.hpp"
#include "../../models/block_model.hpp"
#include "../../models/jump_model.hpp"
#include "../../models/sfmt_model.hpp"
#include "gf2/linear_jump.hpp"
#include "gf2/residue.hpp"
#include "support.hpp"
#include "tables/minimal_polynomials.hpp"

namespace {

using tarn::statistics::jump;
using tarn::statistics::jump_polynomial;
using tarn::statistics::jump_terms;
using tarn::statistics::mt19937_minimal;
using tarn::statistics::sfmt19937_minimal;
namespace gf2 = tarn::statistics::gf2;

using numbers = std::vector<std::uint32_t>;
using residue = std::vector<std::uint64_t>;

constexpr std::size_t block = 624;  // words of either recurrence

numbers random_words(support::test_data& data, std::size_t n) {
  numbers words(n);
  for (std::uint32_t& word : words)
    word = static_cast<std::uint32_t>(data());
  return words;
}

// The n words that begin with the given ones.
numbers mt19937_words(const numbers& first, std::size_t n) {
  tarn_test::sequence<tarn_test::mt19937_rule> s(first);
  numbers words;
  for (std::size_t i = 0; i < n; ++i)
    words.push_back(s.word(i));
  return words;
}
numbers sfmt19937_words(const numbers& first, std::size_t n) {
  tarn_test::sfmt_model model(first);
  numbers words;
  for (std::size_t i = 0; i < n; ++i)
    words.push_back(static_cast<std::uint32_t>(model.element(i / 4) >> 32 * (i % 4)));
  return words;
}

struct recurrence {
  const jump_polynomial& minimal;
  std::size_t stride;
  numbers (*words)(const numbers& first, std::size_t n);
  std::size_t state_begins;  // the first word whose bits all obey the recurrence
};
const recurrence mt19937{mt19937_minimal, 1, mt19937_words, 1};
const recurrence sfmt19937{sfmt19937_minimal, 4, sfmt19937_words, 0};

bool term(const jump_polynomial& p, std::size_t i) {
  return i == p.degree || (i < p.degree && (p.low[i / 64] >> i % 64 & 1) != 0);
}

// As many elements as the state has are zero; the others follow from them.
void expect_annihilated(const recurrence& r, const numbers& first) {
  const numbers x = r.words(first, r.state_begins + (jump_terms + 1) * r.stride + block);
  numbers sum(block);
  for (std::size_t i = 0; i <= r.minimal.degree; ++i) {
    if (!term(r.minimal, i))
      continue;
    for (std::size_t j = 0; j < block; ++j)
      sum[j] ^= x[r.state_begins + i * r.stride + j];
  }
  EXPECT_EQ(sum, numbers(block));
}

class polynomials : public testing::TestWithParam<const recurrence*> {};

TEST_P(polynomials, annihilate_every_bit) {
  support::test_data data(1);
  for (int round = 0; round < 5; ++round)
    expect_annihilated(*GetParam(), random_words(data, block));
  for (int round = 0; round < 5; ++round) {
    numbers one_bit(block);
    one_bit[1 + data.below(block - 1)] = 1u << data.below(32);
    expect_annihilated(*GetParam(), one_bit);
  }
}

// One bit alone obeys nothing shorter: Berlekamp and Massey find the same polynomial.
TEST_P(polynomials, are_minimal) {
  const recurrence& r = *GetParam();
  support::test_data data(2);
  const numbers x = r.words(random_words(data, block), (2 * jump_terms + 1) * r.stride);
  const tarn_test::jump_model model(
      jump_terms, [&](std::size_t i) { return (x[r.state_begins + i * r.stride] & 1) != 0; });
  ASSERT_EQ(model.degree(), r.minimal.degree);
  std::vector<std::size_t> low;  // of t^degree modulo the polynomial: the other terms
  for (std::size_t i = 0; i < r.minimal.degree; ++i) {
    if (term(r.minimal, i))
      low.push_back(i);
  }
  EXPECT_EQ(model.terms(r.minimal.degree), low);
}

TEST_P(polynomials, are_such_that_the_reduction_holds) {
  const jump_polynomial& p = GetParam()->minimal;
  EXPECT_LE(p.degree, jump_terms);
  EXPECT_GT(p.degree, jump_terms - 64);
  for (std::size_t i = p.degree - 128; i < 64 * tarn::statistics::polynomial_words; ++i)
    EXPECT_EQ(p.low[i / 64] >> i % 64 & 1, 0u) << i;
}

INSTANTIATE_TEST_SUITE_P(table, polynomials, testing::Values(&mt19937, &sfmt19937));

// x^2 t^odd modulo t^19968 + low, bit by bit.
residue plain_square(const residue& low, int odd, const residue& x) {
  const std::size_t words = gf2::residue_words;
  residue n(2 * words);
  for (std::size_t i = 0; i < jump_terms; ++i) {
    const std::size_t to = 2 * i + static_cast<std::size_t>(odd);
    n[to / 64] |= (x[i / 64] >> i % 64 & 1) << to % 64;
  }
  for (std::size_t i = 2 * jump_terms; i-- > jump_terms;) {
    if ((n[i / 64] >> i % 64 & 1) == 0)
      continue;
    const std::size_t whole = (i - jump_terms) / 64, rest = i % 64;
    for (std::size_t j = 0; j < words; ++j) {
      n[j + whole] ^= low[j] << rest;
      if (rest != 0)
        n[j + whole + 1] ^= low[j] >> (64 - rest);
    }
  }
  n.resize(words);
  return n;
}

using kernels = support::on_simd_target;

TEST_F(kernels, squares_equal_arithmetic_bit_by_bit) {
  support::test_data data(3);
  for (int kind = 0; kind < 16; ++kind) {
    // All ones, few ones, or anything, in either factor.
    const auto fill = [&data](int how, std::size_t n) {
      residue words(gf2::residue_words);
      for (std::size_t i = 0; i < n; ++i)
        words[i] = how == 0 ? ~std::uint64_t{0} : how == 1 ? data() & data() & data() : data();
      if (how == 3)
        std::fill_n(words.begin(), n - 1, 0);
      return words;
    };
    const residue low = fill(kind / 4, gf2::residue_words - 2);
    const residue x = fill(kind % 4, gf2::residue_words);
    for (int odd = 0; odd < 2; ++odd) {
      residue squared = x;
      gf2::square(low.data(), odd, squared.data());
      ASSERT_EQ(squared, plain_square(low, odd, x)) << "kind " << kind << ", odd " << odd;
    }
  }
}

TEST_F(kernels, windows_of_every_length) {
  support::test_data data(4);
  const numbers words = random_words(data, 3000);
  for (std::size_t count = 0; count <= 300; ++count) {
    numbers first(data.below(20));
    numbers expected(count);
    for (std::uint32_t& from : first) {
      from = static_cast<std::uint32_t>(data.below(words.size() - count + 1));
      for (std::size_t i = 0; i < count; ++i)
        expected[i] ^= words[from + i];
    }
    support::results<std::uint32_t> r(count);
    gf2::sum_windows(words.data(), first.data(), first.size(), count, r.data());
    for (std::size_t i = 0; i < count; ++i)
      ASSERT_EQ(r[i], expected[i]);
    ASSERT_TRUE(r.guards_intact());
  }
}

using jumps = support::on_simd_target;

numbers jumped(const recurrence& r, std::uint64_t distance, const numbers& first,
               std::size_t count = block) {
  const numbers x = r.words(first, jump_terms * r.stride + std::max(count, block));
  support::results<std::uint32_t> out(count);
  jump(r.minimal, distance, x.data(), r.stride, count, out.data());
  EXPECT_TRUE(out.guards_intact());
  numbers words;
  for (std::size_t i = 0; i < count; ++i)
    words.push_back(out[i]);
  return words;
}

TEST_F(jumps, equal_the_sequence) {
  support::test_data data(5);
  for (const recurrence* r : {&mt19937, &sfmt19937}) {
    const numbers first = random_words(data, block);
    const numbers x = r->words(first, 100000 * r->stride + 2 * block);
    for (const std::uint64_t distance :
         {std::uint64_t{0}, std::uint64_t{1}, std::uint64_t{30}, std::uint64_t{31},
          std::uint64_t{32}, std::uint64_t{jump_terms - 1}, std::uint64_t{jump_terms},
          std::uint64_t{jump_terms + 1}, std::uint64_t{65535}, std::uint64_t{65536},
          std::uint64_t{99999}}) {
      for (const std::size_t count : {std::size_t{1}, std::size_t{100}, block, block + 1}) {
        const auto from = x.begin() + static_cast<std::ptrdiff_t>(distance * r->stride);
        ASSERT_EQ(jumped(*r, distance, first, count),
                  numbers(from, from + static_cast<std::ptrdiff_t>(count)))
            << distance << " steps of " << r->stride;
      }
    }
  }
}

TEST_F(jumps, add_up) {
  support::test_data data(6);
  for (const recurrence* r : {&mt19937, &sfmt19937}) {
    const std::pair<std::uint64_t, std::uint64_t> cases[] = {
        {std::uint64_t{1} << 63, (std::uint64_t{1} << 63) - 1},
        {~std::uint64_t{0}, 0},
        {data() >> 1, data() >> 1},
        {data() >> 20, data() >> 40}};
    for (const auto& [a, b] : cases) {
      const numbers first = random_words(data, block);
      ASSERT_EQ(jumped(*r, a + b, first), jumped(*r, b, jumped(*r, a, first))) << a << " + " << b;
    }
  }
}

// The published jump of 2^128 steps: t^(2^128) by squaring alone.
TEST_F(jumps, published_one_of_2_to_the_128) {
  std::uint32_t seed = 0;
  int answers = 0;
  residue x(gf2::residue_words);
  x[0] = 2;  // t
  for (int i = 0; i < 128; ++i)
    gf2::square(sfmt19937_minimal.low, 0, x.data());  // of degree 19968 as it is
  numbers terms;
  for (std::uint32_t i = 0; i < jump_terms; ++i) {
    if ((x[i / 64] >> i % 64 & 1) != 0)
      terms.push_back(4 * i);
  }
  for (const tarn::kat::line& line : tarn::kat::read_file(TARN_KAT_FOLDER, "sfmt19937")) {
    if (line.fields.at(0) == "seed")
      seed = tarn::kat::words(line, 1, 2, 10)[0];
    if (line.fields.at(0) != "jump_steps128" ||
        line.fields.at(1) != "340282366920938463463374607431768211456")
      continue;
    const numbers expected = tarn::kat::answers(line, 6, 10);
    numbers words =
        sfmt19937_words(tarn_test::sfmt_from_seed(seed), block + 4 * jump_terms + expected.size());
    numbers sum(expected.size());
    gf2::sum_windows(words.data() + block, terms.data(), terms.size(), sum.size(), sum.data());
    EXPECT_EQ(sum, expected);
    ++answers;
  }
  EXPECT_EQ(answers, 4);
}

}  // namespace
