// SPDX-License-Identifier: Apache-2.0
// SFMT19937 written from the paper (Saito, Matsumoto: SIMD-Oriented Fast Mersenne Twister, MCQMC
// 2006) and its authors' initialisations as plainly as can be: 128-bit numbers, one after the
// other. It shares no code with the library.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "philox_model.hpp"

namespace tarn_test {

class sfmt_model {
 public:
  static constexpr std::size_t order = 156, words = 4 * order;

  // From the 624 words of a state; the stream begins behind them.
  explicit sfmt_model(const std::vector<std::uint32_t>& state) {
    for (std::size_t i = 0; i < words; i += 4) {
      uint128 element = 0;
      for (std::size_t part = 4; part-- > 0;)
        element = element << 32 | state.at(i + part);
      x_.push_back(element);
    }
  }

  // Element i of the recurrence; the first 156 are the state.
  uint128 element(std::size_t i) {
    while (x_.size() <= i)
      x_.push_back(next(&x_[x_.size() - order]));
    return x_[i];
  }

  // Word i of the stream.
  std::uint32_t word(std::size_t i) {
    return static_cast<std::uint32_t>(element(order + i / 4) >> 32 * (i % 4));
  }

 private:
  static uint128 next(const uint128* x) {
    constexpr std::uint32_t mask[4] = {0xdfffffef, 0xddfecb7f, 0xbffaffff, 0xbffffff6};
    uint128 b = 0, d = 0;
    for (unsigned part = 0; part < 4; ++part) {
      const auto middle = static_cast<std::uint32_t>(x[122] >> 32 * part);
      const auto last = static_cast<std::uint32_t>(x[155] >> 32 * part);
      b |= uint128{(middle >> 11) & mask[part]} << 32 * part;
      d |= uint128{last << 18} << 32 * part;
    }
    return x[0] ^ x[0] << 8 ^ b ^ x[154] >> 8 ^ d;
  }

  std::vector<uint128> x_;
};

// Period certification: a state whose first element has an even number of ones among these bits
// gets its lowest bit changed.
inline std::vector<std::uint32_t> sfmt_certified(std::vector<std::uint32_t> x) {
  const std::uint32_t parity[4] = {0x00000001, 0x00000000, 0x00000000, 0x13c9e684};
  int ones = 0;
  for (std::size_t i = 0; i < 4; ++i)
    ones += __builtin_popcount(x[i] & parity[i]);
  if (ones % 2 == 0)
    x[0] ^= 1;
  return x;
}

inline std::vector<std::uint32_t> sfmt_from_seed(std::uint32_t seed) {
  std::vector<std::uint32_t> x{seed};
  for (std::uint32_t i = 1; i < sfmt_model::words; ++i)
    x.push_back(1812433253u * (x.back() ^ x.back() >> 30) + i);
  return sfmt_certified(x);
}

inline std::vector<std::uint32_t> sfmt_from_key(const std::vector<std::uint32_t>& key) {
  constexpr std::size_t n = sfmt_model::words, lag = 11, mid = (n - lag) / 2;
  std::vector<std::uint32_t> x(n, 0x8b8b8b8b);
  const std::size_t first_pass = std::max(n, key.size() + 1);
  std::size_t i = 0;
  for (std::size_t step = 0; step < first_pass; ++step, i = (i + 1) % n) {
    std::uint32_t r = x[i] ^ x[(i + mid) % n] ^ x[(i + n - 1) % n];
    r = (r ^ r >> 27) * 1664525u;
    x[(i + mid) % n] += r;
    if (step == 0)
      r += static_cast<std::uint32_t>(key.size());
    else
      r += static_cast<std::uint32_t>(i) + (step <= key.size() ? key[step - 1] : 0);
    x[(i + mid + lag) % n] += r;
    x[i] = r;
  }
  for (std::size_t step = 0; step < n; ++step, i = (i + 1) % n) {
    std::uint32_t r = x[i] + x[(i + mid) % n] + x[(i + n - 1) % n];
    r = (r ^ r >> 27) * 1566083941u;
    x[(i + mid) % n] ^= r;
    r -= static_cast<std::uint32_t>(i);
    x[(i + mid + lag) % n] ^= r;
    x[i] = r;
  }
  return sfmt_certified(x);
}

}  // namespace tarn_test
