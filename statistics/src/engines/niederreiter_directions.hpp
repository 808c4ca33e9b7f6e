// SPDX-License-Identifier: Apache-2.0
// Direction words of a dimension of Niederreiter's sequence in base 2 (Niederreiter, J. Number
// Theory 30, 1988), in the way of Bratley, Fox and Niederreiter (Implementation and Tests of
// Low-Discrepancy Sequences, ACM TOMACS 2, 1992; Algorithm 738, ACM TOMS 20, 1994).
//
// A polynomial over GF(2) is a number, bit i being the coefficient of t^i.
#pragma once

#include <cstdint>

namespace tarn::statistics::niederreiter {

// Dimensions of the default table.
inline constexpr std::uint32_t table_dims = 4720;

inline unsigned degree(std::uint64_t polynomial) {  // of one that is not 0
  return 63 - static_cast<unsigned>(__builtin_clzll(polynomial));
}

inline std::uint64_t product(std::uint64_t a, std::uint64_t b) {  // of degree 63 at most
  std::uint64_t sum = 0;
  for (; b != 0; b >>= 1, a <<= 1)
    sum ^= (b & 1) != 0 ? a : 0;
  return sum;
}

inline std::uint64_t remainder(std::uint64_t a, std::uint64_t modulus) {
  while (a != 0 && degree(a) >= degree(modulus))
    a ^= modulus << (degree(a) - degree(modulus));
  return a;
}

// Whether a polynomial of degree 1 or more is irreducible: it must have no factor with t^(2^k) - t,
// the product of all irreducible polynomials whose degree divides k, for any k up to half of its
// degree (Ben-Or, FOCS 1981).
inline bool is_irreducible(std::uint32_t polynomial) {
  if (polynomial < 2)
    return false;
  constexpr std::uint64_t t = 2;
  std::uint64_t power = t;
  for (unsigned k = 1; 2 * k <= degree(polynomial); ++k) {
    power = remainder(product(power, power), polynomial);
    std::uint64_t a = polynomial, b = power ^ t;
    while (b != 0) {
      const std::uint64_t rest = remainder(a, b);
      a = b;
      b = rest;
    }
    if (a != 1)
      return false;
  }
  return true;
}

// v_1, ..., v_32 from an irreducible polynomial p of degree e. Bit number q e + u (0 <= u < e) from
// the top of v_(r+1) is term r + u of a linear recurring sequence that begins with q e terms 0; its
// characteristic polynomial is p^(q+1), and the terms up to the order of the recurrence that are
// still free are 1, as in the algorithm's program.
//
// Where 32 is no multiple of e, the last power has a degree above 32, and its leading term is left
// out: so does the implementation in general use, Boost.Random's, and words are to be compared.
// Niederreiter's bound on the quality parameter t does not see it: a net of 2^m points, m <= 32,
// uses at most m - (e - 1) bits of a coordinate, and those end before the last power begins.
inline void direct(std::uint32_t polynomial, std::uint32_t v[32]) {
  const unsigned e = degree(polynomial);
  for (unsigned r = 0; r < 32; ++r)
    v[r] = 0;
  std::uint64_t power = 1;
  for (unsigned first = 0; first < 32; first += e) {
    power = product(power, polynomial);
    if (first + e > 32)
      power ^= std::uint64_t{1} << (first + e);
    const unsigned order = degree(power);
    const std::uint64_t taps = power ^ std::uint64_t{1} << order;
    std::uint64_t terms = 0;  // bit i is term i
    for (unsigned i = first; i < 32 + e; ++i) {
      const bool term = i < order || __builtin_parityll(terms >> (i - order) & taps) != 0;
      terms |= std::uint64_t{term} << i;
    }
    for (unsigned u = 0; u < e && first + u < 32; ++u)
      for (unsigned r = 0; r < 32; ++r)
        v[r] |= static_cast<std::uint32_t>(terms >> (r + u) & 1) << (31 - first - u);
  }
}

}  // namespace tarn::statistics::niederreiter
