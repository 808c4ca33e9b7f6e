// SPDX-License-Identifier: Apache-2.0
// The tables of an AES round (FIPS-197), computed at compile time from their definitions in
// GF(2^8) modulo x^8 + x^4 + x^3 + x + 1.
#pragma once

#include <cstdint>

namespace tarn::statistics::aes {

constexpr std::uint8_t times_x(std::uint8_t a) {
  return static_cast<std::uint8_t>(a << 1 ^ (a >> 7) * 0x1B);
}

struct byte_table {
  std::uint8_t of[256];
};

// SubBytes: the inverse (0 for 0), then the affine map.
constexpr byte_table substitution() {
  // x + 1 generates the group of the field: power[i] is its i-th power.
  std::uint8_t power[255] = {}, logarithm[256] = {};
  std::uint8_t p = 1;
  for (int i = 0; i < 255; ++i) {
    power[i] = p;
    logarithm[p] = static_cast<std::uint8_t>(i);
    p = static_cast<std::uint8_t>(p ^ times_x(p));
  }
  byte_table table{};
  for (int a = 0; a < 256; ++a) {
    const unsigned inverse = a == 0 ? 0 : power[(255 - logarithm[a]) % 255];
    const unsigned twice = inverse << 8 | inverse;  // its rotations are windows of this
    table.of[a] = static_cast<std::uint8_t>(inverse ^ twice >> 7 ^ twice >> 6 ^ twice >> 5 ^
                                            twice >> 4 ^ 0x63u);
  }
  return table;
}

inline constexpr byte_table sub_bytes = substitution();

struct word_table {
  std::uint32_t of[256];
};

// What a byte in row 0 contributes to its column: by SubBytes alone (the last round), or by
// SubBytes and MixColumns, whose first column is 2, 1, 1, 3. Row 0 is the lowest byte of a word.
constexpr word_table contributions(bool mix) {
  word_table table{};
  for (int a = 0; a < 256; ++a) {
    const std::uint32_t s = sub_bytes.of[a];
    const std::uint32_t s2 = times_x(sub_bytes.of[a]);
    table.of[a] = mix ? s2 | s << 8 | s << 16 | (s ^ s2) << 24 : s;
  }
  return table;
}

inline constexpr word_table substituted = contributions(false);
inline constexpr word_table mixed = contributions(true);

}  // namespace tarn::statistics::aes
