// SPDX-License-Identifier: Apache-2.0
// MRG32k3a one word at a time, from the recurrence of L'Ecuyer (Oper. Res. 47, 1999), and its jumps
// by counts of any length, in plain division.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include <boost/multiprecision/cpp_int.hpp>

#include "philox_model.hpp"

namespace plain_mrg {

using boost::multiprecision::cpp_int;

inline constexpr std::int64_t m1 = 4294967087, m2 = 4294944443;

using triple = std::array<std::uint32_t, 3>;
using square = std::array<std::array<std::uint64_t, 3>, 3>;

inline square product(const square& a, const square& b, std::uint64_t modulus) {
  square c{};
  for (std::size_t i = 0; i < 3; ++i) {
    for (std::size_t j = 0; j < 3; ++j) {
      tarn_test::uint128 sum = 0;
      for (std::size_t k = 0; k < 3; ++k)
        sum += tarn_test::uint128{a[i][k]} * b[k][j];
      c[i][j] = static_cast<std::uint64_t>(sum % modulus);
    }
  }
  return c;
}

// What a step does to the last three values, oldest first.
inline constexpr square x_step = {{{0, 1, 0}, {0, 0, 1}, {m1 - 810728, 1403580, 0}}};
inline constexpr square y_step = {{{0, 1, 0}, {0, 0, 1}, {m2 - 1370589, 0, 527612}}};

inline square power(const square& step, const cpp_int& exponent, std::uint64_t modulus) {
  square result = {{{1, 0, 0}, {0, 1, 0}, {0, 0, 1}}};
  for (std::size_t bit = exponent == 0 ? 0 : msb(exponent) + 1; bit-- > 0;) {
    result = product(result, result, modulus);
    if (bit_test(exponent, static_cast<unsigned>(bit)))
      result = product(result, step, modulus);
  }
  return result;
}

inline triple image(const square& a, const triple& v, std::uint64_t modulus) {
  triple result{};
  for (std::size_t i = 0; i < 3; ++i) {
    tarn_test::uint128 sum = 0;
    for (std::size_t k = 0; k < 3; ++k)
      sum += tarn_test::uint128{a[i][k]} * v[k];
    result[i] = static_cast<std::uint32_t>(sum % modulus);
  }
  return result;
}

struct model {
  triple x, y;

  bool operator==(const model& other) const { return x == other.x && y == other.y; }

  std::uint32_t next() {
    std::int64_t p = (1403580 * std::int64_t{x[1]} - 810728 * std::int64_t{x[0]}) % m1;
    std::int64_t q = (527612 * std::int64_t{y[2]} - 1370589 * std::int64_t{y[0]}) % m2;
    if (p < 0)
      p += m1;
    if (q < 0)
      q += m2;
    x = {x[1], x[2], static_cast<std::uint32_t>(p)};
    y = {y[1], y[2], static_cast<std::uint32_t>(q)};
    return static_cast<std::uint32_t>(p > q ? p - q : p - q + m1);
  }

  void skip(const cpp_int& count) {
    x = image(power(x_step, count, m1), x, m1);
    y = image(power(y_step, count, m2), y, m2);
  }
};

// (m1^3 - 1)(m2^3 - 1) / 2.
inline cpp_int period() {
  const cpp_int a = m1, b = m2;
  return (a * a * a - 1) * (b * b * b - 1) / 2;
}
static_assert(sizeof(model) == 24);

}  // namespace plain_mrg
