// SPDX-License-Identifier: Apache-2.0
// MRG32k3a (L'Ecuyer: Good Parameters and Implementations for Combined Multiple Recursive Random
// Number Generators, Oper. Res. 47, 1999): two recurrences of order three, modulo m1 and m2, and
//   x(n) = (1403580 x(n-2) - 810728 x(n-3)) mod m1
//   y(n) = (527612 y(n-1) - 1370589 y(n-3)) mod m2
//   z(n) = (x(n) - y(n)) mod m1, with m1 in place of 0.
// A jump multiplies the state by a power of the transition matrix (L'Ecuyer, Simard, Chen, Kelton:
// An Object-Oriented Random-Number Package with Many Long Streams and Substreams, Oper. Res. 50,
// 2002).
#pragma once

#include <cstddef>
#include <cstdint>

namespace tarn::statistics::mrg32k3a {

inline constexpr std::uint32_t m1 = 4294967087;  // 2^32 - 209
inline constexpr std::uint32_t m2 = 4294944443;  // 2^32 - 22853

// What the last three values of x and of y are multiplied by; the last ones are subtracted.
inline constexpr std::uint32_t x_step[2] = {1403580, 810728};
inline constexpr std::uint32_t y_step[2] = {527612, 1370589};

// The last three values of each recurrence, oldest first; the record as it stands in a stream.
struct state {
  std::uint32_t x[3], y[3];
};
static_assert(sizeof(state) == 24);

// A matrix for each recurrence.
struct matrix {
  std::uint32_t x[3][3], y[3][3];
};

// The transition matrix, one step forward.
inline constexpr matrix transition = {{{0, 1, 0}, {0, 0, 1}, {m1 - x_step[1], x_step[0], 0}},
                                      {{0, 1, 0}, {0, 0, 1}, {m2 - y_step[1], 0, y_step[0]}}};

// The inner product of a row of a matrix and three values. A product p is replaced by the smaller
// number (p >> 32) (2^32 - modulus) + (p mod 2^32), congruent and below 2^47, so that the sum fits.
template <std::uint32_t modulus>
constexpr std::uint32_t inner(const std::uint32_t row[3], std::uint32_t v0, std::uint32_t v1,
                              std::uint32_t v2) {
  const std::uint32_t value[3] = {v0, v1, v2};
  std::uint64_t sum = 0;
  for (int i = 0; i < 3; ++i) {
    const std::uint64_t p = std::uint64_t{row[i]} * value[i];
    sum += (p >> 32) * (0u - modulus) + (p & 0xFFFFFFFF);
  }
  return static_cast<std::uint32_t>(sum % modulus);
}

constexpr state operator*(const matrix& a, const state& s) {
  state r{};
  for (int i = 0; i < 3; ++i) {
    r.x[i] = inner<m1>(a.x[i], s.x[0], s.x[1], s.x[2]);
    r.y[i] = inner<m2>(a.y[i], s.y[0], s.y[1], s.y[2]);
  }
  return r;
}

constexpr matrix operator*(const matrix& a, const matrix& b) {
  matrix r{};
  for (int i = 0; i < 3; ++i) {
    for (int j = 0; j < 3; ++j) {
      r.x[i][j] = inner<m1>(a.x[i], b.x[0][j], b.x[1][j], b.x[2][j]);
      r.y[i][j] = inner<m2>(a.y[i], b.y[0][j], b.y[1][j], b.y[2][j]);
    }
  }
  return r;
}

// Moves to the next word and returns it.
inline std::uint32_t next(state& s) {
  const std::uint64_t x =
      (std::uint64_t{x_step[0]} * s.x[1] + std::uint64_t{x_step[1]} * (m1 - s.x[0])) % m1;
  const std::uint64_t y =
      (std::uint64_t{y_step[0]} * s.y[2] + std::uint64_t{y_step[1]} * (m2 - s.y[0])) % m2;
  s = {{s.x[1], s.x[2], static_cast<std::uint32_t>(x)},
       {s.y[1], s.y[2], static_cast<std::uint32_t>(y)}};
  return static_cast<std::uint32_t>(x > y ? x - y : x - y + m1);
}

// Words of a round. As many as a block of words has, which distributions ask for.
inline constexpr std::size_t round_words = 1024;

// Writes the next round_words words after s with SIMD.
void write_round(const state& s, std::uint32_t* out);

}  // namespace tarn::statistics::mrg32k3a
