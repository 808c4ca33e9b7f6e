// SPDX-License-Identifier: Apache-2.0
// Short calls of inverted laws climb the steps of the cdf one by one, long ones look them up in a
// table: the same values and the same words for every length up to 300, many laws, and words next
// to every step and at the ends.
#include <cmath>

#include "any_stream.hpp"
#include "distributions/scripted_words.hpp"

namespace {

using short_calls = support::on_simd_target;

constexpr std::size_t most = 300, long_call = 3000;

struct law {
  std::string name;
  support::routine draw;
  std::int32_t last;  // a value beyond which few words lead
};

std::vector<double> rates() {
  std::vector<double> all{5e-324, 1e-12, 1e-9, 1, 31.5, std::nextafter(32.0, 0.0)};
  for (double rate = 1e-4; rate < 32; rate *= 1.31)
    all.push_back(rate);
  return all;
}

std::vector<law> laws() {
  std::vector<law> all;
  const auto add = [&](const char* name, double of, std::int32_t last, support::routine draw) {
    all.push_back({name + std::to_string(of), std::move(draw), last});
  };
  for (const double rate : rates())
    for (const std::int64_t method : {0, 1})
      add("poisson ", rate, static_cast<std::int32_t>(rate + 9 * std::sqrt(rate) + 9),
          [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
            return rvxiRngPoisson(method, s, n, r, rate);
          });
  for (const double p : {1e-9, 0.01, 0.3, 0.5, 0.7, 0.99, 1 - 0x1p-53})
    add("binomial ", p, 40, [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
      return rvxiRngBinomial(0, s, n, r, 40, p);
    });
  for (const std::int32_t marked : {1, 10, 50, 60, 99})
    add("hypergeometric ", marked, 30, [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
      return rvxiRngHypergeometric(0, s, n, r, 100, 30, marked);
    });
  for (const double a : {1e-3, 0.5, 7.5, 99.0})
    add("negative binomial ", a, static_cast<std::int32_t>(2 * a + 50),
        [=](rvx_stream s, std::int64_t n, std::int32_t* r) {
          return rvxiRngNegbinomial(0, s, n, r, a, 0.51);
        });
  return all;
}

// Whether the first values of a long call and those of one of n values are the same.
void compare(const law& of, const support::any_stream& from, std::size_t n) {
  support::any_stream in_short = from, in_long = from, words = from;
  support::results<std::int32_t> r(n), expected(long_call);
  ASSERT_EQ(of.draw(in_short, static_cast<std::int64_t>(n), r.data()), 0);
  ASSERT_EQ(of.draw(in_long, long_call, expected.data()), 0);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(r[i], expected[i]) << of.name << ", value " << i << " of " << n;
  ASSERT_TRUE(r.guards_intact());
  words.skip(n);
  ASSERT_EQ(in_short.image(), words.image()) << of.name << ", " << n;
}

TEST_F(short_calls, of_every_length) {
  for (const law& of : laws()) {
    const support::any_stream start(RVX_BRNG_PHILOX4X32X10, {7});
    support::any_stream all = start;
    support::results<std::int32_t> expected(long_call);
    ASSERT_EQ(of.draw(all, long_call, expected.data()), 0);
    for (std::size_t n = 1; n <= most; ++n) {
      support::any_stream s = start, words = start;
      support::results<std::int32_t> r(n);
      ASSERT_EQ(of.draw(s, static_cast<std::int64_t>(n), r.data()), 0);
      for (std::size_t i = 0; i < n; ++i)
        ASSERT_EQ(r[i], expected[i]) << of.name << ", value " << i << " of " << n;
      ASSERT_TRUE(r.guards_intact());
      words.skip(n);
      ASSERT_EQ(s.image(), words.image()) << of.name << ", " << n;
    }
  }
}

// Steps as short calls have them; those of long calls must lie between the same words.
TEST_F(short_calls, next_to_every_step) {
  constexpr plain::two key{3, 4};
  std::size_t compared = 0;
  for (const law& of : laws()) {
    support::stream s;
    for (const std::uint64_t step : support::scripted(of.draw).steps(1, of.last)) {
      const std::uint64_t end = support::word_count - 1;
      const std::uint64_t above = std::min(step, end), below = above == 0 ? 0 : above - 1;
      const plain::four block{support::word_at(below), support::word_at(above), support::word_at(0),
                              support::word_at(end)};
      const plain::u128 at = plain::counter_of(block, key);
      std::int32_t expected[most], r[4];
      s.set(key, at, 0);
      ASSERT_EQ(of.draw(s, most, expected), 0);
      s.set(key, at, 0);
      ASSERT_EQ(of.draw(s, 4, r), 0);
      for (unsigned i = 0; i < 4; ++i)
        ASSERT_EQ(r[i], expected[i]) << of.name << ", step " << step << ", word " << i;
      ++compared;
    }
  }
  EXPECT_GT(compared, 2000u);
}

// Words of mcg59 may round to 1, which no step lies above.
TEST_F(short_calls, of_a_number_that_rounds_to_1) {
  const support::any_stream greatest(RVX_BRNG_MCG59, {0xFFFFFFFF, 0x07FFFFFF});
  double u = 0;
  ASSERT_EQ(rvxdRngUniform(0, support::any_stream(greatest), 1, &u, 0, 1), 0);
  ASSERT_EQ(u, 1);
  for (const law& of : laws())
    for (const std::size_t n : {1u, 2u, 9u, 63u, 64u, 127u, 128u})
      ASSERT_NO_FATAL_FAILURE(compare(of, greatest, n));
}

// A category for each trial, from a table of guides or not, as rows are many or few.
TEST_F(short_calls, of_few_rows_of_multinomial) {
  constexpr std::int32_t trials = 3, categories = 5;
  constexpr double p[categories] = {0.125, 0.25, 0, 0.5, 0.125};
  const law of{"multinomial",
               [&](rvx_stream s, std::int64_t n, std::int32_t* r) {
                 return rvxiRngMultinomial(0, s, n, r, trials, categories, p);
               },
               0};
  const support::any_stream start(RVX_BRNG_PHILOX4X32X10, {8});
  support::any_stream all = start;
  support::results<std::int32_t> expected(categories * most);
  ASSERT_EQ(of.draw(all, most, expected.data()), 0);
  for (std::size_t rows = 1; rows <= most; ++rows) {
    support::any_stream s = start, words = start;
    support::results<std::int32_t> r(categories * rows);
    ASSERT_EQ(of.draw(s, static_cast<std::int64_t>(rows), r.data()), 0);
    for (std::size_t i = 0; i < categories * rows; ++i)
      ASSERT_EQ(r[i], expected[i]) << "number " << i << " of " << rows << " rows";
    ASSERT_TRUE(r.guards_intact());
    words.skip(trials * rows);
    ASSERT_EQ(s.image(), words.image());
  }
}

}  // namespace
