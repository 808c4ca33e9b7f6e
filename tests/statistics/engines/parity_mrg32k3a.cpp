// SPDX-License-Identifier: Apache-2.0
// The engine mrg32k3a against its recurrence on plain integers.
#include <cfenv>

#include "plain_mrg32k3a.hpp"

namespace {

using plain_mrg::cpp_int;
using plain_mrg::m1;
using plain_mrg::m2;
using plain_mrg::model;
using plain_mrg::stream;
using words = support::on_simd_target;

constexpr auto last1 = static_cast<std::uint32_t>(m1 - 1);
constexpr auto last2 = static_cast<std::uint32_t>(m2 - 1);

void draw_and_compare(stream& s, model& m, std::size_t n) {
  const std::vector<std::uint32_t> drawn = s.words(n);
  ASSERT_EQ(drawn.size(), n);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(drawn[i], m.next()) << "word " << i << " of " << n;
  ASSERT_TRUE(s.place() == m) << "after " << n << " words";
}

model any_place(support::test_data& data) {
  return {{static_cast<std::uint32_t>(data() % m1), static_cast<std::uint32_t>(data() % m1), 1},
          {static_cast<std::uint32_t>(data() % m2), static_cast<std::uint32_t>(data() % m2), 1}};
}

const model edges[] = {
    {{1, 1, 1}, {1, 1, 1}},
    {{last1, last1, last1}, {last2, last2, last2}},
    {{0, 0, last1}, {last2, 0, 0}},
    {{last1, 0, 0}, {0, 0, last2}},
    {{last1 / 2, last1 / 2 + 1, last1 / 2 - 1}, {last2 / 2, last2 / 2 + 1, last2 / 2 - 1}},
    {{0, last1, 0}, {0, last2, 0}},
};

TEST_F(words, every_count_from_every_edge) {
  for (const model& edge : edges) {
    for (std::size_t n = 0; n <= 300; ++n) {
      stream s(edge);
      model m = edge;
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, n));
    }
    for (std::size_t n = 1000; n <= 1050; ++n) {
      stream s(edge);
      model m = edge;
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, n));
    }
  }
}

// Rounds from many starts, so that the starts of all lanes are seen with many values.
TEST_F(words, rounds_from_many_places) {
  support::test_data data(1);
  for (int round = 0; round < 500; ++round) {
    const model place = any_place(data);
    stream s(place);
    model m = place;
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, 1024 + data.below(1200)));
  }
}

TEST_F(words, long_runs_on_one_thread_and_shared_out) {
  const int before = tarn_serv_get_max_threads();
  for (int threads : {1, 4}) {
    tarn_serv_set_max_threads(threads);
    stream s{1, 2, 3, 4, 5, 6};
    model m = s.place();
    for (std::size_t n : {3'000'003u, 131'072u, 262'145u})
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, n)) << threads << " threads";
  }
  tarn_serv_set_max_threads(before);
}

TEST_F(words, every_split_gives_the_serial_stream_and_one_image) {
  for (std::size_t total : {41u, 150u, 1100u}) {
    stream whole{5};
    whole.words(total);
    for (std::size_t first = 0; first <= total; ++first) {
      stream s{5};
      model m = s.place();
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, first));
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, total - first));
      ASSERT_EQ(s.image(), whole.image());
    }
  }
  support::test_data data(2);
  stream s{77};
  model m = s.place();
  for (int call = 0; call < 200; ++call)
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, data.below(5000)));
}

