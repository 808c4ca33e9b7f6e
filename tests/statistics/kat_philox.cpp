// SPDX-License-Identifier: Apache-2.0
// The words of philox4x32x10 against published answers, through the public C interface.
#include "../kat/kat_file.hpp"
#include "support.hpp"

namespace {

using kat = support::on_simd_target;

const std::vector<tarn::kat::line>& answers() {
  static const auto lines = tarn::kat::read_file(TARN_KAT_FOLDER, "philox4x32x10");
  return lines;
}

// A stream seeded with the key and the counter as the seed words say: key[0], key[1], ctr[0..3].
struct seeded {
  seeded(const std::vector<std::uint32_t>& key, const std::vector<std::uint32_t>& ctr) {
    std::vector<std::uint32_t> seed = key;
    seed.insert(seed.end(), ctr.begin(), ctr.end());
    EXPECT_EQ(rvxNewStreamEx(&handle, RVX_BRNG_PHILOX4X32X10,
                             static_cast<std::int64_t>(seed.size()), seed.data()),
              0);
  }
  ~seeded() { rvxDeleteStream(&handle); }
  rvx_stream handle = nullptr;
};

void expect_words(rvx_stream stream, const tarn::kat::line& line,
                  const std::vector<std::uint32_t>& expected) {
  support::results<std::uint32_t> r(expected.size());
  ASSERT_EQ(rvxiRngUniformBits(0, stream, static_cast<std::int64_t>(expected.size()), r.data()), 0);
  for (std::size_t i = 0; i < expected.size(); ++i)
    EXPECT_EQ(r[i], expected[i]) << "line " << line.number << ", word " << i;
  EXPECT_TRUE(r.guards_intact());
}

TEST_F(kat, blocks_equal_published_ones) {
  std::size_t seen = 0;
  for (const auto& line : answers()) {
    if (line.fields[0] != "block")
      continue;
    ++seen;
    const seeded s(tarn::kat::words(line, 5, 7, 16), tarn::kat::words(line, 1, 5, 16));
    expect_words(s.handle, line, tarn::kat::answers(line, 7, 16));
  }
  EXPECT_GE(seen, 3u);
}

TEST_F(kat, streams_equal_published_ones_at_every_position) {
  std::vector<std::uint32_t> key, start;
  std::size_t seen = 0;
  for (const auto& line : answers()) {
    if (line.fields[0] == "stream" || line.fields[0] == "carry") {
      key = tarn::kat::words(line, 2, 4, 16);
      start = tarn::kat::words(line, 5, 9, 16);
    }
    if (line.fields[0] == "at" && line.fields[1] != "block") {
      ++seen;
      const seeded s(key, start);
      const std::uint64_t at = line.fields[1] == "start+0" ? 0 : std::stoull(line.fields[1]);
      const std::size_t first = line.fields[2] == ":" ? 3 : 2;
      ASSERT_EQ(rvxSkipAheadStream(s.handle, static_cast<std::int64_t>(at)), 0);
      expect_words(s.handle, line, tarn::kat::answers(line, first, 16));
    }
  }
  EXPECT_GE(seen, 11u);
}

TEST_F(kat, blocks_beyond_64_bits_are_reached_by_a_long_skip) {
  std::vector<std::uint32_t> key;
  std::size_t seen = 0;
  for (const auto& line : answers()) {
    if (line.fields[0] == "carry")
      key = tarn::kat::words(line, 2, 4, 16);
    if (line.fields[0] != "at" || line.fields[1] != "block")
      continue;
    ++seen;
    ASSERT_EQ(line.fields[2].rfind("2^", 0), 0u);
    const std::string power = line.fields[2].substr(2, line.fields[2].find(':') - 2);
    const int bit = std::stoi(power) + 2;  // four words a block
    ASSERT_GE(bit, 64);
    const std::uint64_t digits[2] = {0, std::uint64_t{1} << (bit - 64)};
    const std::size_t first = line.fields[3] == ":" ? 4 : 3;
    const seeded s(key, {0, 0, 0, 0});
    ASSERT_EQ(rvxSkipAheadStreamEx(s.handle, 2, digits), 0);
    expect_words(s.handle, line, tarn::kat::answers(line, first, 16));
  }
  EXPECT_GE(seen, 2u);
}

// The reader itself: what proves nothing must fail.
TEST(kat_reader, refuses_files_that_prove_nothing) {
  EXPECT_THROW(tarn::kat::read_file(TARN_KAT_FOLDER, "no_such_engine"), std::runtime_error);
  const tarn::kat::line zeros{1, {"block", "00000000", "0"}};
  EXPECT_THROW(tarn::kat::answers(zeros, 1, 16), std::runtime_error);
  EXPECT_THROW(tarn::kat::answers(zeros, 3, 16), std::runtime_error);
  const tarn::kat::line bad{1, {"block", "12g4"}};
  EXPECT_THROW(tarn::kat::answers(bad, 1, 16), std::runtime_error);

  std::string folder = testing::TempDir() + "tarn_kat_XXXXXX";
  ASSERT_NE(mkdtemp(folder.data()), nullptr);
  const auto write = [&](const char* text) { std::ofstream(folder + "/made.txt") << text; };
  write("");
  EXPECT_THROW(tarn::kat::read_file(folder, "made"), std::runtime_error);
  write("# Origin: here\n\n");
  EXPECT_THROW(tarn::kat::read_file(folder, "made"), std::runtime_error);
  write("block 1 2\n");
  EXPECT_THROW(tarn::kat::read_file(folder, "made"), std::runtime_error);
  write("# Origin: here\nblock 1 2\n");
  EXPECT_EQ(tarn::kat::read_file(folder, "made").size(), 1u);
  std::remove((folder + "/made.txt").c_str());
  std::remove(folder.c_str());
}

}  // namespace
