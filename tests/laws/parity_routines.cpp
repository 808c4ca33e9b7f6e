// SPDX-License-Identifier: Apache-2.0
// Values do not depend on how a sequence is cut into calls, nor on the number of threads, whatever
// the routine, its method and its parameters.
#include "sampling.hpp"
#include "support.hpp"

namespace {

using laws::specimen;

// Results of n, as bytes between guard zones.
class drawn {
 public:
  drawn(const specimen& s, std::size_t n) : specimen_(s), n_(n), bytes_(n * s.width * s.bytes) {}

  // Results [first, first + count).
  void draw(rvx_stream stream, std::size_t first, std::size_t count) {
    ASSERT_LE(first + count, n_);
    unsigned char* at = bytes_.data() + first * specimen_.width * specimen_.bytes;
    ASSERT_EQ(specimen_.draw(stream, count, at), 0) << specimen_.name();
  }
  bool operator==(const drawn& other) { return bytes_ == other.bytes_; }
  bool guards_intact() const { return bytes_.guards_intact(); }

 private:
  const specimen& specimen_;
  std::size_t n_;
  support::results<unsigned char> bytes_;
};

class routines : public testing::TestWithParam<specimen> {};

TEST_P(routines, cut_anywhere_give_the_same) {
  const specimen& s = GetParam();
  // Beyond the lengths of blocks. Pairs are only cut at even places.
  const std::size_t whole = s.width > 50 ? 300 : 2600;
  laws::philox at_once(5);
  drawn expected(s, whole);
  ASSERT_NO_FATAL_FAILURE(expected.draw(at_once, 0, whole));
  ASSERT_TRUE(expected.guards_intact());
  support::test_data data(laws::seed_of(s.name()));
  for (int round = 0; round < 6; ++round) {
    laws::philox in_parts(5);
    drawn parts(s, whole);
    for (std::size_t done = 0; done < whole;) {
      std::size_t count = 1 + data.below(round % 2 == 0 ? 40 : 1200);
      if (s.paired)
        count += count % 2;
      count = std::min(count, whole - done);
      ASSERT_NO_FATAL_FAILURE(parts.draw(in_parts, done, count));
      done += count;
    }
    ASSERT_TRUE(parts == expected) << s.name();
    // Both streams stand behind the last word used.
    std::uint32_t next[2] = {0, 1};
    rvx_stream copies[2] = {nullptr, nullptr};
    ASSERT_EQ(rvxCopyStream(&copies[0], at_once), 0);
    ASSERT_EQ(rvxCopyStream(&copies[1], in_parts), 0);
    for (int i = 0; i < 2; ++i) {
      ASSERT_EQ(rvxiRngUniformBits32(0, copies[i], 1, &next[i]), 0);
      ASSERT_EQ(rvxDeleteStream(&copies[i]), 0);
    }
    ASSERT_EQ(next[0], next[1]) << s.name();
  }
}

INSTANTIATE_TEST_SUITE_P(each, routines, testing::ValuesIn(laws::every_case()),
                         laws::specimen_name);

class methods : public testing::TestWithParam<specimen> {};

TEST_P(methods, give_the_same_on_any_number_of_threads) {
  const specimen& s = GetParam();
  // Above the number of values from which on a call is shared.
  const std::size_t n = ((std::size_t{3} << 17) + 78) / s.width / 2 * 2;
  laws::philox alone(6);
  drawn expected(s, n);
  tarn_serv_set_max_threads(1);
  ASSERT_NO_FATAL_FAILURE(expected.draw(alone, 0, n));
  for (const int threads : {2, 3}) {
    tarn_serv_set_max_threads(threads);
    laws::philox stream(6);
    drawn shared(s, n);
    ASSERT_NO_FATAL_FAILURE(shared.draw(stream, 0, n));
    ASSERT_TRUE(shared == expected) << s.name() << ", " << threads << " threads";
    ASSERT_TRUE(shared.guards_intact());
  }
}

INSTANTIATE_TEST_SUITE_P(each, methods, testing::ValuesIn(laws::every_method()),
                         laws::specimen_name);

}  // namespace
