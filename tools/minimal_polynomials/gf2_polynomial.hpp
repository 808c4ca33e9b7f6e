// SPDX-License-Identifier: Apache-2.0
// Polynomials and bit sequences over GF(2), and the shortest recurrence of a sequence (Massey:
// Shift-Register Synthesis and BCH Decoding, IEEE Transactions on Information Theory 15, 1969).
#pragma once

#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace gf2 {

// Bits from the lowest one of the first word on: coefficients of a polynomial, or a sequence.
class bits {
 public:
  // All zero; the number is rounded up to whole words.
  explicit bits(std::size_t size) : words_((size + 63) / 64) {}

  bool operator[](std::size_t i) const { return (words_[i / 64] >> i % 64 & 1) != 0; }
  void set(std::size_t i) { words_[i / 64] |= std::uint64_t{1} << i % 64; }
  const std::vector<std::uint64_t>& words() const { return words_; }

  bool any() const {
    std::uint64_t all = 0;
    for (const std::uint64_t word : words_)
      all |= word;
    return all != 0;
  }

  // Adds t^shift times the other one; what goes past the end is lost.
  void add_shifted(const bits& other, std::size_t shift) {
    const std::size_t whole = shift / 64, rest = shift % 64;
    for (std::size_t i = 0; i < other.words_.size() && i + whole < words_.size(); ++i) {
      words_[i + whole] ^= other.words_[i] << rest;
      if (rest != 0 && i + whole + 1 < words_.size())
        words_[i + whole + 1] ^= other.words_[i] >> (64 - rest);
    }
  }

  // Adds the other one from its bit `first` on, as many bits as there are words for here.
  void add_from(const bits& other, std::size_t first) {
    const std::size_t whole = first / 64, rest = first % 64;
    for (std::size_t i = 0; i < words_.size() && i + whole < other.words_.size(); ++i) {
      words_[i] ^= other.words_[i + whole] >> rest;
      if (rest != 0 && i + whole + 1 < other.words_.size())
        words_[i] ^= other.words_[i + whole + 1] << (64 - rest);
    }
  }

  // The same bits one place up, and a new lowest one.
  void push_lowest(bool bit) {
    std::uint64_t carry = bit ? 1 : 0;
    for (std::uint64_t& word : words_)
      carry = std::exchange(word, word << 1 | carry) >> 63;
  }

  // The sum of the products of bits with equal index.
  bool dot(const bits& other) const {
    std::uint64_t sum = 0;
    for (std::size_t i = 0; i < words_.size() && i < other.words_.size(); ++i)
      sum ^= words_[i] & other.words_[i];
    return __builtin_parityll(sum) != 0;
  }

 private:
  std::vector<std::uint64_t> words_;
};

struct polynomial {
  std::size_t degree;
  bits coefficients;
};

inline polynomial operator*(const polynomial& a, const polynomial& b) {
  polynomial product{a.degree + b.degree, bits(a.degree + b.degree + 1)};
  for (std::size_t i = 0; i <= b.degree; ++i) {
    if (b.coefficients[i])
      product.coefficients.add_shifted(a.coefficients, i);
  }
  return product;
}

// The polynomial of least degree that annihilates the first n bits, which must be at least twice
// as many as that degree. A bit that the recurrence so far fails to foretell mends it with the one
// that failed before the last change of length.
inline polynomial shortest_recurrence(const bits& sequence, std::size_t n) {
  bits connection(n), before(n), latest(n);  // latest: the sequence read backwards
  connection.set(0);
  before.set(0);
  std::size_t length = 0, since = 1;
  for (std::size_t i = 0; i < n; ++i, ++since) {
    latest.push_lowest(sequence[i]);
    if (!connection.dot(latest))
      continue;
    const bits now = connection;
    connection.add_shifted(before, since);
    if (2 * length <= i) {
      length = i + 1 - length;
      before = now;
      since = 0;
    }
  }
  polynomial reversed{length, bits(length + 1)};
  for (std::size_t i = 0; i <= length; ++i) {
    if (connection[length - i])
      reversed.coefficients.set(i);
  }
  return reversed;
}

}  // namespace gf2
