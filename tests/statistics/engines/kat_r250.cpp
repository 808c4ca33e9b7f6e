// SPDX-License-Identifier: Apache-2.0
// r250 against published answers: whole start states, and the words computed from them.
#include "../../kat/kat_file.hpp"
#include "../any_stream.hpp"

namespace {

using kat_r250 = support::on_simd_target;

TEST_F(kat_r250, words_from_given_states) {
  std::vector<std::uint32_t> state;
  std::size_t streams = 0, compared = 0;
  for (const tarn::kat::line& next : tarn::kat::read_file(TARN_KAT_FOLDER, "r250")) {
    const std::string& kind = next.fields.at(0);
    if (kind == "stream") {
      state.clear();
      ++streams;
    } else if (kind == "state") {
      ASSERT_EQ(std::stoull(next.fields.at(1)), state.size());
      const auto words = tarn::kat::words(next, 2, next.fields.size(), 16);
      state.insert(state.end(), words.begin(), words.end());
    } else {
      ASSERT_EQ(kind, "at");
      ASSERT_EQ(state.size(), 250u);
      const auto expected = tarn::kat::answers(next, 3, 10);
      support::any_stream s(RVX_BRNG_R250, state);
      s.words(std::stoull(next.fields.at(1)));
      EXPECT_EQ(s.words(expected.size()), expected) << "line " << next.number;
      ++compared;
    }
  }
  EXPECT_EQ(streams, 2u);
  EXPECT_EQ(compared, 6u);
}

}  // namespace
