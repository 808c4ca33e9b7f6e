// SPDX-License-Identifier: Apache-2.0
// Calls on the device and on the host take turns on one stream: the words that each of them draws
// are, one after the other, the serial sequence of the stream.
#include <string>
#include <vector>

#include "drawn.hpp"
#include "engines.hpp"

namespace {

using namespace tarn_test;
using words = std::vector<std::uint32_t>;

/// Words of one stream from both sides, and the same number from a copy by the host alone.
class turns {
 public:
  turns(const caller_stream& start, std::size_t stored)
      : stream_(start), serial_(start), stored_(stored) {}

  void by_device(std::int64_t n) {
    drawn_(draw_wide(raw_words(static_cast<std::int64_t>(stored_)), stream_, n, interop_), n);
  }
  void by_host(std::int64_t n) { drawn_(stream_.words(n, stored_), n); }

  /// At the end: nothing of the sequence is missing, nothing comes twice.
  void expect_serial() {
    by_host(9);
    EXPECT_EQ(values_, serial_.words(count_, stored_));
    EXPECT_EQ(stream_.image(), serial_.image());
  }

 private:
  void drawn_(const words& more, std::int64_t n) {
    values_.insert(values_.end(), more.begin(), more.end());
    count_ += n;
  }

  caller_stream stream_;
  caller_stream serial_;
  std::size_t stored_;
  words values_;
  std::int64_t count_ = 0;
  const gpu_interop interop_{common_queue()};
};

template <typename Engine>
class offload_turns : public testing::Test {};
TYPED_TEST_SUITE(offload_turns, offload_engines, offload_engine_name);

TYPED_TEST(offload_turns, of_device_and_host_give_the_serial_words) {
  using row = offload_engine<TypeParam>;
  for (const std::int64_t first : row::places()) {
    for (const std::int64_t n : {1, 3, 68, 69, 70, 624, 5000}) {
      SCOPED_TRACE(std::to_string(n) + " from " + std::to_string(first));
      turns both(row::at(first), row::stored);
      both.by_device(n);
      both.by_host(3);
      both.by_device(2);
      both.by_device(n + 1);
      both.by_host(1000);
      both.by_device(1);
      both.expect_serial();
    }
  }
}

// Results of the same formula on both sides, in words of their own: one, one, two, two.
TYPED_TEST(offload_turns, of_other_routines_leave_the_host_at_the_next_word) {
  using row = offload_engine<TypeParam>;
  const gpu_interop interop(common_queue());
  int counted = 0;
  for (const std::int64_t n : {1, 7, 1000}) {
    for_every_real_drawing<double>([&](const auto& drawn) {
      if (drawn.words == taken::one_word || drawn.words == taken::two_words) {
        SCOPED_TRACE(text_of(drawn) + ", " + std::to_string(n));
        caller_stream stream = row::at(3);
        caller_stream serial(stream);
        draw_wide(drawn, stream, n, interop);
        serial.pass(n * drawn.width * (drawn.words == taken::two_words ? 2 : 1));
        EXPECT_EQ(stream.image(), serial.image());
        ++counted;
      }
    });
  }
  EXPECT_GT(counted, 60);
}

TYPED_TEST(offload_turns, of_the_device_alone_are_one_call) {
  using row = offload_engine<TypeParam>;
  const gpu_interop interop(common_queue());
  const auto expect = [&](const auto& drawn) {
    for (const std::int64_t first : {0, 1, 35}) {
      for (const std::int64_t n : {1, 6, 700}) {
        SCOPED_TRACE(text_of(drawn) + ", " + std::to_string(n) + " from " + std::to_string(first));
        const caller_stream in_two = row::at(first);
        const caller_stream in_one(in_two);
        auto values = draw_wide(drawn, in_two, n, interop);
        const auto more = draw_wide(drawn, in_two, 300, interop);
        values.insert(values.end(), more.begin(), more.end());
        EXPECT_EQ(values, draw_wide(drawn, in_one, n + 300, interop));
        EXPECT_EQ(in_two.image(), in_one.image());
      }
    }
  };
  expect(raw_words(row::stored_words));
  expect(drawing_of<offload::vsUniform>(0, taken::one_word, rng::uniform<float>(0, 1), 0, 1));
  expect(drawing_of<offload::vdLaplace>(0, taken::two_words, rng::laplace<double>(0, 1), 0, 1));
  expect(drawing_of<offload::viGeometric>(0, taken::one_word, rng::geometric<>(0.2), 0.2));
  if constexpr (row::uniform_bits) {
    expect(drawing_of<offload::viUniformBits64>(0, taken::two_words,
                                                rng::uniform_bits<std::uint64_t>()));
  }
}

template <typename Engine>
void expect_split_streams_to_be_serial() {
  using row = offload_engine<Engine>;
  for (const std::int64_t stride : {2, 7, 1000003}) {
    const caller_stream split = row::at(5);
    ASSERT_EQ(rvxLeapfrogStream(split, stride - 1, stride), 0);
    turns both(split, row::stored);
    both.by_device(77);
    both.by_host(3);
    both.by_device(1000);
    both.expect_serial();
  }
}

TEST(offload_turns_of_split_streams, are_serial_too) {
  expect_split_streams_to_be_serial<rng::mcg31m1>();
  expect_split_streams_to_be_serial<rng::mcg59>();
}

TEST(offload_turns_of_sobol, start_inside_a_point_of_any_size) {
  using row = offload_engine<rng::sobol>;
  for (const std::uint32_t dimensions : {1u, 2u, 3u, 40u, 3667u}) {
    for (const std::int64_t first : {0, 1, 2, 39, 3666}) {
      SCOPED_TRACE(std::to_string(dimensions) + " dimensions from " + std::to_string(first));
      turns both(row::at(first, dimensions), 1);
      both.by_device(1);
      both.by_device(50);
      both.by_host(1);
      both.by_device(4000);
      both.expect_serial();
    }
  }
}

// The library moves these by itself, as their streams have no skip.
TEST(offload_turns_of_mt2203, move_the_record_as_drawing_does_from_every_position) {
  using row = offload_engine<rng::mt2203>;
  const gpu_interop interop(common_queue());
  for (std::int64_t first = 0; first <= 70; ++first) {
    for (const std::int64_t n : {1, 68, 69, 70, 1000}) {
      caller_stream stream = row::at(first);
      caller_stream serial(stream);
      ASSERT_EQ(draw_wide(raw_words(1), stream, n, interop), serial.words(n))
          << n << " from " << first;
      ASSERT_EQ(stream.image(), serial.image()) << n << " from " << first;
    }
  }
}

}  // namespace
