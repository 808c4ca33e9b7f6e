// SPDX-License-Identifier: Apache-2.0
// See sieve.hpp. A polynomial of a small degree is the bits of one number here.
#include "sieve.hpp"

#include <algorithm>

#include "characteristic.hpp"
#include "twister.hpp"

namespace tarn::mt2203 {

namespace {

using small = std::uint32_t;

int degree_of(small x) {
  return 31 - __builtin_clz(x);
}

small remainder(small x, small g) {
  while (x != 0 && degree_of(x) >= degree_of(g))
    x ^= g << (degree_of(x) - degree_of(g));
  return x;
}

small multiply(small x, small y, small g) {
  small result = 0;
  for (int i = small_factor_sieve::highest_degree - 1; i >= 0; --i) {
    result = remainder(result << 1, g);
    if ((y >> i & 1) != 0)
      result ^= x;
  }
  return result;
}

small power_of_t(int exponent, small g) {
  small result = 1;
  for (int i = 0; i < exponent; ++i)
    result = remainder(result << 1, g);
  return result;
}

// Those of degree 2..14 in rising order, by trial division. Those of degree 1 can be left out, and
// with them everything that they divide: bit 0 and an odd number of terms are required.
std::vector<small> irreducible_polynomials() {
  std::vector<small> found;
  for (small x = 7; x < small{2} << small_factor_sieve::highest_degree; x += 2) {
    const auto divides = [x](small g) { return remainder(x, g) == 0; };
    if (__builtin_parity(x) == 1 && std::none_of(found.begin(), found.end(), divides))
      found.push_back(x);
  }
  return found;
}

}  // namespace

small_factor_sieve::small_factor_sieve() {
  constexpr twister_shape s = mt2203_shape;
  for (const small g : irreducible_polynomials()) {
    const small p = power_of_t(s.words, g) ^ power_of_t(s.middle, g);
    const small q = power_of_t(s.words - 1, g) ^ power_of_t(s.middle - 1, g);
    const auto terms =
        characteristic_terms(small{1}, p, q, [g](small x, small y) { return multiply(x, y, g); });
    remainders table{};
    for (std::size_t byte = 0; byte < 4; ++byte)
      for (std::size_t value = 0; value < 256; ++value) {
        small sum = byte == 0 ? terms[32] : 0;
        for (std::size_t bit = 0; bit < 8; ++bit)
          if ((value >> bit & 1) != 0)
            sum ^= terms[8 * byte + bit];
        table[byte][value] = static_cast<std::uint16_t>(sum);
      }
    factors_.push_back(table);
  }
}

bool small_factor_sieve::passes(std::uint32_t a) const {
  return std::none_of(factors_.begin(), factors_.end(), [a](const remainders& r) {
    return (r[0][a & 255] ^ r[1][a >> 8 & 255] ^ r[2][a >> 16 & 255] ^ r[3][a >> 24]) == 0;
  });
}

}  // namespace tarn::mt2203
