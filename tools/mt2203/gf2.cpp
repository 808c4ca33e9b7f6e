// SPDX-License-Identifier: Apache-2.0
// See gf2.hpp.
#include "gf2.hpp"

#include <algorithm>

#include "gf2_multiply.hpp"

namespace tarn::mt2203::gf2 {

namespace {

constexpr int padding = 64 * words - degree;  // t^padding takes a modulus to a whole word

polynomial part(const product& c, int first) {
  polynomial result;
  std::copy_n(c.begin() + first, words, result.word.begin());
  return result;
}

// Words as one number, shifted by fewer than 64 bits.
template <class Words>
void shift_up(Words& w, std::size_t count, int bits) {
  for (std::size_t i = count - 1; i > 0; --i)
    w[i] = w[i] << bits ^ w[i - 1] >> (64 - bits);
  w[0] <<= bits;
}

template <class Words>
void shift_down(Words& w, std::size_t count, int bits) {
  for (std::size_t i = 0; i + 1 < count; ++i)
    w[i] = w[i] >> bits ^ w[i + 1] << (64 - bits);
  w[count - 1] >>= bits;
}

bool is_zero(const polynomial& x) {
  return x == polynomial{};
}

// Divides by the highest power of t that it can; x is not 0.
void make_odd(polynomial& x) {
  while (x.word[0] == 0)
    std::rotate(x.word.begin(), x.word.begin() + 1, x.word.end());
  if (const int zeros = __builtin_ctzll(x.word[0]); zeros > 0)
    shift_down(x.word, words, zeros);
}

}  // namespace

bool operator==(const polynomial& x, const polynomial& y) {
  return x.word == y.word;
}

polynomial operator+(const polynomial& x, const polynomial& y) {
  polynomial sum;
  for (std::size_t i = 0; i < words; ++i)
    sum.word[i] = x.word[i] ^ y.word[i];
  return sum;
}

polynomial monomial(int exponent) {
  polynomial result;
  result.word[static_cast<std::size_t>(exponent / 64)] = std::uint64_t{1} << exponent % 64;
  return result;
}

polynomial short_multiply(const polynomial& x, const polynomial& y) {
  product c;
  chosen_multiplier().multiply(x, y, 0, words, c);
  return part(c, 0);
}

// The binary algorithm: both are odd (not divisible by t) when they meet, so their sum is even.
bool coprime(polynomial x, polynomial y) {
  while (!is_zero(y)) {
    make_odd(y);
    if (std::lexicographical_compare(y.word.rbegin(), y.word.rend(), x.word.rbegin(),
                                     x.word.rend()))
      std::swap(x, y);
    y = x + y;
  }
  return x == monomial(0);
}

// The reciprocal by long division: t^4480 = F t^2240 + low_ t^2240, and so on with the remainder.
modulus::modulus(const polynomial& f) : low_(f) {
  shift_up(low_.word, words, padding);  // the leading term leaves at the top
  polynomial remainder = low_;
  for (int i = 64 * words - 1; i >= 0; --i) {
    const bool divides = remainder.word[words - 1] >> 63 != 0;
    shift_up(remainder.word, words, 1);
    if (divides) {
      remainder = remainder + low_;
      reciprocal_ = reciprocal_ + monomial(i);
    }
  }
}

polynomial modulus::multiply(const polynomial& x, const polynomial& y) const {
  product c;
  chosen_multiplier().multiply(x, y, 0, product_words, c);
  return reduce(c);
}

polynomial modulus::square(const polynomial& x) const {
  product c;
  chosen_multiplier().square(x, c);
  return reduce(c);
}

// c t^37 mod F = (c mod f) t^37. The quotient needs only the upper half of a product, the
// remainder only the lower half of another.
polynomial modulus::reduce(const product& c) const {
  product shifted = c;
  shift_up(shifted, product_words, padding);
  const polynomial high = part(shifted, words);
  product p;
  chosen_multiplier().multiply(high, reciprocal_, words, product_words, p);
  const polynomial quotient = high + part(p, words);
  chosen_multiplier().multiply(quotient, low_, 0, words, p);
  polynomial remainder = part(shifted, 0) + part(p, 0);
  shift_down(remainder.word, words, padding);
  return remainder;
}

}  // namespace tarn::mt2203::gf2
