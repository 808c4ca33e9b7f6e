// SPDX-License-Identifier: Apache-2.0
// Massey's algorithm on 64 bits at once.
#include "linear_complexity.hpp"

#include <algorithm>
#include <cmath>

namespace tarn::quality {

namespace {

// Bits in words; bit i of the polynomial is the coefficient of t^i.
using bit_row = std::vector<std::uint64_t>;

// a ^= b t^shift, of b its first `words` words.
void add_shifted(bit_row& a, const bit_row& b, std::size_t shift, std::size_t words) {
  const std::size_t whole = shift / 64;
  const unsigned rest = static_cast<unsigned>(shift % 64);
  const std::size_t end = std::min(a.size() - whole, words + 1);
  std::uint64_t carry = 0;
  for (std::size_t i = 0; i < end; ++i) {
    const std::uint64_t word = i < words ? b[i] : 0;
    a[i + whole] ^= word << rest | carry;
    carry = rest == 0 ? 0 : word >> (64 - rest);
  }
}

// Whether the bits of a and b have an odd number of ones in common, over `words` words.
bool odd_product(const bit_row& a, const bit_row& b, std::size_t words) {
  std::uint64_t sum = 0;
  for (std::size_t i = 0; i < words; ++i)
    sum ^= a[i] & b[i];
  return __builtin_parityll(sum) != 0;
}

// Puts a bit in front of the row: bit i becomes bit i + 1.
void push_front(bit_row& row, bool bit, std::size_t words) {
  std::uint64_t carry = bit ? 1 : 0;
  for (std::size_t i = 0; i < words; ++i) {
    const std::uint64_t out = row[i] >> 63;
    row[i] = row[i] << 1 | carry;
    carry = out;
  }
}

}  // namespace

std::size_t linear_complexity(const std::vector<std::uint8_t>& bits) {
  const std::size_t words = bits.size() / 64 + 2;
  bit_row connection(words), before(words), seen(words);
  connection[0] = before[0] = 1;
  std::size_t length = 0;
  std::size_t since = 1;  // bits since `before` was the connection polynomial
  for (std::size_t i = 0; i < bits.size(); ++i) {
    // Neither polynomial has a degree above i + 1 - length or length: no more words matter.
    const std::size_t used = std::min(words, std::max(length, i + 1 - length) / 64 + 2);
    push_front(seen, bits[i] != 0, std::min(words, i / 64 + 2));
    if (!odd_product(connection, seen, used)) {
      ++since;
    } else if (2 * length <= i) {
      const bit_row kept = connection;
      add_shifted(connection, before, since, used);
      before = kept;
      length = i + 1 - length;
      since = 1;
    } else {
      add_shifted(connection, before, since, used);
      ++since;
    }
  }
  return length;
}

double linear_complexity_chance(std::size_t n, std::size_t length) {
  const auto size = static_cast<double>(n);
  const auto at = static_cast<double>(length);
  if (length == 0)
    return std::exp2(-size) / 2;
  // Both sides of the law are geometric sums: those below `length`, or those above it.
  if (2 * length <= n) {
    const double equal = std::exp2(2 * at - 1 - size);
    const double below = std::exp2(-size) + (std::exp2(2 * at - size) - std::exp2(2 - size)) / 6;
    return below + equal / 2;
  }
  const double equal = std::exp2(size - 2 * at);
  const double above = (std::exp2(size - 2 * at) - std::exp2(-size)) / 3;
  return 1 - above - equal / 2;
}

}  // namespace tarn::quality
