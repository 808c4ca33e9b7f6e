// SPDX-License-Identifier: Apache-2.0
// Words of sobol and niederreiter against the closed form: every small count from several places,
// runs over carries, cuts, and the end of the sequence. The numbers of dimensions are those where
// the work is laid out differently: tiles of several points or of strips of one, the place of the
// current point in the record.
#include <algorithm>

#include "plain_net.hpp"

namespace {

using support::net_stream;

constexpr int end_of_sequence = RVX_STATUS_END_OF_SEQUENCE;

struct net_case {
  std::int64_t code;
  std::uint32_t dims;
};

void PrintTo(const net_case& c, std::ostream* out) {
  *out << (c.code == RVX_BRNG_SOBOL ? "sobol " : "niederreiter ") << c.dims;
}

class digital_net : public support::on_simd_target, public testing::WithParamInterface<net_case> {
 protected:
  void SetUp() override {
    on_simd_target::SetUp();
    if (!IsSkipped())  // a run that is long enough for kernels, so that their target is told
      make().words(std::size_t{10} * dims() + 1000);
  }
  std::size_t dims() const { return GetParam().dims; }
  net_stream make() const { return {GetParam().code, {GetParam().dims}}; }

  // Words before coordinate `taken` of a point, or before its last one if it has fewer.
  std::uint64_t position(std::uint64_t index, std::size_t taken) const {
    return index * dims() + std::min(taken, dims() - 1);
  }

  // As many places as the size of the record leaves time for.
  std::vector<std::uint64_t> places() const {
    const std::uint64_t last = 0xFFFFFFFF;
    if (dims() > 200)
      return {position(1, 0), position(0x0FFFFFFE, dims() / 2), position(last - 2, 1)};
    return {position(1, 0),
            position(2, 1),
            position(5, dims() / 2),
            position(63, dims() - 1),
            position(0xFFFFE, 0),
            position(0x7FFFFFFF, dims() / 3),
            position(last - 20, dims() / 2)};
  }
};

// Draws n words, fewer at the end of the sequence, and compares them, the guards and the record.
void draw_and_compare(net_stream& s, plain::net& m, std::size_t n) {
  n = static_cast<std::size_t>(std::min<std::uint64_t>(n, m.end() - m.position));
  support::results<std::uint32_t> r(n);
  ASSERT_EQ(rvxiRngUniformBits(0, s, static_cast<std::int64_t>(n), r.data()), 0);
  for (std::size_t i = 0; i < n; ++i) {
    const std::uint64_t index = m.index();
    ASSERT_EQ(r[i], m.next()) << "word " << i << " of " << n << ", point " << index;
  }
  ASSERT_TRUE(r.guards_intact());
  ASSERT_TRUE(s.stands_at(m)) << "after " << n << " words";
}

TEST_P(digital_net, every_small_count_from_several_places) {
  net_stream s = make();
  plain::net m = s.model();
  const std::size_t step = dims() > 200 ? 37 : 1;
  for (const std::uint64_t place : places()) {
    for (std::size_t n = 0; n <= 300; n += step) {
      m.position = place;
      s.place(m);
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, n)) << "from word " << place;
    }
  }
}

TEST_P(digital_net, runs_over_carries) {
  net_stream s = make();
  plain::net m = s.model();
  support::test_data data(dims());
  for (unsigned bit = 4; bit < 32; bit += 3) {
    const std::uint64_t carry = std::uint64_t{1} << bit;
    const std::uint64_t points = 12 + 600 / dims();
    m.position = position(carry - std::min(carry - 1, points / 2), data.below(dims()));
    s.place(m);
    ASSERT_NO_FATAL_FAILURE(
        draw_and_compare(s, m, static_cast<std::size_t>(points) * dims() + data.below(2 * dims())))
        << "2^" << bit;
  }
}

TEST_P(digital_net, a_long_run) {
  net_stream s = make();
  plain::net m = s.model();
  m.position = position(777, dims() / 2);
  s.place(m);
  ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, 300000));
  ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, 1));
}

