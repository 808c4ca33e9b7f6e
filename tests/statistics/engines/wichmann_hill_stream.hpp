// SPDX-License-Identifier: Apache-2.0
// A stream of wichmann_hill whose record tests read and set.
#pragma once

#include <array>

#include "any_stream.hpp"
#include "plain_wichmann_hill.hpp"

namespace support {

class wichmann_hill_stream : public any_stream {
 public:
  using four = std::array<std::uint32_t, 4>;

  // Where the fields stand in a stream.
  static constexpr std::size_t member_at = 16, state_at = 20, multiplier_at = 36, length = 52;

  explicit wichmann_hill_stream(std::uint32_t member, const std::vector<std::uint32_t>& seed = {})
      : any_stream(RVX_BRNG_WH + member, seed) {}

  four state() const { return at<four>(state_at); }
  four multiplier() const { return at<four>(multiplier_at); }

  plain::wichmann_hill model() const {
    const four s = state(), a = multiplier();
    plain::wichmann_hill model =
        plain::wichmann_hill_member(at<std::uint32_t>(member_at), {s.begin(), s.end()});
    model.a.assign(a.begin(), a.end());
    return model;
  }
};

// Draws n words and compares them and the stream's new state.
inline void draw_and_compare(wichmann_hill_stream& s, plain::wichmann_hill& model, std::size_t n) {
  const std::vector<std::uint32_t> drawn = s.words(n);
  for (std::size_t i = 0; i < n; ++i)
    ASSERT_EQ(drawn[i], model.next()) << "word " << i << " of " << n;
  ASSERT_EQ(s.model().s, model.s) << "after " << n << " words";
}

}  // namespace support
