// SPDX-License-Identifier: Apache-2.0
// See decimation.hpp. Let H take every second word's bit 0 of the sequence from a state S, and give
// the state whose sequence has those bits 0. If the period is 2^p - 1 with p = 2203, H permutes the
// roots cyclically, and H^p S = S. If the characteristic polynomial is reducible, only states with
// H S = S can come back after p times, p being a prime. So the test: H^p S = S, but not H S = S.
#include "decimation.hpp"

#include <algorithm>
#include <vector>

#include "twister.hpp"

namespace tarn::mt2203 {

namespace {

using lanes = std::array<std::uint32_t, decimation_lanes>;

constexpr std::size_t p = static_cast<std::size_t>(mt2203_shape.state_bits());
constexpr std::size_t n = static_cast<std::size_t>(mt2203_shape.words);
constexpr std::size_t m = static_cast<std::size_t>(mt2203_shape.middle);
constexpr std::uint32_t lower = mt2203_shape.lower_mask();
constexpr std::uint32_t upper = ~lower;

// Words n.. of the sequence from words 0..n-1.
void run_forwards(const lanes& a, std::vector<lanes>& x) {
  for (std::size_t k = 0; k + n < x.size(); ++k)
    for (std::size_t i = 0; i < decimation_lanes; ++i)
      x[k + n][i] = x[k + m][i] ^ twist((x[k][i] & upper) | (x[k + 1][i] & lower), a[i]);
}

// The state in words 0..n-1 from the bits 0 of words 1..p. Going backwards, bit j of a word comes
// from bit j - 1 of words above it, and from bit 0, which is known; what else stands in the last
// words never reaches the first n. Bit 31 of `a` is not needed.
void run_backwards(const lanes& a, std::vector<lanes>& x) {
  for (std::size_t k = p - n + 1; k-- > 0;)
    for (std::size_t i = 0; i < decimation_lanes; ++i) {
      const std::uint32_t odd = x[k + 1][i] & 1;
      const std::uint32_t z = x[k + n][i] ^ x[k + m][i] ^ (a[i] & (0 - odd));
      const std::uint32_t y = z << 1 | odd;
      x[k][i] = (y & upper) | (x[k][i] & 1);
      x[k + 1][i] = (x[k + 1][i] & upper) | (y & lower);
    }
}

// The states of one lane are the same: the lower bits of word 0 are no part of a state.
bool same_state(const std::vector<lanes>& x, const std::vector<lanes>& y, std::size_t lane) {
  bool same = ((x[0][lane] ^ y[0][lane]) & upper) == 0;
  for (std::size_t k = 1; k < n; ++k)
    same = same && x[k][lane] == y[k][lane];
  return same;
}

// Any state will do; this one is filled by a linear congruential generator.
std::vector<lanes> first_state() {
  std::vector<lanes> x(2 * p);
  std::uint32_t word = 1;
  for (std::size_t k = 0; k < n; ++k) {
    word = word * 1664525 + 1013904223;
    x[k].fill(word ^ word >> 16);
  }
  return x;
}

}  // namespace

std::array<bool, decimation_lanes> irreducible_by_decimation(const lanes& a) {
  const std::vector<lanes> start = first_state();
  std::vector<lanes> x = start;
  std::array<bool, decimation_lanes> result;
  result.fill(true);
  for (std::size_t round = 1; round <= p; ++round) {
    run_forwards(a, x);
    for (std::size_t k = 1; k <= p; ++k)
      for (std::size_t i = 0; i < decimation_lanes; ++i)
        x[k][i] = x[2 * k - 1][i] & 1;
    run_backwards(a, x);
    if (round == 1 || round == p)
      for (std::size_t i = 0; i < decimation_lanes; ++i)
        result[i] = result[i] && same_state(x, start, i) == (round == p);
  }
  for (std::size_t i = 0; i < decimation_lanes; ++i)
    result[i] = result[i] && a[i] >> 31 != 0;
  return result;
}

}  // namespace tarn::mt2203
