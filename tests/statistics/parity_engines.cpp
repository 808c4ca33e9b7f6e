// SPDX-License-Identifier: Apache-2.0
// Every engine, whatever it is: one call against split calls, skips against drawing, copies, the
// services it lacks, and images that go on. What the words are is the affair of the engines' own
// tests.
#include <functional>
#include <tuple>

#include "every_engine.hpp"

namespace {

using support::any_stream;
using support::engine_case;
using words = std::vector<std::uint32_t>;

// Those that can be repeated, and those that skip.
std::vector<engine_case> with(bool (*has)(const engine_case&)) {
  std::vector<engine_case> chosen;
  for (const engine_case& engine : support::every_engine()) {
    if (has(engine))
      chosen.push_back(engine);
  }
  return chosen;
}
bool repeats(const engine_case& engine) {
  return engine.code != RVX_BRNG_NONDETERM;
}
bool skips(const engine_case& engine) {
  return engine.skips;
}

class engines : public support::on_simd_target, public testing::WithParamInterface<engine_case> {
 protected:
  const engine_case& engine() const { return GetParam(); }

  // Streams at the same position have the same image, byte for byte, and the same future.
  void expect_same(any_stream& a, any_stream& b) {
    ASSERT_EQ(a.image(), b.image());
    ASSERT_EQ(draw(a, 3), draw(b, 3));
  }
  words draw(any_stream& s, std::size_t n) const { return s.words(n, engine().parts); }

  // The service was refused, the refusal told, and the stream left alone.
  void expect_lacking(any_stream& s, const char* name, const std::function<int()>& service) {
    const auto before = s.image();
    EXPECT_EQ(service(), RVX_STATUS_UNSUPPORTED);
    EXPECT_EQ(reports_.take(), (support::reports::list{{name, 1}}));
    EXPECT_EQ(s.image(), before);
  }