// Equal values of both recurrences give m1, never 0. The values before are solved for: the next x
// is -810728 x(n-3) and the next y is -1370589 y(n-3) where the others are zero.
TEST_F(words, equal_values_give_the_first_modulus) {
  const auto inverse = [](std::int64_t of, std::int64_t modulus) {
    const cpp_int inverse_of = powm(cpp_int(of), cpp_int(modulus - 2), cpp_int(modulus));
    return inverse_of;
  };
  for (const std::int64_t value : {std::int64_t{0}, std::int64_t{1}, m2 / 2, m2 - 1}) {
    const auto x0 = static_cast<std::uint32_t>(inverse(m1 - 810728, m1) * value % m1);
    const auto y0 = static_cast<std::uint32_t>(inverse(m2 - 1370589, m2) * value % m2);
    // With value 0 the newest ones keep the triples from being all zero: x(n-1) has no part in
    // the next x, and y(n-2) none in the next y.
    const model place = {{x0, 0, 1}, {y0, 1, 0}};
    for (std::size_t n : {1u, 1024u}) {
      stream s(place);
      model m = place;
      EXPECT_EQ(s.words(n)[0], m1) << value;
      EXPECT_EQ(m.next(), m1) << value;
    }
  }
}

// Words are integers: they do not follow the rounding mode of the calling thread. (Kernels for
// processors without SSE4.1 have no rounding instruction and are only right in the usual mode.)
TEST_F(words, do_not_depend_on_the_rounding_mode) {
  const char* target = std::getenv("TARN_SIMD_TARGET");
  if (target != nullptr && std::string(target) == "SSSE3")
    GTEST_SKIP() << "rounds by the mode of the thread";
  for (const int mode : {FE_DOWNWARD, FE_UPWARD, FE_TOWARDZERO}) {
    stream s{3, 1, 4, 1, 5, 9};
    model m = s.place();
    ASSERT_EQ(std::fesetround(mode), 0);
    const std::vector<std::uint32_t> drawn = s.words(100'000);
    std::fesetround(FE_TONEAREST);
    for (std::size_t i = 0; i < drawn.size(); ++i)
      ASSERT_EQ(drawn[i], m.next()) << "word " << i << ", mode " << mode;
  }
}

TEST_F(words, skips_add_up_and_equal_drawing) {
  support::test_data data(3);
  for (int round = 0; round < 300; ++round) {
    const std::size_t a = data.below(3000), b = data.below(300);
    const model place = any_place(data);
    stream once(place), twice(place), drawn(place);
    model m = place;
    for (std::size_t i = 0; i < a + b; ++i)
      m.next();
    once.skip(a + b);
    twice.skip(a);
    twice.skip(b);
    drawn.words(a);
    drawn.skip(b);
    ASSERT_TRUE(once.place() == m);
    ASSERT_EQ(twice.image(), once.image());
    ASSERT_EQ(drawn.image(), once.image());
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(drawn, m, 1100));
  }
}

TEST(skips, of_one_digit_by_exact_powers) {
  support::test_data data(4);
  std::vector<std::uint64_t> distances = {0, 1, ~std::uint64_t{0}};
  for (int bit = 1; bit < 64; ++bit) {
    for (std::uint64_t beside : {0, 1, 2})
      distances.push_back((std::uint64_t{1} << bit) - 1 + beside);
  }
  for (int i = 0; i < 200; ++i)
    distances.push_back(data() >> data.below(64));
  for (const std::uint64_t distance : distances) {
    const model place = any_place(data);
    stream s(place), far(place);
    model m = place;
    s.skip(distance);
    far.skip_far({distance});
    m.skip(distance);
    ASSERT_TRUE(s.place() == m) << distance;
    ASSERT_EQ(far.image(), s.image()) << distance;
  }
}

TEST(skips, of_many_digits_are_modulo_the_period) {
  support::test_data data(5);
  for (int round = 0; round < 60; ++round) {
    std::vector<std::uint64_t> count(data.below(7));
    cpp_int exact = 0;
    for (std::size_t i = 0; i < count.size(); ++i) {
      count[i] = round % 3 == 0 ? data.below(2) : data();
      exact += cpp_int(count[i]) << 64 * i;
    }
    const model place = any_place(data);
    stream s(place), reduced(place);
    model m = place;
    s.skip_far(count);
    reduced.skip_far(plain_mrg::digits(exact % plain_mrg::period()));
    m.skip(exact);
    ASSERT_TRUE(s.place() == m) << exact;
    ASSERT_EQ(reduced.image(), s.image()) << exact;
  }
  stream s{8};
  const auto before = s.image();
  s.skip_far(plain_mrg::digits(plain_mrg::period()));
  EXPECT_EQ(s.image(), before);
  s.skip_far(plain_mrg::digits(plain_mrg::period() - 1));
  EXPECT_NE(s.image(), before);
  s.skip(1);
  EXPECT_EQ(s.image(), before);
}

