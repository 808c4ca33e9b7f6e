// SPDX-License-Identifier: Apache-2.0
// The serial stream of philox4x32x10 on the plain model, one word at a time with 128-bit positions,
// and the inverse of Philox, which finds the counter of any wanted block.
#pragma once

#include <array>
#include <cstdint>

#include "../models/philox_model.hpp"

namespace plain {

using u128 = tarn_test::uint128;

using four = std::array<std::uint32_t, 4>;
using two = std::array<std::uint32_t, 2>;

inline constexpr std::uint64_t m0 = 0xD2511F53, m1 = 0xCD9E8D57;
inline constexpr std::uint32_t w0 = 0x9E3779B9, w1 = 0xBB67AE85;

inline std::uint32_t high(std::uint64_t x) {
  return static_cast<std::uint32_t>(x >> 32);
}
inline std::uint32_t low(std::uint64_t x) {
  return static_cast<std::uint32_t>(x);
}

// The inverse of an odd number modulo 2^32, by Newton's iteration: each step doubles the bits.
inline std::uint32_t inverse(std::uint64_t odd) {
  const std::uint32_t a = low(odd);
  std::uint32_t x = a;  // right in three bits
  for (int i = 0; i < 4; ++i)
    x *= 2 - a * x;
  return x;
}

// The counter whose block is `wanted`.
inline u128 counter_of(four wanted, two key) {
  four x = wanted;
  for (std::uint32_t r = 10; r-- > 0;) {
    const std::uint32_t k0 = key[0] + r * w0, k1 = key[1] + r * w1;
    const std::uint32_t x2 = x[1] * inverse(m1), x0 = x[3] * inverse(m0);
    x = {x0, x[0] ^ high(m1 * x2) ^ k0, x2, x[2] ^ high(m0 * x0) ^ k1};
  }
  u128 ctr = 0;
  for (unsigned i = 4; i-- > 0;)
    ctr = ctr << 32 | x[i];
  return ctr;
}

// The serial stream: words of successive blocks, modulo 2^130.
struct stream {
  two key;
  u128 block;
  unsigned word;  // 0..3 within the block

  std::uint32_t next() {
    const std::uint32_t result = tarn_test::philox_model(key[0], key[1]).block(block)[word];
    skip(0, 1);
    return result;
  }

  void skip(u128 blocks, unsigned words) {
    const unsigned sum = word + words;
    block += blocks + sum / 4;
    word = sum % 4;
  }
};

}  // namespace plain
