// SPDX-License-Identifier: Apache-2.0
// nondeterministic: the choice of a source with sources made up, the engine with one that fails,
// the sources of this machine one by one, and streams of the library. The engine's own sources are
// compiled into this program, which makes the choice instead of the library.
//
// Nothing here can compare words, so two statistical tests stand for them. A working source fails
// one of them with a probability below 1e-9.
#include <array>
#include <cmath>

#include "../any_stream.hpp"
#include "engines/nondeterministic.cpp"
#include "engines/nondeterministic_sources.cpp"

// Named in the engine's table; nothing here turns words into real numbers.
const tarn::statistics::word_rule tarn::statistics::unsigned_word_rule = {};

namespace tarn::statistics::nondeterministic {

namespace {
const entropy_source* injected = nullptr;
}

const entropy_source* chosen_source() {
  return injected;
}

}  // namespace tarn::statistics::nondeterministic

namespace {

namespace statistics = tarn::statistics;
using statistics::nondeterministic::choose;
using statistics::nondeterministic::draw_numbers;
using statistics::nondeterministic::entropy_source;
using statistics::nondeterministic::injected;

bool yes() {
  return true;
}
bool no() {
  return false;
}
bool count(std::uint32_t* out, std::size_t n) {
  for (std::size_t i = 0; i < n; ++i)
    out[i] = static_cast<std::uint32_t>(i);
  return true;
}
bool stick(std::uint32_t* out, std::size_t n) {
  std::fill_n(out, n, 0xFFFFFFFFu);
  return true;
}
bool fail(std::uint32_t*, std::size_t) {
  return false;
}
bool must_not_be_asked(std::uint32_t*, std::size_t) {
  ADD_FAILURE() << "a source was asked that is not there";
  return false;
}

constexpr entropy_source working{yes, count}, other_working{yes, count}, stuck{yes, stick},
    failing{yes, fail}, absent{no, must_not_be_asked};

TEST(choice, is_the_first_source_that_proves_itself) {
  const auto chosen = [](const std::vector<entropy_source>& sources) {
    const entropy_source* found = choose({sources.data(), sources.size()});
    return found == nullptr ? -1 : static_cast<int>(found - sources.data());
  };
  EXPECT_EQ(chosen({working, other_working}), 0);
  for (const entropy_source& useless : {absent, failing, stuck}) {
    EXPECT_EQ(chosen({working, useless}), 0);
    EXPECT_EQ(chosen({useless, working}), 1);
    EXPECT_EQ(chosen({useless}), -1);
    for (const entropy_source& second : {absent, failing, stuck})
      EXPECT_EQ(chosen({useless, second}), -1);
  }
  EXPECT_EQ(chosen({}), -1);
}

// An instruction that finds its buffer empty so many times before each number.
struct slow_unit {
  int empty;
  std::uint64_t step;  // from number to number
  mutable int asked = 0;
  mutable std::uint64_t latest = 0x123456789ABCDEF;

