// SPDX-License-Identifier: Apache-2.0
// sobol and niederreiter: which seeds make a stream, the record that clients read in place, and
// records that no stream can have.
#include <algorithm>

#include "plain_net.hpp"

namespace {

using support::net_stream;
namespace record = support::net_record;

constexpr std::uint32_t marker = 0xFFFFFFFF;
constexpr std::int64_t codes[] = {RVX_BRNG_SOBOL, RVX_BRNG_NIEDERR};

using words = std::vector<std::uint32_t>;

int status_of(std::int64_t code, const words& seed) {
  void* handle = nullptr;
  const int status =
      __rvxNewStreamEx(&handle, static_cast<int>(code), static_cast<int>(seed.size()), seed.data());
  EXPECT_EQ(handle != nullptr, status == RVX_STATUS_OK);
  if (handle != nullptr) {
    EXPECT_EQ(__rvxDeleteStream(&handle), RVX_STATUS_OK);
  }
  return status;
}

// A header of three words and the words behind it.
words with_header(std::uint32_t dims, std::uint32_t second, std::uint32_t third,
                  const words& rest) {
  words seed = {dims, second, third};
  seed.insert(seed.end(), rest.begin(), rest.end());
  return seed;
}

words some_directions(std::size_t dims) {
  support::test_data data(dims);
  words all(32 * dims);
  for (std::uint32_t& word : all)
    word = static_cast<std::uint32_t>(data());
  return all;
}

TEST(seeds, a_dimension_count_up_to_the_table) {
  for (const std::int64_t code : codes) {
    const std::uint32_t most = code == RVX_BRNG_SOBOL ? 3667 : 4720;
    EXPECT_EQ(status_of(code, {}), 0);
    EXPECT_EQ(status_of(code, {1}), 0);
    EXPECT_EQ(status_of(code, {most}), 0);
    for (const std::uint32_t dims : {0u, most + 1, 0x80000000u, 0xFFFFFFFFu})
      EXPECT_EQ(status_of(code, {dims}), RVX_STATUS_BAD_CODE) << dims;
  }
}

TEST(seeds, other_forms_are_refused) {
  const words directions = some_directions(2);
  const words polynomials = {2, 3};
  for (const std::int64_t code : codes) {
    const bool sobol = code == RVX_BRNG_SOBOL;
    const words& rest = sobol ? directions : polynomials;
    const std::uint32_t third = sobol ? 4 : 1;
    EXPECT_EQ(status_of(code, with_header(2, 1, third, rest)), 0);
    EXPECT_EQ(status_of(code, with_header(1, 1, third, rest)), 0) << "further words are ignored";
    EXPECT_EQ(status_of(code, {3, 0}), RVX_STATUS_BAD_CODE) << "a seed of 64 bits";
    EXPECT_EQ(status_of(code, {2, 1}), RVX_STATUS_BAD_CODE);
    EXPECT_EQ(status_of(code, {0, 1, third}), RVX_STATUS_BAD_CODE);
    EXPECT_EQ(status_of(code, with_header(2, 0, third, rest)), RVX_STATUS_BAD_CODE);
    EXPECT_EQ(status_of(code, with_header(2, 1, 5 - third, rest)), RVX_STATUS_BAD_CODE);
    EXPECT_EQ(status_of(code, with_header(0, 1, third, rest)), RVX_STATUS_BAD_CODE);
    words short_of_one = with_header(2, 1, third, rest);
    short_of_one.pop_back();
    EXPECT_EQ(status_of(code, short_of_one), RVX_STATUS_BAD_CODE);
    for (const std::uint32_t dims : {3u, 0x08000000u, 0x80000000u, 0xFFFFFFFFu})
      EXPECT_EQ(status_of(code, with_header(dims, 1, third, rest)), RVX_STATUS_BAD_CODE) << dims;
  }
  support::reports reported;
  rvx_stream handle = nullptr;
  EXPECT_EQ(rvxNewStream(&handle, RVX_BRNG_SOBOL, 0x80000000), RVX_STATUS_BAD_CODE);
  EXPECT_EQ(rvxNewStream(&handle, RVX_BRNG_NIEDERR, 0x100000001), RVX_STATUS_BAD_CODE);
}

TEST(seeds, direction_words_of_the_user_are_taken_as_they_are) {
  for (const std::uint32_t dims : {1u, 3u, 48u, 49u, 200u}) {
    const words given = some_directions(dims);
    net_stream s(RVX_BRNG_SOBOL, with_header(dims, 1, 4, given));
    for (std::size_t d = 0; d < dims; ++d)
      for (std::size_t k = 0; k < 32; ++k)
        ASSERT_EQ(s.direction(d, k), given[32 * d + k]);
    plain::net m = s.model();
    for (const std::uint32_t word : s.words(std::size_t{40} * dims))
      ASSERT_EQ(word, m.next());
    EXPECT_TRUE(s.stands_at(m));
  }
}

TEST(records, stand_where_clients_read_them) {
  for (const std::int64_t code : codes) {
    for (const std::uint32_t dims : {1u, 2u, 47u, 48u, 49u, 50u, 1000u}) {
      const net_stream s(code, {dims});
      const auto image = s.image();
      ASSERT_EQ(image.size(), record::size(dims));
      EXPECT_EQ(s.at<std::uint32_t>(record::index), 1u);
      EXPECT_EQ(s.at<std::uint32_t>(record::dims), dims);
      EXPECT_EQ(s.at<std::uint32_t>(record::marker), marker);
      EXPECT_EQ(s.at<std::uint32_t>(record::owed), 0u);
      for (std::size_t d = 0; d < dims; ++d) {
        EXPECT_NE(s.direction(d, 0), 0u);
        EXPECT_EQ(s.at<std::uint32_t>(record::point(dims) + 4 * d), s.direction(d, 0));
        EXPECT_EQ(s.direction(d, 32), 0u);
      }
      const std::size_t unused = dims <= 48 ? record::near_point + 4 * dims : record::near_point;
      const auto is_zero = [](std::uint8_t byte) { return byte == 0; };
      EXPECT_TRUE(
          std::all_of(image.begin() + record::spare, image.begin() + record::near_point, is_zero));
      EXPECT_TRUE(std::all_of(image.begin() + static_cast<std::ptrdiff_t>(unused),
                              image.begin() + record::directions, is_zero));
    }
    EXPECT_EQ(net_stream(code, {}).image(), net_stream(code, {1}).image());
  }
}

TEST(records, owed_counts_down_within_a_point) {
  net_stream s(RVX_BRNG_SOBOL, {3});
  const std::uint32_t index[] = {1, 1, 1, 2, 2, 2, 3};
  const std::uint32_t owed[] = {0, 2, 1, 0, 2, 1, 0};
  for (std::size_t i = 0; i < 7; ++i) {
    EXPECT_EQ(s.at<std::uint32_t>(record::index), index[i]);
    EXPECT_EQ(s.at<std::uint32_t>(record::owed), owed[i]);
    s.words(1);
  }
}

// What every service says of a stream with `field` set to `value`.
int status_with(std::int64_t code, std::size_t field, std::uint32_t value) {
  net_stream s(code, {5});
  const auto before = s.at<std::uint32_t>(field);
  s.set(field, value);
  std::uint32_t word = 0xA5A5A5A5;
  const int status = _rvxiRngUniformBits(0, s, 1, &word);
  EXPECT_EQ(__rvxSkipAheadStream(s, 1), status);
  EXPECT_EQ(__rvxGetStreamSize(s) == RVX_STATUS_BAD_MARK, status == RVX_STATUS_BAD_MARK);
  if (status < 0) {
    EXPECT_EQ(word, 0xA5A5A5A5);
    EXPECT_EQ(s.at<std::uint32_t>(field), value);
  }
  s.set(field, before);  // for its deletion
  return status;
}

TEST(records, impossible_fields_are_refused) {
  constexpr int bad = RVX_STATUS_BAD_MARK;
  for (const std::int64_t code : codes) {
    for (const std::uint32_t dims : {0u, 1u, 4u, 6u, 49u, 0x07C1F07Cu, 0x80000005u, 0xFFFFFFFFu})
      EXPECT_EQ(status_with(code, record::dims, dims), bad) << dims;
    for (const std::uint32_t owed : {5u, 6u, 0x80000000u, 0xFFFFFFFFu})
      EXPECT_EQ(status_with(code, record::owed, owed), bad) << owed;
    EXPECT_EQ(status_with(code, record::owed, 4), 0);
    EXPECT_EQ(status_with(code, record::marker, 0), bad);
    EXPECT_EQ(status_with(code, record::marker, 0xFFFFFFFE), bad);
    EXPECT_EQ(status_with(code, record::index, 0xFFFFFFFF), 0);
    EXPECT_EQ(status_with(code, record::index, 0), RVX_STATUS_END_OF_SEQUENCE);

    net_stream s(code, {5});
    s.words(2);
    s.set(record::index, std::uint32_t{0});  // at the end nothing is owed
    std::uint32_t word = 0;
    EXPECT_EQ(_rvxiRngUniformBits(0, s, 1, &word), bad);
  }
}

// Headers of images whose length no record has, and nothing behind them.
TEST(records, of_impossible_length_are_refused_unread) {
  for (const std::int64_t code : codes) {
    const std::vector<std::uint8_t> whole = net_stream(code, {48}).image();
    for (const std::uint32_t length :
         {16u, 17u, 20u, 32u, 255u, 256u, 387u, 389u, 390u, 392u, 0x7FFFFFFFu, 0xFFFFFFFCu}) {
      std::vector<std::uint8_t> header(whole.begin(), whole.begin() + 16);
      std::memcpy(&header[8], &length, sizeof length);
      void* loaded = nullptr;
      EXPECT_EQ(__rvxLoadStreamM(&loaded, header.data()), RVX_STATUS_BAD_IMAGE) << length;
      EXPECT_EQ(loaded, nullptr);
    }
    // A record of 49 dimensions would have its point behind the directions.
    std::vector<std::uint8_t> image = net_stream(code, {48}).image();
    const auto length = static_cast<std::uint32_t>(image.size() + 132);
    image.resize(length);
    std::memcpy(&image[8], &length, sizeof length);
    void* loaded = nullptr;
    EXPECT_EQ(__rvxLoadStreamM(&loaded, image.data()), RVX_STATUS_BAD_IMAGE);
  }
}

// Points and direction words are not looked at: whatever they are, calls stay within the record.
TEST(records, words_of_any_value_do_no_harm) {
  support::test_data data(4);
  for (int round = 0; round < 300; ++round) {
    const auto dims = static_cast<std::uint32_t>(data.below(140) + 1);
    net_stream s(RVX_BRNG_SOBOL, with_header(dims, 1, 4, some_directions(dims)));
    for (std::size_t at = record::spare; at < record::size(dims); at += 4)
      s.set(at, static_cast<std::uint32_t>(data()));
    s.set(record::index, static_cast<std::uint32_t>(0xFFFFFFFF - data.below(60)));
    s.set(record::owed, static_cast<std::uint32_t>(data.below(dims)));
    const std::uint64_t left = s.model().end() - s.model().position;
    const auto n = static_cast<std::size_t>(std::min<std::uint64_t>(left, data.below(8000)));
    s.words(n);
    s.skip(left - n);
    EXPECT_EQ(s.at<std::uint32_t>(record::index), 0u);
  }
}

TEST(services, are_those_of_a_quasi_random_engine) {
  for (const std::int64_t code : codes) {
    net_stream s(code, {5});
    const std::uint64_t digits[] = {1, 0};
    EXPECT_EQ(__rvxLeapfrogStream(s, 0, 2), RVX_STATUS_UNSUPPORTED);
    EXPECT_EQ(__rvxSkipAheadStreamEx(s, 2, digits), RVX_STATUS_UNSUPPORTED);
    std::uint32_t word = 0;
    EXPECT_EQ(_rvxiRngUniformBits32(0, s, 1, &word), RVX_STATUS_UNSUPPORTED);
    EXPECT_EQ(s.image(), net_stream(code, {5}).image());
  }
}

}  // namespace
