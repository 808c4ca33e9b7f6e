// SPDX-License-Identifier: Apache-2.0
// The family of Mersenne twisters over 32-bit words (Matsumoto and Nishimura, "Mersenne Twister",
// ACM TOMACS 8(1), 1998), the one shape of it that the table is made for, and its members.
#pragma once

#include <cstdint>

namespace tarn::mt2203 {

// Recurrence: x[k+words] = x[k+middle] ^ (y >> 1) ^ (y odd ? a : 0), where y is x[k] with its lower
// bits taken from x[k+1]. Output: z = x, z ^= z >> shift_u, z ^= (z << shift_s) & b,
// z ^= (z << shift_t) & c, and a last z ^= z >> shift that plays no part in equidistribution.
struct twister_shape {
  int words, middle, lower_bits;
  int shift_u, shift_s, shift_t;

  constexpr int state_bits() const { return 32 * words - lower_bits; }
  constexpr std::uint32_t lower_mask() const { return (std::uint32_t{1} << lower_bits) - 1; }
};

inline constexpr twister_shape mt2203_shape{69, 34, 5, 12, 7, 15};
static_assert(mt2203_shape.state_bits() == 2203);

struct parameters {
  std::uint32_t a, b, c;
};

constexpr bool operator==(const parameters& x, const parameters& y) {
  return x.a == y.a && x.b == y.b && x.c == y.c;
}

// The term of `a` in the recurrence.
constexpr std::uint32_t twist(std::uint32_t y, std::uint32_t a) {
  return (y >> 1) ^ (a & (0 - (y & 1)));
}

// How many members the table has. The low 16 bits of a member's `a` are its id, so that the
// characteristic polynomials of different members differ.
inline constexpr std::uint32_t members = 6024;

}  // namespace tarn::mt2203
