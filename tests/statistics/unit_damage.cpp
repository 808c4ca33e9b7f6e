// SPDX-License-Identifier: Apache-2.0
// 100,000 damaged images of each engine: each is refused, or gives a stream that works. Under the
// address and undefined-behaviour sanitizers this is the proof that no image leads out of bounds.
// Through the raw entries, which do not report each refusal.
#include <cstddef>

#include "every_engine.hpp"

namespace {

using bytes = std::vector<std::uint8_t>;
using support::engine_case;

constexpr int images = 100'000;
constexpr std::size_t header_bytes = 16, head_sum_at = 6, length_at = 8, sum_at = 12;

// FNV-1a of the first `size` bytes of an image.
std::uint32_t fnv(const bytes& image, std::size_t size) {
  std::uint32_t sum = 0x811C9DC5;
  for (std::size_t i = 0; i < size; ++i)
    sum = (sum ^ image[i]) * 0x01000193;
  return sum;
}

// The check sums of an image: that of the header, folded, with both sums zero; then that of the
// whole with its own field zero.
void set_check_sums(bytes& image) {
  std::fill_n(image.begin() + head_sum_at, 2, std::uint8_t{0});
  std::fill_n(image.begin() + sum_at, 4, std::uint8_t{0});
  const std::uint32_t head = fnv(image, header_bytes);
  const auto folded = static_cast<std::uint16_t>(head ^ head >> 16);
  std::memcpy(image.data() + head_sum_at, &folded, sizeof folded);
  const std::uint32_t whole = fnv(image, image.size());
  std::memcpy(image.data() + sum_at, &whole, sizeof whole);
}

class damage : public testing::TestWithParam<engine_case> {
 protected:
  // Refused and nothing made, or a stream that draws, skips and saves in its bounds.
  void expect_harmless(const bytes& image) {
    // A block of its own, so that the sanitizer sees every byte read behind it.
    const std::vector<std::uint8_t> exact(image);
    rvx_stream loaded = nullptr;
    const int status = __rvxLoadStreamM(&loaded, exact.data());
    if (status != 0) {
      ASSERT_EQ(status, RVX_STATUS_BAD_IMAGE);
      ASSERT_EQ(loaded, nullptr);
      ++refused_;
      return;
    }
    // Most streams a little, some of them through every road: further blocks, long jumps, reals.
    const bool thoroughly = taken_++ % 200 == 0;
    expect_possible(_rvxiRngUniformBits(0, loaded, thoroughly ? 2000 : 9, words_.data()));
    if (GetParam().skips)
      expect_possible(__rvxSkipAheadStream(loaded, thoroughly ? std::int64_t{1} << 40 : 5));
    if (thoroughly) {
      if (GetParam().leapfrogs)
        expect_possible(__rvxLeapfrogStream(loaded, 5, 0x7FFFFFFF));
      expect_possible(_rvxsRngUniform(0, loaded, 1500, reals_.data(), 0, 1));
    }
    EXPECT_EQ(rvxGetStreamSize(loaded), static_cast<int>(image.size()));
    EXPECT_EQ(rvxDeleteStream(&loaded), 0);
  }

  static void expect_possible(int status) {
    EXPECT_TRUE(status == 0 || status == RVX_STATUS_END_OF_SEQUENCE) << status;
  }

  void spoil(bytes& image, std::size_t first) {
    for (std::size_t i = 0, count = 1 + data_.below(8); i < count; ++i) {
      // Small and great values meet limits more often than any others.
      const std::size_t at = first + data_.below(image.size() - first);
      const std::uint64_t value = data_();
      image[at] = static_cast<std::uint8_t>(value % 4 == 0   ? 0
                                            : value % 4 == 1 ? 0xFF
                                                             : value >> 8);
    }
  }

  support::test_data data_{7};
  std::vector<std::uint32_t> words_ = std::vector<std::uint32_t>(2 * 2000);
  std::vector<float> reals_ = std::vector<float>(1500);
  int refused_ = 0, taken_ = 0;
};

TEST_P(damage, is_refused_or_harmless) {
  const support::any_stream s = GetParam().make();
  const bytes whole = s.image();
  for (int i = 0; i < images; ++i) {
    bytes image = whole;
    // Half of the images hide the damage behind right check sums. Their header stays, since the
    // memory form is told no length: the length in the header is all it has.
    const bool hidden = i % 2 == 0 && whole.size() > header_bytes;
    spoil(image, hidden ? header_bytes : 0);
    if (hidden)
      set_check_sums(image);
    if (image != whole) {
      ASSERT_NO_FATAL_FAILURE(expect_harmless(image)) << "image " << i;
    }
  }
  EXPECT_GE(refused_, images / 4) << "the check sum and the fields are looked at";
  if (whole.size() > header_bytes) {
    EXPECT_GT(taken_, 0) << "right check sums were not believed";
  }
}

TEST_P(damage, of_the_header_is_refused) {
  const support::any_stream s = GetParam().make();
  const bytes whole = s.image();
  for (std::size_t at = 0; at < header_bytes; ++at) {
    for (unsigned change = 1; change < 256; ++change) {
      bytes image = whole;
      image[at] = static_cast<std::uint8_t>(image[at] ^ change);
      rvx_stream loaded = nullptr;
      ASSERT_EQ(__rvxLoadStreamM(&loaded, image.data()), RVX_STATUS_BAD_IMAGE)
          << "byte " << at << " changed by " << change;
      ASSERT_EQ(loaded, nullptr);
    }
  }
}

// Lengths that do not fit the engine, with a right check sum over what is there.
TEST_P(damage, of_the_length_is_refused) {
  const support::any_stream s = GetParam().make();
  const bytes whole = s.image();
  for (std::uint32_t length : {0u, 15u, 16u, 17u, 20u, 31u, 32u, 64u, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
    if (length == whole.size())
      continue;
    bytes image = whole;
    std::memcpy(image.data() + length_at, &length, sizeof length);
    image.resize(std::max<std::size_t>(whole.size(), 64));
    const bool inside = header_bytes <= length && length <= image.size();
    bytes part(image.begin(), image.begin() + static_cast<std::ptrdiff_t>(inside ? length : 16));
    set_check_sums(part);
    std::copy(part.begin(), part.end(), image.begin());
    rvx_stream loaded = nullptr;
    ASSERT_EQ(__rvxLoadStreamM(&loaded, image.data()), RVX_STATUS_BAD_IMAGE) << length;
  }
}

INSTANTIATE_TEST_SUITE_P(each, damage, testing::ValuesIn(support::every_engine()),
                         support::engine_name<engine_case>);

}  // namespace
