// SPDX-License-Identifier: Apache-2.0
// Words far ahead in a linear recurrence over GF(2), by plain polynomial arithmetic, one bit at a
// time: the minimal polynomial by the algorithm of Berlekamp and Massey (Massey, IEEE Transactions
// on Information Theory 15, 1969), powers of t by squaring.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace tarn_test {

class polynomial {
 public:
  explicit polynomial(std::size_t bits) : words_((bits + 63) / 64) {}
  bool get(std::size_t i) const { return (words_[i / 64] >> i % 64 & 1) != 0; }
  void flip(std::size_t i) { words_[i / 64] ^= std::uint64_t{1} << i % 64; }

  // Adds t^shift * other; both have room for the result.
  void add(const polynomial& other, std::size_t shift) {
    const std::size_t whole = shift / 64, part = shift % 64;
    for (std::size_t i = 0; i + whole < words_.size(); ++i) {
      std::uint64_t w = i < other.words_.size() ? other.words_[i] << part : 0;
      if (part != 0 && i > 0 && i - 1 < other.words_.size())
        w |= other.words_[i - 1] >> (64 - part);
      words_[i + whole] ^= w;
    }
  }
  bool odd_overlap(const polynomial& other) const {
    std::uint64_t sum = 0;
    for (std::size_t i = 0; i < words_.size(); ++i)
      sum ^= words_[i] & other.words_[i];
    return __builtin_parityll(sum) != 0;
  }
  void shift_up() {
    for (std::size_t i = words_.size(); i-- > 0;)
      words_[i] = words_[i] << 1 | (i > 0 ? words_[i - 1] >> 63 : 0);
  }

 private:
  std::vector<std::uint64_t> words_;
};

class jump_model {
 public:
  // bit(i), i < 2 * max_degree, is a bit of the sequence whose minimal polynomial has full degree.
  template <class Bit>
  jump_model(std::size_t max_degree, const Bit& bit) : modulus_(max_degree + 1) {
    const std::size_t room = max_degree + 2;
    polynomial connection(room), previous(room), recent(room);
    connection.flip(0);
    previous.flip(0);
    std::size_t since = 1;
    for (std::size_t n = 0; n < 2 * max_degree; ++n, ++since) {
      recent.shift_up();  // bit i is the sequence's bit n - i
      if (bit(n))
        recent.flip(0);
      if (!connection.odd_overlap(recent))
        continue;
      const polynomial before = connection;
      connection.add(previous, since);
      if (2 * degree_ <= n) {
        degree_ = n + 1 - degree_;
        previous = before;
        since = 0;
      }
    }
    for (std::size_t i = 0; i <= degree_; ++i) {  // the reciprocal
      if (connection.get(i))
        modulus_.flip(degree_ - i);
    }
  }

  std::size_t degree() const { return degree_; }

  // Exponents of the terms of t^distance modulo the minimal polynomial.
  std::vector<std::size_t> terms(std::uint64_t distance) const {
    polynomial power(2 * degree_);
    power.flip(0);
    for (int digit = 63; digit >= 0; --digit) {
      polynomial square(2 * degree_);
      for (std::size_t i = 0; i < degree_; ++i) {
        if (power.get(i))
          square.flip(2 * i);
      }
      if ((distance >> digit & 1) != 0)
        square.shift_up();
      for (std::size_t i = 2 * degree_; i-- > degree_;) {
        if (square.get(i))
          square.add(modulus_, i - degree_);
      }
      power = square;
    }
    std::vector<std::size_t> exponents;
    for (std::size_t i = 0; i < degree_; ++i) {
      if (power.get(i))
        exponents.push_back(i);
    }
    return exponents;
  }

 private:
  std::size_t degree_ = 0;
  polynomial modulus_;
};

}  // namespace tarn_test
