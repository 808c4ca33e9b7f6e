// SPDX-License-Identifier: Apache-2.0
// Rejection on engines whose words are unlike those of most: words of 59 bits, and digital nets,
// which end, perhaps in the middle of a call. Results lie in their range, do not depend on how a
// sequence is cut into calls, and the end of a net is reported at every call from then on.
#include "any_stream.hpp"
#include "edge_cases.hpp"
#include "sampling.hpp"

namespace {

using laws::specimen;

std::vector<specimen> rejections() {
  std::vector<specimen> all;
  for (specimen& s : laws::every_case())
    if (!laws::takes_a_fixed_number_of_words(s) && s.width <= 50)
      all.push_back(std::move(s));
  return all;
}

class rejection : public testing::TestWithParam<specimen> {
 protected:
  using bytes = support::results<unsigned char>;

  static std::size_t size_of(std::size_t n) { return n * GetParam().width * GetParam().bytes; }

  // Results [first, first + n).
  static int draw(rvx_stream stream, std::size_t first, std::size_t n, bytes& r) {
    return GetParam().draw(stream, n, r.data() + size_of(first));
  }

  static void expect_in_range(bytes& r, std::size_t n) {
    const specimen& s = GetParam();
    for (std::size_t i = 0; i < n; ++i) {
      const auto values = laws::result(s, r.data(), i);
      for (const laws::view& v : s.views) {
        const double x = v.of(values.data());
        const double room = v.resolution.exact_range ? 0 : v.resolution.at(x);
        ASSERT_TRUE(v.expected.lower - room <= x && x <= v.expected.upper + room)
            << s.name() << " gave " << x;
      }
    }
  }

  static void expect_cuts_join(const support::any_stream& start) {
    constexpr std::size_t n = 1500;
    support::any_stream whole = start;
    bytes expected(size_of(n));
    ASSERT_EQ(draw(whole, 0, n, expected), 0);
    ASSERT_TRUE(expected.guards_intact());
    ASSERT_NO_FATAL_FAILURE(expect_in_range(expected, n));
    support::test_data data(laws::seed_of(GetParam().name()));
    for (const std::size_t longest : {7u, 90u, 1100u}) {
      support::any_stream cut = start;
      bytes parts(size_of(n));
      for (std::size_t done = 0; done < n;) {
        const std::size_t count = std::min(1 + data.below(longest), n - done);
        ASSERT_EQ(draw(cut, done, count, parts), 0);
        done += count;
      }
      ASSERT_TRUE(parts == expected) << GetParam().name();
      ASSERT_EQ(cut.image(), whole.image()) << GetParam().name();
    }
  }
};

TEST_P(rejection, on_words_of_59_bits) {
  expect_cuts_join({RVX_BRNG_MCG59, {20261, 4242}});
  // From the greatest word on, which stands for 1 in both types.
  expect_cuts_join({RVX_BRNG_MCG59, {0xFFFFFFFF, 0x07FFFFFF}});
}

TEST_P(rejection, on_digital_nets) {
  for (const std::int64_t net : {RVX_BRNG_SOBOL, RVX_BRNG_NIEDERR})
    for (const std::uint32_t dims : {1u, 6u, 7u})
      ASSERT_NO_FATAL_FAILURE(expect_cuts_join({net, {dims}}));
}

constexpr std::uint32_t end_dims = 3;

// A stream with so many words left.
support::any_stream next_to_the_end(std::uint64_t words) {
  support::any_stream s(RVX_BRNG_SOBOL, {end_dims});
  s.skip(end_dims * std::uint64_t{0xFFFFFFFF} - words);
  return s;
}

TEST_P(rejection, ends_with_its_sequence) {
  support::reports instead_of_messages;
  constexpr std::size_t n = 400;
  for (const std::uint64_t left : {0u, 1u, 2u, 100u, 299u}) {
    support::any_stream s = next_to_the_end(left);
    bytes r(size_of(n));
    const int status = draw(s, 0, n, r);
    ASSERT_TRUE(r.guards_intact());
    if (status == 0) {  // a constant law
      ASSERT_EQ(s.image(), next_to_the_end(left).image()) << GetParam().name();
      continue;
    }
    ASSERT_EQ(status, RVX_STATUS_END_OF_SEQUENCE) << GetParam().name();
    // The stream stays one: words that it still has can be drawn, no more, and it does not move
    // when there are none.
    std::uint32_t word = 0;
    std::size_t found = 0;
    while (rvxiRngUniformBits(0, s, 1, &word) == 0)
      ++found;
    ASSERT_LE(found, left);
    ASSERT_EQ(rvxiRngUniformBits(0, s, 1, &word), RVX_STATUS_END_OF_SEQUENCE);
    const auto at_the_end = s.image();
    ASSERT_EQ(at_the_end, next_to_the_end(0).image());
    ASSERT_EQ(draw(s, 0, 1, r), RVX_STATUS_END_OF_SEQUENCE);
    ASSERT_EQ(s.image(), at_the_end);
  }
}

// What can be drawn value by value before the end is what a long call far from it begins with.
TEST_P(rejection, reaches_the_last_words) {
  support::reports instead_of_messages;
  constexpr std::uint64_t left = 6000;
  support::any_stream s = next_to_the_end(left), words = next_to_the_end(left);
  bytes r(size_of(left));
  std::size_t values = 0;
  while (values < left && draw(s, values, 1, r) == 0)
    ++values;
  ASSERT_TRUE(r.guards_intact());
  ASSERT_GT(values, 0u);
  ASSERT_NO_FATAL_FAILURE(expect_in_range(r, values));
  support::any_stream again = next_to_the_end(left);
  bytes at_once(size_of(left));
  ASSERT_EQ(draw(again, 0, values, at_once), 0) << GetParam().name();
  EXPECT_TRUE(std::equal(at_once.data(), at_once.data() + size_of(values), r.data()))
      << GetParam().name();
}

INSTANTIATE_TEST_SUITE_P(each, rejection, testing::ValuesIn(rejections()), laws::specimen_name);

}  // namespace
