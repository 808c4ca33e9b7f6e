// SPDX-License-Identifier: Apache-2.0
// Generators whose state is a window of words, written from the papers as plainly as can be, one
// word at a time; the suites hold the library to them. They share no code with the library.
//
// A generator is a rule: `order`, next(window) = the word that follows the window of `order` words
// at this address, output(word) = what is delivered of it.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace tarn_test {

// Mersenne twisters (Matsumoto and Nishimura, TOMACS 1998, section 2; shifts and masks of Table II
// there, and of dynamic creation, MCQMC 1998).
template <unsigned Order, unsigned Middle, unsigned LowerBits, unsigned FirstShift>
struct twister_rule {
  static constexpr unsigned order = Order;
  std::uint32_t a, b, c;

  std::uint32_t next(const std::uint32_t* x) const {
    const std::uint32_t lower = (1u << LowerBits) - 1;
    const std::uint32_t y = (x[0] & ~lower) + (x[1] & lower);
    return x[Middle] ^ y / 2 ^ (y % 2 != 0 ? a : 0);
  }
  std::uint32_t output(std::uint32_t z) const {
    z ^= z >> FirstShift;
    z ^= (z << 7) & b;
    z ^= (z << 15) & c;
    return z ^ z >> 18;
  }
};

using mt2203_rule = twister_rule<69, 34, 5, 12>;

struct mt19937_rule : twister_rule<624, 397, 31, 11> {
  mt19937_rule() : twister_rule{0x9908B0DF, 0x9D2C5680, 0xEFC60000} {}
};

// Kirkpatrick and Stoll, Journal of Computational Physics 40, 1981.
struct r250_rule {
  static constexpr unsigned order = 250;
  std::uint32_t next(const std::uint32_t* x) const { return x[250 - 103] ^ x[250 - 250]; }
  std::uint32_t output(std::uint32_t x) const { return x; }
};

// The sequence x(0), x(1), ... of a rule from its first `order` words on.
template <class Rule>
class sequence {
 public:
  explicit sequence(std::vector<std::uint32_t> first, const Rule& rule = Rule{})
      : rule_(rule), x_(std::move(first)) {}

  std::uint32_t word(std::size_t i) {
    while (x_.size() <= i)
      x_.push_back(rule_.next(&x_[x_.size() - Rule::order]));
    return x_[i];
  }
  std::uint32_t output(std::size_t i) { return rule_.output(word(i)); }

 private:
  Rule rule_;
  std::vector<std::uint32_t> x_;
};

// The two initialisations of MT19937 of 2002 for n words.
inline std::vector<std::uint32_t> words_from_seed(std::size_t n, std::uint32_t seed) {
  std::vector<std::uint32_t> x{seed};
  while (x.size() < n)
    x.push_back(1812433253u * (x.back() ^ x.back() >> 30) + static_cast<std::uint32_t>(x.size()));
  return x;
}

inline std::vector<std::uint32_t> words_from_key(std::size_t n,
                                                 const std::vector<std::uint32_t>& key) {
  std::vector<std::uint32_t> x = words_from_seed(n, 19650218);
  const std::size_t first_pass = std::max(n, key.size());
  // Step s changes word 1 + s mod (n - 1); the word before word 1 is the last one, or at the very
  // first step word 0.
  for (std::size_t s = 0; s < first_pass + n - 1; ++s) {
    const std::size_t i = 1 + s % (n - 1);
    const std::uint32_t before = s == 0 ? x[0] : x[i == 1 ? n - 1 : i - 1];
    const std::uint32_t folded = before ^ before >> 30;
    const std::size_t j = s % key.size();
    if (s < first_pass)
      x[i] = (x[i] ^ folded * 1664525u) + key[j] + static_cast<std::uint32_t>(j);
    else
      x[i] = (x[i] ^ folded * 1566083941u) - static_cast<std::uint32_t>(i);
  }
  x[0] = 0x80000000;
  return x;
}

}  // namespace tarn_test