TEST_P(digital_net, cuts_give_the_serial_stream_and_the_same_image) {
  constexpr std::size_t total = 30000;
  support::test_data data(1);
  net_stream whole = make();
  whole.skip(1000);
  net_stream cut = whole;
  const auto expected = whole.words(total);
  std::vector<std::uint32_t> drawn;
  while (drawn.size() < total) {
    const std::size_t most = data.below(8) == 0 ? 4000 : 3 * std::min<std::size_t>(dims(), 100);
    const auto part = cut.words(std::min(total - drawn.size(), data.below(most) + 1));
    drawn.insert(drawn.end(), part.begin(), part.end());
  }
  EXPECT_EQ(drawn, expected);
  EXPECT_EQ(cut.image(), whole.image());
}

TEST_P(digital_net, skips_add_up_and_equal_drawing) {
  net_stream s = make();
  plain::net m = s.model();
  support::test_data data(2);
  const auto far = [&] {  // within the sequence, of any size
    return data() % (m.end() - dims()) >> data.below(40);
  };
  for (int round = 0; round < (dims() > 200 ? 10 : 200); ++round) {
    const std::uint64_t place = dims() + far();
    const std::uint64_t a = far() % (m.end() - place + 1), b = far() % (m.end() - place - a + 1);
    m.position = place;
    s.place(m);
    s.skip(a);
    s.skip(b);
    m.position += a + b;
    ASSERT_TRUE(s.stands_at(m)) << place << " + " << a << " + " << b;
    m.position = place;
    s.place(m);
    s.skip(a + b);
    m.position += a + b;
    ASSERT_TRUE(s.stands_at(m)) << place << " + " << a + b;
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, data.below(200)));
  }
  for (std::size_t n = 0; n <= 3 * dims() && n <= 500; ++n) {
    net_stream skipped = make();
    skipped.skip(n);
    net_stream drawn = make();
    drawn.words(n);
    ASSERT_EQ(skipped.image(), drawn.image()) << n;
    if (dims() > 200)
      n += 99;
  }
}

TEST_P(digital_net, ends_behind_the_last_coordinate_of_the_last_point) {
  support::reports reported;  // of the calls past the end
  net_stream s = make();
  plain::net m = s.model();
  const std::uint64_t all = m.end() - m.position;
  ASSERT_EQ(rvxSkipAheadStream(s, static_cast<std::int64_t>(all + 1)), end_of_sequence);
  ASSERT_EQ(rvxSkipAheadStream(s, -1), end_of_sequence);
  ASSERT_TRUE(s.stands_at(m));

  std::vector<std::uint8_t> at_end;
  for (const std::size_t left : {std::size_t{0}, std::size_t{1}, dims(), 5 * dims() + 900}) {
    m.position = m.end() - left;
    s.place(m);
    std::vector<std::uint32_t> out(left + 1, 0xA5A5A5A5);
    ASSERT_EQ(rvxiRngUniformBits(0, s, static_cast<std::int64_t>(left) + 1, out.data()),
              end_of_sequence);
    ASSERT_EQ(out, std::vector<std::uint32_t>(left + 1, 0xA5A5A5A5));
    ASSERT_EQ(rvxSkipAheadStream(s, static_cast<std::int64_t>(left) + 1), end_of_sequence);
    ASSERT_TRUE(s.stands_at(m));
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, m, left));
    ASSERT_EQ(rvxiRngUniformBits(0, s, 1, out.data()), end_of_sequence);
    if (at_end.empty())
      at_end = s.image();
    ASSERT_EQ(s.image(), at_end);
  }
  net_stream skipped = make();
  skipped.skip(all);
  EXPECT_EQ(skipped.image(), at_end);
  skipped.skip(0);
  EXPECT_EQ(skipped.image(), at_end);
}

std::vector<net_case> cases() {
  std::vector<net_case> all;
  for (const std::uint32_t dims : {1u, 2u, 3u, 5u, 7u, 12u, 31u, 32u, 33u, 40u, 48u, 49u, 100u,
                                   128u, 129u, 257u, 1000u, 3667u})
    all.push_back({RVX_BRNG_SOBOL, dims});
  for (const std::uint32_t dims : {1u, 3u, 12u, 100u, 4720u})
    all.push_back({RVX_BRNG_NIEDERR, dims});
  return all;
}

INSTANTIATE_TEST_SUITE_P(dims, digital_net, testing::ValuesIn(cases()), [](const auto& c) {
  return (c.param.code == RVX_BRNG_SOBOL ? "sobol_" : "niederreiter_") +
         std::to_string(c.param.dims);
});

}  // namespace
