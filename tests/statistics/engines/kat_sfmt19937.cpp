// SPDX-License-Identifier: Apache-2.0
// The words of sfmt19937 against published answers, and the plain model against the same ones.
#include <numeric>

#include "../../kat/kat_file.hpp"
#include "../../models/sfmt_model.hpp"
#include "any_stream.hpp"

namespace {

using kat = support::on_simd_target;

using seed_words = std::vector<std::uint32_t>;

// The seed that the answers below a line have; empty if the line names none.
seed_words named_seed(const tarn::kat::line& line) {
  const std::string& kind = line.fields.at(0);
  if (kind == "seed")
    return tarn::kat::words(line, 1, 2, 10);
  if (kind == "array")
    return tarn::kat::words(line, 1, line.fields.size(), 16);
  seed_words key;
  if (kind == "array_700") {
    for (std::uint32_t i = 0; i < 700; ++i)
      key.push_back(i * 2654435761u);
  }
  return key;
}

void expect_words(support::any_stream s, std::uint64_t position,
                  const std::vector<std::uint32_t>& expected, std::size_t line) {
  s.skip(position);
  EXPECT_EQ(s.words(expected.size()), expected) << "line " << line;
}

TEST_F(kat, published_words) {
  seed_words seed;
  int positions = 0, jumps = 0, wide = 0;
  for (const tarn::kat::line& line : tarn::kat::read_file(TARN_KAT_FOLDER, "sfmt19937")) {
    if (const seed_words next = named_seed(line); !next.empty()) {
      seed = next;
      continue;
    }
    const support::any_stream start(RVX_BRNG_SFMT19937, seed);
    const std::string& kind = line.fields.at(0);
    if (kind == "u32" || kind == "check-u32") {
      expect_words(start, std::stoull(line.fields.at(2)), tarn::kat::answers(line, 4, 10),
                   line.number);
      ++positions;
    } else if (kind == "jump_steps128" && line.fields.at(1) == "1000000") {
      expect_words(start, 4000000, tarn::kat::answers(line, 6, 10), line.number);
      ++jumps;
    } else if (kind == "jump_steps128" && line.fields.at(1) == "18446744073709551616") {
      support::any_stream s = start;  // 4 * 2^64 words in eight skips
      for (int i = 0; i < 7; ++i)
        s.skip(std::uint64_t{1} << 63);
      expect_words(s, std::uint64_t{1} << 63, tarn::kat::answers(line, 6, 10), line.number);
      ++jumps;
    } else if (kind == "u64") {
      support::any_stream s = start;
      const std::size_t n = line.fields.size() - 4;
      support::results<std::uint64_t> r(n);
      ASSERT_EQ(rvxiRngUniformBits64(0, s, static_cast<std::int64_t>(n), r.data()), 0);
      for (std::size_t i = 0; i < n; ++i)
        EXPECT_EQ(r[i], std::stoull(line.fields[4 + i])) << "line " << line.number;
      EXPECT_TRUE(r.guards_intact());
      ++wide;
    }
  }
  EXPECT_EQ(positions, 4 * 3 + 1 + 4);
  EXPECT_EQ(jumps, 4 * 2);
  EXPECT_EQ(wide, 4);
}

// The first block is the answer to the state after seeding, so the model's seeding and the stream
// meet in it.
TEST_F(kat, published_states_after_seeding) {
  std::uint32_t seed = 0;
  int states = 0;
  for (const tarn::kat::line& line : tarn::kat::read_file(TARN_KAT_FOLDER, "sfmt19937")) {
    if (line.fields.at(0) == "seed")
      seed = tarn::kat::words(line, 1, 2, 10)[0];
    if (line.fields.at(0) != "init_state")
      continue;
    const std::vector<std::uint32_t> state = tarn_test::sfmt_from_seed(seed);
    EXPECT_EQ(std::vector<std::uint32_t>(state.begin(), state.begin() + 4),
              tarn::kat::words(line, 2, 6, 16));
    EXPECT_EQ(std::vector<std::uint32_t>(state.end() - 4, state.end()),
              tarn::kat::words(line, 7, 11, 16));
    std::uint64_t hash = 1469598103934665603;  // FNV-1a from the file's own basis
    for (const std::uint32_t word : state) {
      for (int byte = 0; byte < 4; ++byte)
        hash = (hash ^ (word >> 8 * byte & 0xFF)) * 0x100000001B3;
    }
    EXPECT_EQ(hash, std::stoull(line.fields.at(12), nullptr, 16));

    tarn_test::sfmt_model model(state);
    support::any_stream s(RVX_BRNG_SFMT19937, {seed});
    const std::vector<std::uint32_t> drawn = s.words(tarn_test::sfmt_model::words);
    for (std::size_t i = 0; i < drawn.size(); ++i)
      ASSERT_EQ(drawn[i], model.word(i));
    ++states;
  }
  EXPECT_EQ(states, 4);
}

}  // namespace
