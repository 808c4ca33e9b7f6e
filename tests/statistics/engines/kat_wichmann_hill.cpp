// SPDX-License-Identifier: Apache-2.0
// The published sequences of sums of multiplicative generators against the plain model, and every
// member of wichmann_hill against that model.
#include "../../kat/kat_file.hpp"
#include "wichmann_hill_stream.hpp"

namespace {

using kat = support::on_simd_target;
using numbers = plain::wichmann_hill::numbers;

numbers between(const tarn::kat::line& line, std::size_t first, std::size_t last) {
  const auto words = tarn::kat::words(line, first, last, 10);
  return {words.begin(), words.end()};
}

std::size_t place_of(const tarn::kat::line& line, const std::string& field) {
  const auto found = std::find(line.fields.begin(), line.fields.end(), field);
  EXPECT_NE(found, line.fields.end()) << "line " << line.number << " has no " << field;
  return static_cast<std::size_t>(found - line.fields.begin());
}

std::string decimals(const plain::wichmann_hill& model) {
  std::string text = "0.";
  for (const unsigned digit : model.digits(10, 25))
    text += static_cast<char>('0' + digit);
  return text;
}

TEST(published, states_and_fractions_of_the_model) {
  plain::wichmann_hill model;
  std::uint64_t steps = 0;
  std::size_t compared = 0;
  for (const auto& line : tarn::kat::read_file(TARN_KAT_FOLDER, "wichmann_hill")) {
    if (line.fields[0] == "set") {
      const std::size_t m = place_of(line, "m"), seed = place_of(line, "seed");
      model = {between(line, m + 1, seed), between(line, 3, m),
               between(line, seed + 1, line.fields.size())};
      steps = 0;
      continue;
    }
    ASSERT_EQ(line.fields[0], "state");
    const std::uint64_t wanted = std::stoull(line.fields.at(1));
    for (; steps < wanted; ++steps)
      model.step();
    const std::size_t u = place_of(line, "u");
    EXPECT_EQ(model.s, between(line, 2, u)) << "line " << line.number;
    EXPECT_EQ(decimals(model), line.fields.at(u + 1)) << "line " << line.number;
    EXPECT_LE(plain::distance(model.fixed_point(), model.fraction()), model.fixed_point_error())
        << "line " << line.number;
    ++compared;
  }
  EXPECT_EQ(compared, 6u * 16u);
}

TEST_F(kat, every_member_gives_the_words_of_its_model) {
  constexpr std::size_t count = 300;
  for (std::uint32_t member = 0; member < plain::wichmann_hill_members; ++member) {
    support::test_data data(member);
    std::vector<std::uint32_t> seed;
    numbers state;
    for (std::size_t j = 0; j < 4; ++j) {
      seed.push_back(static_cast<std::uint32_t>(data()));
      state.push_back(seed[j] % plain::wichmann_hill_rows[member].p[j]);
      ASSERT_NE(state[j], 0u);
    }
    support::wichmann_hill_stream stream(member, seed);
    const std::vector<std::uint32_t> drawn = stream.words(count);
    auto model = plain::wichmann_hill_member(member, state);
    for (std::size_t i = 0; i < count; ++i) {
      // The bound that the library states: 2^-39 before the cut.
      const std::uint64_t sum = model.fixed_point();
      ASSERT_LT(plain::distance(sum, model.fraction()), std::uint64_t{1} << 25);
      ASSERT_EQ(drawn[i], sum >> 32) << "member " << member << ", word " << i;
      model.step();
    }
    ASSERT_EQ(stream.model().s, model.s) << "member " << member;
  }
}

}  // namespace
