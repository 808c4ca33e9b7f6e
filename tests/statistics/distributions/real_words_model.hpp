// SPDX-License-Identifier: Apache-2.0
// What tests of closed formulas share: words of one's choice and the reals that philox reads in
// them, plain and with one rounding.
#pragma once

#include <cmath>
#include <cstdint>
#include <vector>

#include "support.hpp"

namespace support {

// The real of [lo, hi) that the word means.
template <class Real>
Real real_of_word(std::uint32_t word, Real lo, Real hi) {
  const Real scale = (hi - lo) * static_cast<Real>(0x1p-32);
  const Real offset = (lo + hi) * static_cast<Real>(0.5);
  return std::fma(static_cast<Real>(static_cast<std::int32_t>(word)), scale, offset);
}

constexpr plain::two script_key{21, 22};

// The values of draw(stream, n, r) where the stream's next words are these four.
template <class Real, class Draw>
std::vector<Real> values_of_words(stream& s, const plain::four& words, std::size_t n,
                                  const Draw& draw) {
  s.set(script_key, plain::counter_of(words, script_key), 0);
  results<Real> r(n);
  EXPECT_EQ(draw(s, static_cast<std::int64_t>(n), r.data()), 0);
  EXPECT_TRUE(r.guards_intact());
  std::vector<Real> values(n);
  for (std::size_t i = 0; i < n; ++i)
    values[i] = r[i];
  return values;
}

// Words at the ends of the range and with single bits: reals next to lo, hi and the middle.
inline std::vector<std::uint32_t> telling_words() {
  std::vector<std::uint32_t> words{0, 0xFFFFFFFF, 0x80000000, 0x7FFFFFFF};
  for (int i = 0; i < 32; ++i) {
    const std::uint32_t bit = std::uint32_t{1} << i;
    for (const std::uint32_t word : {bit, ~bit, 0 - bit, 0x80000000 + bit, 0x7FFFFFFF - bit})
      words.push_back(word);
  }
  while (words.size() % 4 != 0)
    words.push_back(0x12345678);
  return words;
}

// Large calls: values and the place of the stream do not depend on threads or on how results are
// stored; `shift` moves them off the lines of the cache.
template <class Real, class Draw>
void expect_same_on_threads(std::size_t n, std::size_t shift, const Draw& draw) {
  const int before = tarn_serv_get_max_threads();
  std::vector<Real> expected;
  for (const int threads : {1, 2, 3}) {
    tarn_serv_set_max_threads(threads);
    stream s(5);
    std::vector<Real> r(n + shift + 4);
    EXPECT_EQ(draw(s, static_cast<std::int64_t>(n), r.data() + shift), 0);
    EXPECT_EQ(draw(s, std::int64_t{4}, r.data() + shift + n), 0);
    if (threads == 1)
      expected = r;
    EXPECT_TRUE(r == expected) << threads << " threads, " << n << " values";
  }
  tarn_serv_set_max_threads(before);
}

}  // namespace support
