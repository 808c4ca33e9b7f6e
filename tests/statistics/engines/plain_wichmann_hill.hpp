// SPDX-License-Identifier: Apache-2.0
// Sums of multiplicative generators as the papers say it (Wichmann and Hill, Applied Statistics 31,
// 1982; Maclaren, Applied Statistics 38, 1989), one word at a time: the exact fraction, and the
// fixed-point sum that the library's words are the high half of. It shares no code with the
// library but the rows of its table.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace plain {

__extension__ using u128 = unsigned __int128;

class wichmann_hill {
 public:
  using numbers = std::vector<std::uint64_t>;

  numbers p, a, s;

  void step() { jump(1); }

  // s <- a^count s, by the binary digits of the count.
  void jump(u128 count) {
    for (std::size_t j = 0; j < s.size(); ++j)
      s[j] = s[j] * power(a[j], count, p[j]) % p[j];
  }

  // Words idx, idx + stride, ... of those to come.
  void leapfrog(std::uint64_t idx, std::uint64_t stride) {
    jump(idx);
    for (std::size_t j = 0; j < a.size(); ++j)
      a[j] = power(a[j], stride, p[j]);
  }

  // The first digits of the fraction of the sum of all s_j / p_j, to any base, cut.
  std::vector<unsigned> digits(unsigned base, int count) const {
    u128 whole = 1, part = 0;
    for (const std::uint64_t modulus : p)
      whole *= modulus;
    for (std::size_t j = 0; j < s.size(); ++j)
      part = (part + whole / p[j] * s[j]) % whole;
    std::vector<unsigned> found;
    for (int i = 0; i < count; ++i) {
      part *= base;
      found.push_back(static_cast<unsigned>(part / whole));
      part %= whole;
    }
    return found;
  }

  // The fraction in units of 2^-64, cut.
  std::uint64_t fraction() const {
    std::uint64_t bits = 0;
    for (const unsigned digit : digits(2, 64))
      bits = bits << 1 | digit;
    return bits;
  }

  // The same from reciprocals that are rounded to whole units.
  std::uint64_t fixed_point() const {
    u128 sum = 0;
    for (std::size_t j = 0; j < s.size(); ++j)
      sum += s[j] * (((u128{1} << 65) / p[j] + 1) / 2);
    return static_cast<std::uint64_t>(sum);
  }

  // How far the rounding can put the second from the first: half a unit for each unit of an s_j.
  std::uint64_t fixed_point_error() const {
    std::uint64_t units = 1;
    for (const std::uint64_t state : s)
      units += (state + 1) / 2;
    return units;
  }

  std::uint32_t next() {
    const auto word = static_cast<std::uint32_t>(fixed_point() >> 32);
    step();
    return word;
  }

 private:
  static std::uint64_t power(std::uint64_t base, u128 count, std::uint64_t modulus) {
    std::uint64_t result = 1;
    for (; count != 0; count >>= 1) {
      if ((count & 1) != 0)
        result = result * base % modulus;
      base = base * base % modulus;
    }
    return result;
  }
};

// The distance of two numbers on the circle of 2^64 units.
inline std::uint64_t distance(std::uint64_t a, std::uint64_t b) {
  return a - b < b - a ? a - b : b - a;
}

// The constants of the library's members: moduli, then multipliers.
struct wichmann_hill_row {
  std::uint32_t p[4], a[4];
};
inline constexpr wichmann_hill_row wichmann_hill_rows[] = {
#include "tables/wichmann_hill_table.inc"
};
inline constexpr std::size_t wichmann_hill_members =
    sizeof wichmann_hill_rows / sizeof *wichmann_hill_rows;

inline wichmann_hill wichmann_hill_member(std::size_t member, wichmann_hill::numbers state) {
  const wichmann_hill_row& row = wichmann_hill_rows[member];
  return {{row.p, row.p + 4}, {row.a, row.a + 4}, std::move(state)};
}

}  // namespace plain