  bool operator()(std::uint64_t& number) const {
    number = 0;  // as the instruction does where it fails
    if (asked++ % (empty + 1) != empty)
      return false;
    number = latest += step;
    return true;
  }
};

TEST(instruction, is_tried_ten_times) {
  for (std::size_t n = 0; n <= 9; ++n) {
    for (const int empty : {0, 1, 9}) {
      support::results<std::uint32_t> r(n);
      ASSERT_TRUE(draw_numbers(slow_unit{empty, 1}, r.data(), n));
      EXPECT_TRUE(r.guards_intact());
      for (std::size_t i = 0; i < n; ++i)  // the first number is only compared
        EXPECT_EQ(r[i], i % 2 == 0 ? 0x89ABCDEF + 2 + i / 2 : 0x01234567u);
    }
    std::uint32_t words[9];
    EXPECT_FALSE(draw_numbers(slow_unit{10, 1}, words, n));
  }
}

TEST(instruction, that_gives_one_number_for_ever_has_failed) {
  for (std::size_t n = 1; n <= 9; ++n) {
    std::uint32_t words[9];
    EXPECT_FALSE(draw_numbers(slow_unit{0, 0}, words, n));
    EXPECT_FALSE(draw_numbers(slow_unit{9, 0}, words, n));
  }
}

TEST(engine, has_no_stream_without_a_source) {
  const statistics::engine_ops& engine = statistics::nondeterministic_engine;
  const std::uint32_t words[] = {1, 2};
  EXPECT_EQ(engine.state_size({words, 2}), 0u);
  injected = nullptr;
  EXPECT_EQ(engine.seed(nullptr, 0, {words, 2}), RVX_STATUS_NO_SOURCE);
  std::uint32_t word = 0;
  EXPECT_THROW(engine.fill(nullptr, &word, 1), statistics::source_failed);
  injected = &working;
  EXPECT_EQ(engine.seed(nullptr, 0, {words, 2}), RVX_STATUS_OK);
  EXPECT_EQ(engine.seed(nullptr, 0, {nullptr, 0}), RVX_STATUS_OK);
}

TEST(engine, says_that_its_source_failed) {
  const statistics::engine_ops& engine = statistics::nondeterministic_engine;
  std::uint32_t words[3] = {};
  injected = &working;
  EXPECT_NO_THROW(engine.fill(nullptr, words, 3));
  EXPECT_EQ(words[2], 2u);
  injected = &failing;
  EXPECT_THROW(engine.fill(nullptr, words, 3), statistics::source_failed);
}

TEST(engine, is_serial_and_endless) {
  const statistics::engine_ops& engine = statistics::nondeterministic_engine;
  EXPECT_FALSE(engine.parallel);
  EXPECT_EQ(engine.remaining, nullptr);
  EXPECT_TRUE(engine.accepts(nullptr, 0, 0));
  EXPECT_FALSE(engine.accepts(nullptr, 1, 0));
}

// The number of one bits, which is normal; 6.5 standard deviations: 8e-11.
void test_ones(const std::vector<std::uint32_t>& words) {
  double ones = 0;
  for (const std::uint32_t word : words)
    ones += __builtin_popcount(word);
  const double bits = 32.0 * static_cast<double>(words.size());
  EXPECT_LT(std::abs(ones - bits / 2), 6.5 * std::sqrt(bits) / 2);
}

// Chi-square of the bytes, 255 degrees of freedom; the bounds are at 6.36 standard deviations by
// Wilson and Hilferty (Proc. Natl. Acad. Sci. 17, 1931), on either side: 2e-10.
void test_bytes(const std::vector<std::uint32_t>& words) {
  std::array<double, 256> seen{};
  for (const std::uint32_t word : words)
    for (unsigned byte = 0; byte < 4; ++byte)
      ++seen[word >> 8 * byte & 0xFF];
  const double expected = 4.0 * static_cast<double>(words.size()) / 256;
  double chi_square = 0;
  for (const double n : seen)
    chi_square += (n - expected) * (n - expected) / expected;
  EXPECT_GT(chi_square, 136);
  EXPECT_LT(chi_square, 427);
}

constexpr std::size_t many = 1 << 18;  // words: 4096 bytes expected of each value

TEST(machine, has_a_source_and_those_that_it_has_give_random_words) {
  const auto sources = statistics::nondeterministic::sources_of_machine();
  ASSERT_EQ(sources.size, 2u);
  EXPECT_NE(choose(sources), nullptr);
  for (std::size_t i = 0; i < sources.size; ++i) {
    const entropy_source& source = sources.data[i];
    if (choose({&source, 1}) == nullptr)
      continue;
    SCOPED_TRACE(i);
    std::vector<std::uint32_t> words(many);
    ASSERT_TRUE(source.draw(words.data(), many));
    test_ones(words);
    test_bytes(words);
    for (std::size_t n = 0; n <= 100; ++n) {
      support::results<std::uint32_t> r(n);
      ASSERT_TRUE(source.draw(r.data(), n));
      ASSERT_TRUE(r.guards_intact());
    }
  }
}

TEST(streams, give_random_words) {
  support::any_stream s(RVX_BRNG_NONDETERM, {});
  const auto words = s.words(many);
  test_ones(words);
  test_bytes(words);
}

// Every word of a result is written: one that keeps the marker twice has the probability 2^-64, of
// which 101 * 50 are tried.
TEST(streams, write_every_word_of_a_block_and_no_other) {
  support::any_stream s(RVX_BRNG_NONDETERM, {1, 2, 3});
  for (std::size_t n = 0; n <= 100; ++n) {
    const auto first = s.words(n), second = s.words(n);
    for (std::size_t i = 0; i < n; ++i)
      EXPECT_FALSE(first[i] == 0xA5A5A5A5 && second[i] == 0xA5A5A5A5) << i << " of " << n;
  }
}

TEST(streams, differ) {
  support::any_stream a(RVX_BRNG_NONDETERM, {7}), b(RVX_BRNG_NONDETERM, {7});
  const support::any_stream& copied = a;
  support::any_stream c = copied;
  const auto from_a = a.words(8), from_b = b.words(8), from_c = c.words(8);
  EXPECT_NE(from_a, from_b);  // equal with probability 2^-256
  EXPECT_NE(from_a, from_c);
  EXPECT_NE(from_b, from_c);
}

TEST(streams, are_saved_as_a_header_and_work_when_loaded) {
  const support::any_stream s(RVX_BRNG_NONDETERM, {});
  const auto image = s.image();
  ASSERT_EQ(image.size(), 16u);
  rvx_stream loaded = nullptr;
  ASSERT_EQ(rvxLoadStreamM(&loaded, image.data()), 0);
  support::results<std::uint64_t> r(1000);
  EXPECT_EQ(rvxiRngUniformBits64(0, loaded, 1000, r.data()), 0);
  EXPECT_TRUE(r.guards_intact());
  std::uint64_t bits = 0;
  for (std::size_t i = 0; i < 1000; ++i)
    bits |= r[i] ^ 0xA5A5A5A5A5A5A5A5;
  EXPECT_EQ(bits, ~std::uint64_t{0});
  EXPECT_EQ(rvxDeleteStream(&loaded), 0);
}

TEST(streams, have_no_position) {
  const support::any_stream s(RVX_BRNG_NONDETERM, {});
  const std::uint64_t digit = 1;
  EXPECT_EQ(__rvxSkipAheadStream(s, 0), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(__rvxSkipAheadStreamEx(s, 1, &digit), RVX_STATUS_UNSUPPORTED);
  EXPECT_EQ(__rvxLeapfrogStream(s, 0, 2), RVX_STATUS_UNSUPPORTED);
}

}  // namespace
