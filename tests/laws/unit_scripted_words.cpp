// SPDX-License-Identifier: Apache-2.0
// Whatever the words: results are finite, inside the support, and there are results at all. Streams
// begin with blocks of chosen words (philox, through the inverse of its rule), with long runs of
// zeros (a Mersenne twister and a shift register whose states are nearly empty), or have nothing
// but one word (a digital net of user direction numbers).
#include <cmath>
#include <limits>

#include "any_stream.hpp"
#include "critical.hpp"
#include "edge_cases.hpp"
#include "sampling.hpp"
#include "support.hpp"

namespace {

using laws::specimen;

constexpr plain::two key{11, 12};

// Canonical 0, the greatest below 1, and 1 for floats are the words 80000000, 7FFFFFFF and
// 7FFFFFC0 of philox, which are read as signed numbers.
constexpr std::uint32_t chosen[] = {0x80000000, 0x7FFFFFFF, 0, 0xFFFFFFFF, 0x80000001, 0x40000000};

// Draws n results and looks at each.
void expect_sound(const specimen& s, rvx_stream stream, std::size_t n, const std::string& words) {
  std::vector<std::uint64_t> r((n * s.width * s.bytes + 7) / 8);
  ASSERT_EQ(s.draw(stream, n, r.data()), 0) << s.name();
  for (std::size_t i = 0; i < n; ++i) {
    const auto values = laws::result(s, r.data(), i);
    for (const laws::view& v : s.views) {
      const double x = v.of(values.data());
      const double room = v.resolution.exact_range ? 0 : v.resolution.at(x);
      ASSERT_TRUE(std::isfinite(x)) << s.name() << " gave " << x << " from " << words;
      ASSERT_TRUE(v.expected.lower - room <= x && x <= v.expected.upper + room)
          << s.name() << " gave " << x << " from " << words;
    }
  }
}

std::string text(const plain::four& words) {
  std::ostringstream out;
  out << std::hex << words[0] << " " << words[1] << " " << words[2] << " " << words[3];
  return out.str();
}

// Which neither the shift register nor the net offers.
bool wants_equidistributed_bits(const specimen& s) {
  return s.routine == "iRngUniformBits32" || s.routine == "iRngUniformBits64";
}

class scripted : public testing::TestWithParam<specimen> {
 protected:
  void draw(const plain::four& block) {
    stream_.set(key, plain::counter_of(block, key), 0);
    ASSERT_NO_FATAL_FAILURE(
        expect_sound(GetParam(), stream_, GetParam().width > 50 ? 1 : 3, text(block)));
  }
  support::stream stream_;
};

TEST_P(scripted, every_block_of_end_words) {
  for (const std::uint32_t a : chosen) {
    for (const std::uint32_t b : chosen) {
      for (const std::uint32_t c : chosen) {
        ASSERT_NO_FATAL_FAILURE(draw({a, b, c, a}));
        ASSERT_NO_FATAL_FAILURE(draw({a, b, c, b}));
      }
    }
  }
}

TEST_P(scripted, single_bits) {
  for (unsigned bit = 0; bit < 32; ++bit) {
    const std::uint32_t one = std::uint32_t{1} << bit;
    for (const std::uint32_t low : {0u, 0x80000000u, 0x7FFFFFFFu}) {
      ASSERT_NO_FATAL_FAILURE(draw({low ^ one, low, low, low ^ one}));
      ASSERT_NO_FATAL_FAILURE(draw({low, low ^ one, low ^ one, low}));
    }
  }
}

// One bit of the state: some hundred zeros, then few ones.
TEST_P(scripted, long_runs_of_zeros) {
  for (const std::size_t word : {1u, 300u, 623u}) {
    support::any_stream twister(RVX_BRNG_MT19937, {1});
    for (std::size_t i = 0; i < 624; ++i)
      twister.set(16 + 4 * i, i == word ? 0x80000000u : 0u);
    ASSERT_NO_FATAL_FAILURE(expect_sound(GetParam(), twister, 40, "zeros"));
  }
  if (wants_equidistributed_bits(GetParam()))
    return;
  for (const std::size_t word : {0u, 249u}) {
    support::any_stream registers(RVX_BRNG_R250, {1});
    for (std::size_t i = 0; i < 250; ++i)
      registers.set(16 + 4 * i, i == word ? 0x80000000u : 0u);
    ASSERT_NO_FATAL_FAILURE(expect_sound(GetParam(), registers, 40, "zeros"));
  }
}

INSTANTIATE_TEST_SUITE_P(each, scripted, testing::ValuesIn(laws::every_case()),
                         laws::specimen_name);
INSTANTIATE_TEST_SUITE_P(edge, scripted, testing::ValuesIn(laws::edge_cases()),
                         laws::specimen_name);

// Nothing but zeros, for the routines that take a fixed number of words: a rejection may go on for
// ever then, and rightly.
TEST(constant_words, are_no_trouble_to_closed_formulas) {
  std::size_t drawn = 0;
  std::vector<std::uint32_t> directions{1, 1, 4};
  directions.resize(3 + 32, 0);
  for (const specimen& s : laws::every_method()) {
    if (!laws::takes_a_fixed_number_of_words(s) || wants_equidistributed_bits(s))
      continue;
    rvx_stream net = nullptr;
    ASSERT_EQ(rvxNewStreamEx(&net, RVX_BRNG_SOBOL, static_cast<std::int64_t>(directions.size()),
                             directions.data()),
              0);
    expect_sound(s, net, 1000, "nothing but zeros");
    EXPECT_EQ(rvxDeleteStream(&net), 0);
    ++drawn;
  }
  EXPECT_GE(drawn, 30u);
}

}  // namespace
