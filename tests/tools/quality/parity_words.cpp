// SPDX-License-Identifier: Apache-2.0
// What quality_words writes is what the library's streams give: each layout against a model that
// makes every one of its 64 streams by itself, from the start of the sequence.
#include <algorithm>
#include <cstring>
#include <set>

#include "../../core/child_process.hpp"
#include "../../statistics/any_stream.hpp"

namespace {

using core_test::run_child;
using support::any_stream;
using words = std::vector<std::uint32_t>;

constexpr std::uint32_t seed = 20261;
constexpr std::uint32_t streams = 64;
constexpr std::uint64_t unlimited = ~std::uint64_t{0};

struct engine_row {
  std::string name;
  std::int64_t code;
  int bits;
  bool quasi_random, skips, skips_lists, leapfrogs;
};

const std::vector<engine_row>& engines() {
  enum seed_kind { u32, u64, dim, none };
  static const std::vector<engine_row> list = {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {#name, code, word_bits, seed_type == dim, skip != 0, skip_list != 0, leapfrog != 0},
#include "rng/engines/engines.def"
  };
  return list;
}

struct layout_row {
  std::string engine, layout;
  std::uint64_t high, low;
  std::string run;
};

const std::vector<layout_row>& layouts() {
  static const std::vector<layout_row> list = {
#define TARN_LAYOUT(engine, layout, high, low, run) {#engine, #layout, high, low, #run},
#include "tools/quality/layouts.def"
  };
  return list;
}

const engine_row& engine_of(const layout_row& row) {
  return *std::find_if(engines().begin(), engines().end(),
                       [&](const engine_row& e) { return e.name == row.engine; });
}

void PrintTo(const layout_row& row, std::ostream* out) {
  *out << row.engine << " " << row.layout;
}

words written(const std::string& engine, const std::string& layout, std::size_t count) {
  const auto said = run_child({engine, layout, std::to_string(seed), std::to_string(count)});
  EXPECT_EQ(said.exit_code, 0) << said.err;
  EXPECT_EQ(said.out.size(), 4 * count);
  words read(said.out.size() / 4, 0xABADCAFE);
  std::memcpy(read.data(), said.out.data(), 4 * read.size());
  return read;
}

// n words of 32 bits by the rule for the engine's words.
words judged(const engine_row& engine, any_stream stream, std::size_t n) {
  words out;
  const words raw = stream.words(engine.bits == 31 ? 2 * n : n, engine.bits == 59 ? 2 : 1);
  for (std::size_t i = 0; i < n; ++i) {
    if (engine.bits == 59) {
      const std::uint64_t word = std::uint64_t{raw[2 * i + 1]} << 32 | raw[2 * i];
      out.push_back(static_cast<std::uint32_t>(word >> 27));
    } else if (engine.bits == 31) {
      out.push_back((raw[2 * i + 1] >> 15) * 65536 + (raw[2 * i] >> 15));
    } else {
      out.push_back(raw[i]);
    }
  }
  return out;
}

// Streams whose distance from the start one skip can hold.
std::uint32_t reachable(const layout_row& row) {
  if (row.layout.rfind("skip", 0) != 0 || engine_of(row).skips_lists)
    return streams;
  return static_cast<std::uint32_t>(std::min<std::uint64_t>(streams, unlimited / row.low + 1));
}

// Stream k of a row by one skip of k distances, in three digits where the engine takes a list.
any_stream at_distance(const layout_row& row, std::uint32_t k) {
  any_stream stream(engine_of(row).code, {seed});
  if (!engine_of(row).skips_lists) {
    stream.skip(k * row.low);
    return stream;
  }
  EXPECT_EQ(row.low, 0u) << "the product below knows the upper digit alone";
  const std::uint64_t upper = row.high >> 32;
  const std::uint64_t lower = (row.high & 0xFFFFFFFF) * k;
  const std::uint64_t middle = upper * k + (lower >> 32);
  const std::uint64_t digits[] = {0, middle << 32 | (lower & 0xFFFFFFFF), middle >> 32};
  EXPECT_EQ(rvxSkipAheadStreamEx(stream, 3, digits), 0);
  return stream;
}

any_stream model(const layout_row& row, std::uint32_t k) {
  const std::int64_t code = engine_of(row).code;
  if (row.layout == "single")
    return any_stream(code, {seed});
  if (row.layout == "family")
    return any_stream(code + k, {seed});
  if (row.layout == "key")
    return any_stream(code, {k, seed});
  if (row.layout == "seeds")
    return any_stream(code, {64 * seed + k});
  if (row.layout == "leapfrog" || row.layout == "stride") {
    any_stream stream(code, {seed});
    EXPECT_EQ(rvxLeapfrogStream(stream, k, streams), 0);
    return stream;
  }
  return at_distance(row, k);
}

class layout : public testing::TestWithParam<layout_row> {};

TEST_P(layout, has_the_words_of_its_streams) {
  const layout_row& row = GetParam();
  const engine_row& engine = engine_of(row);
  constexpr std::size_t turns = 2500;  // more than two chunks, and no whole one
  if (row.engine == "nondeterministic") {
    const words first = written(row.engine, row.layout, turns);
    EXPECT_NE(first, written(row.engine, row.layout, turns));
    return;
  }
  if (row.layout == "single" || row.layout == "stride") {
    EXPECT_EQ(written(row.engine, row.layout, turns), judged(engine, model(row, 0), turns));
    return;
  }
  const words all = written(row.engine, row.layout, turns * streams - 5);
  const std::uint32_t known = reachable(row);
  ASSERT_GE(known, 4u);
  for (std::uint32_t k = 0; k < known; ++k) {
    words of_stream;
    for (std::size_t i = k; i < all.size(); i += streams)
      of_stream.push_back(all[i]);
    ASSERT_EQ(of_stream, judged(engine, model(row, k), of_stream.size())) << "stream " << k;
  }
}

TEST_P(layout, that_needs_no_run_is_the_single_stream) {
  const layout_row& row = GetParam();
  constexpr std::size_t count = 64 * 1500;
  const bool same = written(row.engine, row.layout, count) == written(row.engine, "single", count);
  const bool seeded = row.engine != "nondeterministic";
  EXPECT_EQ(same, seeded && (row.run == "same" || row.layout == "single"));
}

std::string layout_name(const testing::TestParamInfo<layout_row>& param) {
  return param.param.engine + "_" + param.param.layout;
}
INSTANTIATE_TEST_SUITE_P(all, layout, testing::ValuesIn(layouts()), layout_name);

// What an engine offers for many streams is judged, and quasi-random ones are not.
TEST(layouts, are_those_that_engines_offer) {
  ASSERT_EQ(engines().size(), 13u);
  for (const engine_row& engine : engines()) {
    std::set<std::string> of_engine;
    for (const layout_row& row : layouts())
      if (row.engine == engine.name)
        of_engine.insert(row.layout);
    const bool judged_at_all = !engine.quasi_random;
    EXPECT_EQ(of_engine.count("single"), judged_at_all) << engine.name;
    EXPECT_EQ(of_engine.count("skip"), judged_at_all && engine.skips) << engine.name;
    EXPECT_EQ(of_engine.count("leapfrog"), judged_at_all && engine.leapfrogs) << engine.name;
  }
}

TEST(words, are_no_engines_unless_named) {
  for (const std::vector<std::string>& bad : {std::vector<std::string>{},
                                              {"mcg59"},
                                              {"mcg59", "single"},
                                              {"mcg59", "key", "1"},
                                              {"sobol", "single", "1"},
                                              {"mcg59", "single", "-1"},
                                              {"mcg59", "single", "4294967296"},
                                              {"mcg59", "single", "1", "x"},
                                              {"mcg59", "single", "1", "2", "3"},
                                              {"--help"}}) {
    const auto said = run_child(bad);
    EXPECT_EQ(said.exit_code, 2) << testing::PrintToString(bad);
    EXPECT_EQ(core_test::lines_with(said.err, "usage: quality_words"), 1);
    EXPECT_TRUE(said.out.empty());
  }
}

TEST(words, list_every_row) {
  const auto said = run_child({"--list"});
  EXPECT_EQ(said.exit_code, 0);
  std::string wanted;
  for (const layout_row& row : layouts())
    wanted += row.engine + " " + row.layout + " " + row.run + "\n";
  EXPECT_EQ(said.out, wanted);
}

}  // namespace
