// SPDX-License-Identifier: Apache-2.0
// See gf2_multiply.hpp. Both ways compute only the words that are asked for, since a reduction
// needs just half of each product.
#include "gf2_multiply.hpp"

#include <algorithm>
#include <immintrin.h>

namespace tarn::mt2203::gf2 {

namespace {

// Word by word of the result: the carry-less products of one column have a common place, so they
// are summed before their two halves are split. `reversed` lets a column be read forwards in both
// factors, two words at a time; the padding words are 0.
__attribute__((target("pclmul"))) void carryless_multiply(const polynomial& x, const polynomial& y,
                                                          int first, int last, product& out) {
  std::uint64_t reversed[words + 1];
  std::reverse_copy(y.word.begin(), y.word.begin() + words, reversed);
  reversed[words] = 0;
  std::uint64_t high = 0;  // of the column before
  for (int column = std::max(first - 1, 0); column < last; ++column) {
    const int begin = std::max(column - (words - 1), 0);
    const int end = std::min(column, words - 1) + 1;
    __m128i even = _mm_setzero_si128(), odd = _mm_setzero_si128();
    for (int i = begin; i < end; i += 2) {
      const __m128i p = _mm_loadu_si128(reinterpret_cast<const __m128i*>(x.word.data() + i));
      const __m128i q =
          _mm_loadu_si128(reinterpret_cast<const __m128i*>(reversed + (words - 1 - column + i)));
      even = _mm_xor_si128(even, _mm_clmulepi64_si128(p, q, 0x00));
      odd = _mm_xor_si128(odd, _mm_clmulepi64_si128(p, q, 0x11));
    }
    const __m128i sum = _mm_xor_si128(even, odd);
    out[static_cast<std::size_t>(column)] =
        high ^ static_cast<std::uint64_t>(_mm_cvtsi128_si64(sum));
    high = static_cast<std::uint64_t>(_mm_cvtsi128_si64(_mm_unpackhi_epi64(sum, sum)));
  }
}

__attribute__((target("pclmul"))) void carryless_square(const polynomial& x, product& out) {
  for (std::size_t i = 0; i < words; ++i) {
    const __m128i word = _mm_cvtsi64_si128(static_cast<long long>(x.word[i]));
    _mm_storeu_si128(reinterpret_cast<__m128i*>(out.data() + 2 * i),
                     _mm_clmulepi64_si128(word, word, 0x00));
  }
}

// Four bits of each word of x at a time, the highest first (Lopez and Dahab, INDOCRYPT 2000).
// A word of the result takes in at most 60 bits from below it, so the one word before `first` is
// enough to make `first` right.
void portable_multiply(const polynomial& x, const polynomial& y, int first, int last,
                       product& out) {
  std::array<polynomial, 16> multiple{};  // of y, which is shorter than its 36 words by 64 bits
  for (std::size_t u = 1; u < multiple.size(); ++u)
    for (std::size_t j = 0; j <= words; ++j) {
      const polynomial& half = multiple[u / 2];
      multiple[u].word[j] =
          half.word[j] << 1 ^ (j > 0 ? half.word[j - 1] >> 63 : 0) ^ (u % 2 == 1 ? y.word[j] : 0);
    }
  const int begin = std::max(first - 1, 0);
  std::fill(out.begin() + begin, out.begin() + last, 0);
  for (int shift = 60; shift >= 0; shift -= 4) {
    for (int i = 0; i < words; ++i) {
      const auto digit =
          static_cast<std::size_t>(x.word[static_cast<std::size_t>(i)] >> shift) & 15;
      const std::uint64_t* const from = multiple[digit].word.data();
      std::uint64_t* const to = out.data() + i;
      for (int j = std::max(begin - i, 0), end = std::min(last - i, words + 1); j < end; ++j)
        to[j] ^= from[j];
    }
    if (shift == 0)
      break;
    for (auto j = static_cast<std::size_t>(last - 1); j > static_cast<std::size_t>(begin); --j)
      out[j] = out[j] << 4 ^ out[j - 1] >> 60;
    out[static_cast<std::size_t>(begin)] <<= 4;
  }
}

// Puts a 0 above each of the 32 bits.
std::uint64_t spread(std::uint64_t half) {
  half = (half | half << 16) & 0x0000FFFF0000FFFF;
  half = (half | half << 8) & 0x00FF00FF00FF00FF;
  half = (half | half << 4) & 0x0F0F0F0F0F0F0F0F;
  half = (half | half << 2) & 0x3333333333333333;
  return (half | half << 1) & 0x5555555555555555;
}

void portable_square(const polynomial& x, product& out) {
  for (std::size_t i = 0; i < words; ++i) {
    out[2 * i] = spread(x.word[i] & 0xFFFFFFFF);
    out[2 * i + 1] = spread(x.word[i] >> 32);
  }
}

bool portable_forced = false;

}  // namespace

const multiplier carryless_multiplier{carryless_multiply, carryless_square};
const multiplier portable_multiplier{portable_multiply, portable_square};

bool carryless_available() {
  return __builtin_cpu_supports("pclmul") != 0;
}

const multiplier& chosen_multiplier() {
  static const bool carryless = carryless_available();
  return carryless && !portable_forced ? carryless_multiplier : portable_multiplier;
}

void force_portable_multiplier() {
  portable_forced = true;
}

}  // namespace tarn::mt2203::gf2