TEST(seeds, are_words_modulo_the_moduli) {
  const auto seeded = [](std::initializer_list<std::uint32_t> seed) {
    return stream(seed).place();
  };
  const auto first = static_cast<std::uint32_t>(m1), second = static_cast<std::uint32_t>(m2);
  EXPECT_TRUE(seeded({}) == (model{{1, 1, 1}, {1, 1, 1}}));
  EXPECT_TRUE(seeded({7}) == (model{{7, 1, 1}, {1, 1, 1}}));
  EXPECT_TRUE(seeded({7, 8, 9, 10}) == (model{{7, 8, 9}, {10, 1, 1}}));
  EXPECT_TRUE(seeded({1, 2, 3, 4, 5, 6, 7, 8}) == (model{{1, 2, 3}, {4, 5, 6}}));
  EXPECT_TRUE(seeded({first + 5, first, last1, second + 5, second, last2}) ==
              (model{{5, 0, last1}, {5, 0, last2}}));
  EXPECT_TRUE(seeded({0, 0, 0, 4, 5, 6}) == (model{{1, 0, 0}, {4, 5, 6}}));
  EXPECT_TRUE(seeded({1, 2, 3, second, 0, second}) == (model{{1, 2, 3}, {1, 0, 0}}));
  EXPECT_TRUE(seeded({first, first, first, 0, 0, 0}) == (model{{1, 0, 0}, {1, 0, 0}}));
}

TEST(records, impossible_ones_are_refused) {
  EXPECT_EQ(rvxGetStreamSize(stream()), 16 + 24);
  std::vector<model> impossible = {{{0, 0, 0}, {1, 1, 1}}, {{1, 1, 1}, {0, 0, 0}}};
  for (std::size_t i = 0; i < 3; ++i) {
    for (const std::uint32_t above : {0u, 1u, 22'852u}) {
      model bad = {{1, 1, 1}, {1, 1, 1}};
      bad.y[i] = static_cast<std::uint32_t>(m2) + above;
      impossible.push_back(bad);
    }
    for (const std::uint32_t above : {0u, 1u, 208u}) {
      model bad = {{1, 1, 1}, {1, 1, 1}};
      bad.x[i] = static_cast<std::uint32_t>(m1) + above;
      impossible.push_back(bad);
    }
  }
  for (const model& bad : impossible) {
    stream s(bad);
    support::results<std::uint32_t> r(40);
    EXPECT_EQ(rvxiRngUniformBits(0, s, 40, r.data()), RVX_STATUS_BAD_MARK);
    EXPECT_TRUE(r.untouched());
    EXPECT_EQ(rvxSkipAheadStream(s, 1), RVX_STATUS_BAD_MARK);
    EXPECT_TRUE(s.place() == bad);
  }
}

TEST(services, that_it_lacks_are_refused) {
  stream s;
  const auto before = s.image();
  support::results<std::uint64_t> r(10);
  EXPECT_EQ(rvxLeapfrogStream(s, 0, 2), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(rvxiRngUniformBits32(0, s, 10, reinterpret_cast<std::uint32_t*>(r.data())),
            RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(rvxiRngUniformBits64(0, s, 10, r.data()), RVX_STATUS_UNSUPPORTED);
  EXPECT_TRUE(r.untouched());
  EXPECT_EQ(s.image(), before);
}

}  // namespace