  support::reports reports_;
  support::test_data data_{42};
};
class repeating_engines : public engines {};
class skipping_engines : public engines {};

TEST_P(repeating_engines, splits_give_the_serial_stream) {
  const std::size_t total = 3 * engine().block + 2100;
  any_stream serial = engine().make();
  const words whole = draw(serial, total);
  for (int round = 0; round < 60; ++round) {
    any_stream s = engine().make();
    words pieces;
    std::size_t done = 0;
    while (done < total) {
      const std::size_t longest = round % 2 == 0 ? 2 * engine().block : 700;
      const std::size_t n = std::min(total - done, data_.below(longest));
      const words piece = draw(s, n);
      pieces.insert(pieces.end(), piece.begin(), piece.end());
      done += n;
    }
    ASSERT_EQ(pieces, whole) << "round " << round;
    any_stream reference = serial;
    ASSERT_NO_FATAL_FAILURE(expect_same(s, reference));
  }
}

// Calls large enough to be shared out: the words, the reals and the place behind them are those of
// one thread.
TEST_P(repeating_engines, threads_change_nothing) {
  constexpr std::size_t n = 300'001;
  const auto draw_all = [this](int threads) {
    const int before = tarn_serv_get_max_threads();
    tarn_serv_set_max_threads(threads);
    any_stream s = engine().make();
    words all = draw(s, n);
    std::vector<float> reals(n);
    EXPECT_EQ(rvxsRngUniform(0, s, n, reals.data(), -1, 1), 0);
    const auto image = s.image();
    tarn_serv_set_max_threads(before);
    return std::make_tuple(all, reals, image);
  };
  const auto alone = draw_all(1);
  for (int threads : {2, 3, 8})
    EXPECT_TRUE(draw_all(threads) == alone) << threads << " threads";
}

TEST_P(engines, no_words_leave_the_stream_where_it_is) {
  any_stream s = engine().make();
  static_cast<void>(draw(s, 3));
  const auto before = s.image();
  EXPECT_TRUE(draw(s, 0).empty());
  if (engine().skips)
    s.skip(0);
  EXPECT_EQ(s.image(), before);
}

TEST_P(engines, skips_exist_where_they_are_offered) {
  any_stream s = engine().make();
  if (engine().skips)
    s.skip(1);
  else
    expect_lacking(s, "rvxSkipAheadStream", [&] { return rvxSkipAheadStream(s, 1); });
}

TEST_P(skipping_engines, skips_add_up_and_equal_drawing) {
  const std::size_t block = engine().block;
  for (int round = 0; round < 300; ++round) {
    const std::size_t start = data_.below(3 * block), longest = round % 3 == 0 ? 5000 : 3 * block;
    const std::size_t a = data_.below(longest), b = data_.below(longest);
    any_stream drawn = engine().make();
    static_cast<void>(draw(drawn, start));
    any_stream in_steps = drawn, at_once = drawn, mixed = drawn;
    static_cast<void>(draw(drawn, a + b));
    in_steps.skip(a);
    in_steps.skip(b);
    at_once.skip(a + b);
    static_cast<void>(draw(mixed, a));
    mixed.skip(b);
    for (any_stream* other : {&in_steps, &at_once, &mixed})
      ASSERT_EQ(other->image(), drawn.image()) << start << ", " << a << ", " << b;
    ASSERT_NO_FATAL_FAILURE(expect_same(at_once, drawn));
  }
}

TEST_P(skipping_engines, long_skips_add_up) {
  // Every distance has a sum below 2^64; finite sequences end before 2^34 words here.
  const bool finite = engine().code == RVX_BRNG_SOBOL || engine().code == RVX_BRNG_NIEDERR;
  const int longest = finite ? 33 : 63;
  for (int bits = 16; bits <= longest; bits += finite ? 1 : 3) {
    any_stream s = engine().make();
    static_cast<void>(draw(s, data_.below(3 * engine().block)));
    const std::uint64_t a = (data_() >> (64 - bits)) | std::uint64_t{1} << (bits - 1);
    const std::uint64_t b = data_() >> (64 - bits);
    any_stream in_steps = s, at_once = s;
    in_steps.skip(a);
    in_steps.skip(b);
    at_once.skip(a + b);
    ASSERT_NO_FATAL_FAILURE(expect_same(in_steps, at_once)) << a << " + " << b;
    EXPECT_NE(at_once.image(), s.image());
  }
}

TEST_P(engines, counts_of_several_digits_only_where_they_are_offered) {
  any_stream s = engine().make();
  any_stream by_one = s;
  const std::uint64_t digits[] = {12345, 0, 0};
  if (!engine().skips_lists) {
    expect_lacking(s, "rvxSkipAheadStreamEx", [&] { return rvxSkipAheadStreamEx(s, 1, digits); });
    return;
  }
  ASSERT_EQ(rvxSkipAheadStreamEx(s, 3, digits), 0);
  by_one.skip(12345);
  ASSERT_NO_FATAL_FAILURE(expect_same(s, by_one));
  // 2^64 - 1 and one more are 2^64.
  const std::uint64_t wrap[] = {0, 1};
  ASSERT_EQ(rvxSkipAheadStreamEx(s, 2, wrap), 0);
  by_one.skip(~std::uint64_t{0});
  by_one.skip(1);
  ASSERT_NO_FATAL_FAILURE(expect_same(s, by_one));
}

TEST_P(engines, leapfrog_picks_every_stride_th_word) {
  any_stream s = engine().make();
  if (!engine().leapfrogs) {
    expect_lacking(s, "rvxLeapfrogStream", [&] { return rvxLeapfrogStream(s, 0, 2); });
    return;
  }
  const std::size_t parts = engine().parts;
  const words serial = draw(s, 4000);
  for (std::size_t stride : {1u, 2u, 3u, 7u, 16u, 100u}) {
    for (std::size_t idx : {std::size_t{0}, stride / 2, stride - 1}) {
      any_stream leaping = engine().make();
      ASSERT_EQ(rvxLeapfrogStream(leaping, static_cast<std::int64_t>(idx),
                                  static_cast<std::int64_t>(stride)),
                0);
      leaping.skip(2);
      const words picked = draw(leaping, 37);
      for (std::size_t i = 0; i < picked.size(); ++i)
        ASSERT_EQ(picked[i], serial[(idx + (i / parts + 2) * stride) * parts + i % parts])
            << idx << " of " << stride << ", word " << i;
    }
  }
}

TEST_P(engines, copies_go_on_alone) {
  any_stream s = engine().make();
  static_cast<void>(draw(s, 5));
  any_stream copy = s;
  const auto before = s.image();
  EXPECT_EQ(copy.image(), before);
  const words of_copy = draw(copy, 2000);
  EXPECT_EQ(s.image(), before) << "the original has not moved";
  if (repeats(engine())) {
    EXPECT_EQ(draw(s, 2000), of_copy);
  }
}

TEST_P(engines, images_survive_and_go_on) {
  for (std::size_t start : {std::size_t{0}, std::size_t{1}, engine().block - 1, engine().block,
                            engine().block + 1, std::size_t{1777}}) {
    any_stream s = engine().make();
    static_cast<void>(draw(s, start));
    const auto image = s.image();
    rvx_stream loaded = nullptr;
    ASSERT_EQ(rvxLoadStreamM(&loaded, image.data()), 0);
    std::vector<std::uint8_t> again(static_cast<std::size_t>(rvxGetStreamSize(loaded)));
    ASSERT_EQ(rvxSaveStreamM(loaded, again.data()), 0);
    EXPECT_EQ(again, image);
    support::results<std::uint32_t> r(100 * engine().parts);
    ASSERT_EQ(rvxiRngUniformBits(0, loaded, 100, r.data()), 0);
    if (repeats(engine())) {
      const words future = draw(s, 100);
      for (std::size_t i = 0; i < future.size(); ++i)
        ASSERT_EQ(r[i], future[i]) << start << " + " << i;
    }
    EXPECT_EQ(rvxDeleteStream(&loaded), 0);
  }
}

TEST_P(repeating_engines, equal_seeds_give_equal_streams_and_others_give_others) {
  any_stream a = engine().make(), b = engine().make();
  EXPECT_EQ(a.image(), b.image());
  EXPECT_EQ(draw(a, 100), draw(b, 100));
  std::vector<std::uint32_t> other = engine().seed;
  ++other[0];
  any_stream c(engine().code, other), d = engine().make();
  EXPECT_NE(draw(c, 100), draw(d, 100));
}

INSTANTIATE_TEST_SUITE_P(each, engines, testing::ValuesIn(support::every_engine()),
                         support::engine_name<engine_case>);
INSTANTIATE_TEST_SUITE_P(each, repeating_engines, testing::ValuesIn(with(repeats)),
                         support::engine_name<engine_case>);
INSTANTIATE_TEST_SUITE_P(each, skipping_engines, testing::ValuesIn(with(skips)),
                         support::engine_name<engine_case>);

}  // namespace
