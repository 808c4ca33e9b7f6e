// SPDX-License-Identifier: Apache-2.0
// Raw words of wichmann_hill against the plain model: every small count, states at the edges, large
// runs, splits, skips, leapfrogs and images, under each SIMD target.
#include "wichmann_hill_stream.hpp"

namespace {

using words = support::on_simd_target;
using support::draw_and_compare;
using support::wichmann_hill_stream;
using four = wichmann_hill_stream::four;

constexpr std::uint32_t some_members[] = {0, 5, 272};

// 1 and p - 1 everywhere, both mixed, and anything.
std::vector<four> states(std::uint32_t member) {
  const std::uint32_t* p = plain::wichmann_hill_rows[member].p;
  const four last = {p[0] - 1, p[1] - 1, p[2] - 1, p[3] - 1};
  return {{1, 1, 1, 1}, last, {1, last[1], 1, last[3]}, {12345, 6789, 16000000, 42}};
}

TEST_F(words, every_count_from_states_at_the_edges) {
  for (const std::uint32_t member : some_members) {
    wichmann_hill_stream s(member);
    for (const four& state : states(member)) {
      for (std::size_t n = 0; n <= 300; ++n) {
        s.set(s.state_at, state);
        plain::wichmann_hill model = s.model();
        ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, n)) << "member " << member;
      }
    }
  }
}

// Products and quotients are largest and closest to integers for these.
TEST_F(words, multipliers_at_the_edges) {
  support::test_data data(1);
  for (const std::uint32_t member : some_members) {
    wichmann_hill_stream s(member);
    const std::vector<four> edges = states(member);
    for (int round = 0; round < 300; ++round) {
      four multiplier;
      for (std::size_t j = 0; j < 4; ++j)
        multiplier[j] = edges[1][j] - static_cast<std::uint32_t>(data.below(3));
      s.set(s.state_at, edges[data.below(edges.size())]);
      s.set(s.multiplier_at, round == 0 ? four{1, 1, 1, 1} : multiplier);
      plain::wichmann_hill model = s.model();
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, 70));
    }
  }
}

TEST_F(words, large_runs) {
  wichmann_hill_stream s(17, {123456789, 987654321, 55555, 2000000000});
  plain::wichmann_hill model = s.model();
  for (std::size_t n : {5u, 400001u, 1024u})
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, n));
}

TEST_F(words, every_split_gives_the_serial_stream_and_the_same_image) {
  for (std::size_t total : {41u, 150u}) {
    wichmann_hill_stream whole(100, {1, 2, 3, 4});
    whole.words(total);
    for (std::size_t first = 0; first <= total; ++first) {
      wichmann_hill_stream s(100, {1, 2, 3, 4});
      plain::wichmann_hill model = s.model();
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, first));
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, total - first));
      ASSERT_EQ(s.image(), whole.image()) << first << " of " << total;
    }
  }
}

TEST_F(words, skips_add_up_and_equal_drawing) {
  support::test_data data(2);
  for (int round = 0; round < 300; ++round) {
    const auto member = static_cast<std::uint32_t>(data.below(plain::wichmann_hill_members));
    const auto start = static_cast<std::uint32_t>(data());
    const std::size_t a = data.below(300), b = data.below(300);
    wichmann_hill_stream drawn(member, {start}), parts(member, {start}), whole(member, {start});
    drawn.words(a + b);
    parts.skip(a);
    parts.skip(b);
    whole.skip(a + b);
    ASSERT_EQ(parts.image(), drawn.image()) << a << " and " << b;
    ASSERT_EQ(whole.image(), drawn.image()) << a << " and " << b;
    plain::wichmann_hill model = whole.model();
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(whole, model, 9));
  }
}

TEST_F(words, skips_of_any_length) {
  support::test_data data(3);
  const std::uint32_t* p = plain::wichmann_hill_rows[272].p;
  std::vector<std::uint64_t> counts = {~std::uint64_t{0}, p[0] - 2u, p[0] - 1u, p[3], data()};
  for (unsigned bit : {24u, 31u, 32u, 48u, 63u}) {
    for (std::uint64_t more = 0; more < 3; ++more)
      counts.push_back((std::uint64_t{1} << bit) - 1 + more);
  }
  for (const std::uint64_t count : counts) {
    wichmann_hill_stream s(272, {11, 12, 13, 14});
    plain::wichmann_hill model = s.model();
    s.words(7);
    s.skip(count);
    model.jump(7 + plain::u128{count});
    ASSERT_EQ(s.model().s, model.s) << count;
    s.skip(count);
    model.jump(count);
    ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, 20)) << count;
  }
}

TEST_F(words, leapfrogs_deal_the_words_out) {
  for (const std::uint32_t stride : {1u, 2u, 7u, 16u, 100u}) {
    constexpr std::size_t turns = 40;
    const std::vector<std::uint32_t> serial =
        wichmann_hill_stream(3, {5, 6, 7, 8}).words(turns * stride);
    for (std::uint32_t idx = 0; idx < stride; ++idx) {
      wichmann_hill_stream s(3, {5, 6, 7, 8});
      ASSERT_EQ(rvxLeapfrogStream(s, idx, stride), 0);
      const std::vector<std::uint32_t> dealt = s.words(turns);
      for (std::size_t i = 0; i < turns; ++i)
        ASSERT_EQ(dealt[i], serial[idx + i * stride]) << idx << " of " << stride;
    }
  }
}

TEST_F(words, leapfrogs_compose_with_each_other_and_with_skips) {
  support::test_data data(4);
  for (int round = 0; round < 200; ++round) {
    const auto stride = [&] { return 1 + static_cast<std::uint32_t>(data.below(0x7FFFFFFF)); };
    wichmann_hill_stream s(static_cast<std::uint32_t>(data.below(plain::wichmann_hill_members)),
                           {static_cast<std::uint32_t>(data())});
    plain::wichmann_hill model = s.model();
    for (int deal = 0; deal < 2; ++deal) {
      const std::uint32_t m = stride();
      const auto idx = static_cast<std::uint32_t>(data.below(m));
      ASSERT_EQ(rvxLeapfrogStream(s, idx, m), 0);
      model.leapfrog(idx, m);
      const std::uint64_t count = data();
      s.skip(count);
      model.jump(count);
      ASSERT_NO_FATAL_FAILURE(draw_and_compare(s, model, data.below(60)));
    }
    const four a = s.multiplier();
    ASSERT_EQ(model.a, plain::wichmann_hill::numbers(a.begin(), a.end()));
  }
}

}  // namespace
