// SPDX-License-Identifier: Apache-2.0
// Polynomials over GF(2) in one variable t, and arithmetic modulo a polynomial of degree 2203.
// Bit i of word j is the coefficient of t^(64 j + i).
#pragma once

#include <array>
#include <cstdint>

namespace tarn::mt2203::gf2 {

inline constexpr int degree = 2203;  // of a modulus
inline constexpr int words = (degree + 64) / 64;
inline constexpr int product_words = 2 * words;

// A polynomial of degree below 2240. The last word is always 0: words may be read in pairs.
struct polynomial {
  std::array<std::uint64_t, words + 1> word{};
};
static_assert(words % 2 == 1);

using product = std::array<std::uint64_t, product_words>;

bool operator==(const polynomial& x, const polynomial& y);
polynomial operator+(const polynomial& x, const polynomial& y);
polynomial monomial(int exponent);

// The low words of x * y, for products that are of degree below 2240.
polynomial short_multiply(const polynomial& x, const polynomial& y);

// gcd(x, y) is a constant; x(0) = 1.
bool coprime(polynomial x, polynomial y);

// Arithmetic modulo f of degree 2203, by Barrett's reduction.
class modulus {
 public:
  explicit modulus(const polynomial& f);

  polynomial multiply(const polynomial& x, const polynomial& y) const;
  polynomial square(const polynomial& x) const;

 private:
  polynomial reduce(const product& c) const;

  // F = f * t^37 is of degree 2240, which is a whole number of words. Both lack their leading term.
  polynomial low_;         // F
  polynomial reciprocal_;  // t^4480 / F, rounded down
};

}  // namespace tarn::mt2203::gf2
