// SPDX-License-Identifier: Apache-2.0
// ARS-5 as the papers say it (AES: FIPS-197; ARS: Salmon, Moraes, Dror and Shaw, SC 2011, section
// 3.2), byte by byte and one word at a time. It shares no code with the library.
#pragma once

#include <array>
#include <cstdint>

namespace plain {

__extension__ using u128 = unsigned __int128;

namespace aes {

using bytes = std::array<std::uint8_t, 16>;  // column after column, as the standard fills its array

inline std::uint8_t product(std::uint8_t a, std::uint8_t b) {
  unsigned sum = 0, shifted = a;
  for (unsigned bit = 0; bit < 8; ++bit) {
    if ((b >> bit & 1) != 0)
      sum ^= shifted;
    shifted <<= 1;
    if ((shifted & 0x100) != 0)
      shifted ^= 0x11B;
  }
  return static_cast<std::uint8_t>(sum);
}

// SubBytes, section 5.1.1: the inverse is found by trying, the affine map bit by bit.
inline std::uint8_t substituted(std::uint8_t a) {
  unsigned inverse = 0;
  for (unsigned b = 1; b < 256; ++b) {
    if (product(a, static_cast<std::uint8_t>(b)) == 1)
      inverse = b;
  }
  unsigned result = 0;
  for (unsigned i = 0; i < 8; ++i) {
    unsigned bit = 0x63u >> i;
    for (unsigned distance : {0u, 4u, 5u, 6u, 7u})
      bit ^= inverse >> ((i + distance) % 8);
    result |= (bit & 1) << i;
  }
  return static_cast<std::uint8_t>(result);
}

inline const std::array<std::uint8_t, 256>& s_box() {
  static const std::array<std::uint8_t, 256> box = [] {
    std::array<std::uint8_t, 256> made{};
    for (unsigned a = 0; a < 256; ++a)
      made[a] = substituted(static_cast<std::uint8_t>(a));
    return made;
  }();
  return box;
}

inline bytes sum(const bytes& a, const bytes& b) {
  bytes s;
  for (std::size_t i = 0; i < 16; ++i)
    s[i] = a[i] ^ b[i];
  return s;
}

inline bytes round(const bytes& state, const bytes& key, bool last) {
  bytes rows;  // SubBytes and ShiftRows
  for (std::size_t r = 0; r < 4; ++r) {
    for (std::size_t c = 0; c < 4; ++c)
      rows[4 * c + r] = s_box()[state[4 * ((c + r) % 4) + r]];
  }
  if (last)
    return sum(rows, key);
  constexpr std::uint8_t first_row[4] = {2, 3, 1, 1};
  bytes columns{};  // MixColumns
  for (std::size_t c = 0; c < 4; ++c) {
    for (std::size_t r = 0; r < 4; ++r) {
      for (std::size_t i = 0; i < 4; ++i)
        columns[4 * c + r] ^= product(first_row[(i + 4 - r) % 4], rows[4 * c + i]);
    }
  }
  return sum(columns, key);
}

}  // namespace aes

// The serial stream: words of successive blocks, modulo 2^130.
struct ars5_stream {
  std::array<std::uint64_t, 2> key;
  u128 block;
  unsigned word;  // 0..3 within the block

  static aes::bytes bytes_of(std::uint64_t low, std::uint64_t high) {
    aes::bytes b;
    for (unsigned i = 0; i < 8; ++i) {
      b[i] = static_cast<std::uint8_t>(low >> (8 * i));
      b[8 + i] = static_cast<std::uint8_t>(high >> (8 * i));
    }
    return b;
  }

  std::uint32_t next() {
    aes::bytes state = aes::sum(
        bytes_of(static_cast<std::uint64_t>(block), static_cast<std::uint64_t>(block >> 64)),
        bytes_of(key[0], key[1]));
    for (unsigned r = 1; r <= 5; ++r) {
      const aes::bytes round_key =
          bytes_of(key[0] + r * 0x9E3779B97F4A7C15u, key[1] + r * 0xBB67AE8584CAA73Bu);
      state = aes::round(state, round_key, r == 5);
    }
    std::uint32_t result = 0;
    for (unsigned i = 4; i-- > 0;)
      result = result << 8 | state[4 * word + i];
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
