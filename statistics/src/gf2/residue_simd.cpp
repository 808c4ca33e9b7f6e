// SPDX-License-Identifier: Apache-2.0
// The kernels of the jump with SIMD: carry-less products of 64 bits, and sums of long vectors.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "gf2/residue_simd.cpp"
#include <algorithm>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "gf2/residue.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::gf2::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Two words, and what the products below need of them.
#if HWY_TARGET == HWY_SCALAR || HWY_TARGET == HWY_SSSE3

// Targets without a carry-less multiply. (Highway's stand-in for it, as of 1.0.3, multiplies
// numbers with holes of three bits; sixteen ones in a column overflow these, and the product is
// wrong.)
struct block {
  std::uint64_t low, high;
};

HWY_INLINE block zero() {
  return {0, 0};
}
HWY_INLINE block load(const std::uint64_t* from) {
  return {from[0], from[1]};
}
HWY_INLINE void store(block a, std::uint64_t* to) {
  to[0] = a.low;
  to[1] = a.high;
}
HWY_INLINE block add(block a, block b) {
  return {a.low ^ b.low, a.high ^ b.high};
}
HWY_INLINE block exchange_halves(block a) {
  return {a.high, a.low};
}
HWY_INLINE block low_half_up(block a) {
  return {0, a.low};
}
HWY_INLINE block high_half_down(block a) {
  return {a.high, 0};
}
HWY_INLINE block double_if(block a, int odd) {
  return {a.low << odd, a.high << odd};
}

// The product by ordinary multiplication: with four zeros after each bit that is used, no sum of
// the at most 13 products in a column reaches the next column that is used.
HWY_INLINE block product(std::uint64_t a, std::uint64_t b) {
  __extension__ using wide = unsigned __int128;
  constexpr std::uint64_t every_fifth = 0x1084210842108421;
  constexpr wide used = wide{0x2108421084210842} << 64 | every_fifth;
  std::uint64_t part_a[5], part_b[5];
  for (int i = 0; i < 5; ++i) {
    part_a[i] = a & every_fifth << i;
    part_b[i] = b & every_fifth << i;
  }
  wide sum = 0;
  for (int column = 0; column < 5; ++column) {
    wide all = 0;
    for (int i = 0; i < 5; ++i)
      all ^= wide{part_a[i]} * part_b[(column + 5 - i) % 5];
    sum |= all & used << column;
  }
  return {static_cast<std::uint64_t>(sum), static_cast<std::uint64_t>(sum >> 64)};
}
HWY_INLINE block low_product(block a, block b) {
  return product(a.low, b.low);
}
HWY_INLINE block high_product(block a, block b) {
  return product(a.high, b.high);
}

#else

using d64 = hn::FixedTag<std::uint64_t, 2>;
using block = hn::Vec<d64>;

HWY_INLINE block zero() {
  return hn::Zero(d64());
}
HWY_INLINE block load(const std::uint64_t* from) {
  return hn::LoadU(d64(), from);
}
HWY_INLINE void store(block a, std::uint64_t* to) {
  hn::StoreU(a, d64(), to);
}
HWY_INLINE block add(block a, block b) {
  return hn::Xor(a, b);
}
HWY_INLINE block exchange_halves(block a) {
  return hn::Shuffle01(a);
}
HWY_INLINE block low_half_up(block a) {
  return hn::ShiftLeftBytes<8>(d64(), a);
}
HWY_INLINE block high_half_down(block a) {
  return hn::ShiftRightBytes<8>(d64(), a);
}
HWY_INLINE block double_if(block a, int odd) {
  return hn::ShiftLeftSame(a, odd);
}
HWY_INLINE block low_product(block a, block b) {
  return hn::CLMulLower(a, b);
}
HWY_INLINE block high_product(block a, block b) {
  return hn::CLMulUpper(a, b);
}

#endif

// The sum of both halves, in both halves.
HWY_INLINE block folded(block a) {
  return add(a, exchange_halves(a));
}

// Blocks of low that are not zero.
constexpr std::size_t low_blocks = residue_blocks - 1;

// Column c of the products of low with the blocks of n from block residue_blocks on: adds it to
// n[c] and n[c + 1]. A product of two blocks is three of words (Karatsuba).
HWY_INLINE void add_column(const std::uint64_t* low, const std::uint64_t* low_folded,
                           const std::uint64_t* n_folded, std::size_t c, std::uint64_t* n) {
  const std::size_t first = std::max(c + 2, residue_blocks);
  const std::size_t last = std::min(c + residue_blocks, 2 * residue_blocks - 1);
  block lower = zero(), middle = zero(), upper = zero();
  for (std::size_t k = last; k >= first; --k) {
    const std::size_t j = c + residue_blocks - k;
    const block a = load(n + 2 * k), b = load(low + 2 * j);
    lower = add(lower, low_product(a, b));
    upper = add(upper, high_product(a, b));
    middle = add(middle, low_product(load(n_folded + 2 * k), load(low_folded + 2 * j)));
  }
  middle = add(middle, add(lower, upper));
  store(add(load(n + 2 * c), add(lower, low_half_up(middle))), n + 2 * c);
  store(add(load(n + 2 * c + 2), add(upper, high_half_down(middle))), n + 2 * c + 2);
}

void square(const std::uint64_t* low, int odd, std::uint64_t* x) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  std::uint64_t n[2 * residue_words], n_folded[2 * residue_words], low_folded[residue_words];

  // A square has bits at even places only, so that its double stays within each word.
  for (std::size_t i = 0; i < residue_blocks; ++i) {
    const block a = load(x + 2 * i);
    store(double_if(low_product(a, a), odd), n + 4 * i);
    store(double_if(high_product(a, a), odd), n + 4 * i + 2);
    store(folded(load(low + 2 * i)), low_folded + 2 * i);
  }
  // t^19968 is replaced by low, from above. With two words of low zero, column c takes blocks from
  // n[c + 2] on, and these are final when its turn comes.
  for (std::size_t c = 2 * residue_blocks - 2; c-- > 0;) {
    if (c + 2 >= residue_blocks)
      store(folded(load(n + 2 * (c + 2))), n_folded + 2 * (c + 2));
    add_column(low, low_folded, n_folded, c, n);
  }
  std::copy_n(n, residue_words, x);
}

using d32 = hn::ScalableTag<std::uint32_t>;

// The sum of `Vectors` vectors in each window.
template <int Vectors>
HWY_INLINE void sum_part(const std::uint32_t* HWY_RESTRICT words,
                         const std::uint32_t* HWY_RESTRICT first, std::size_t windows,
                         std::uint32_t* HWY_RESTRICT out) {
  const d32 d;
  hn::Vec<d32> sum[Vectors];
  for (int v = 0; v < Vectors; ++v)
    sum[v] = hn::Zero(d);
  for (std::size_t i = 0; i < windows; ++i) {
    const std::uint32_t* from = words + first[i];
    for (int v = 0; v < Vectors; ++v)
      sum[v] = hn::Xor(sum[v], hn::LoadU(d, from + static_cast<std::size_t>(v) * hn::Lanes(d)));
  }
  for (int v = 0; v < Vectors; ++v)
    hn::StoreU(sum[v], d, out + static_cast<std::size_t>(v) * hn::Lanes(d));
}

void sum_windows(const std::uint32_t* words, const std::uint32_t* first, std::size_t windows,
                 std::size_t count, std::uint32_t* out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  constexpr int in_flight = 8;  // vectors that stay in registers
  const std::size_t vector = hn::Lanes(d32());
  std::size_t j = 0;
  for (; count - j >= in_flight * vector; j += in_flight * vector)
    sum_part<in_flight>(words + j, first, windows, out + j);
  for (; count - j >= vector; j += vector)
    sum_part<1>(words + j, first, windows, out + j);
  for (; j < count; ++j) {
    out[j] = 0;
    for (std::size_t i = 0; i < windows; ++i)
      out[j] ^= words[first[i] + j];
  }
}

}  // namespace tarn::statistics::gf2::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::gf2 {

HWY_EXPORT(square);
HWY_EXPORT(sum_windows);

void square(const std::uint64_t* low, int odd, std::uint64_t* x) {
  TARN_SIMD_CALL(square)(low, odd, x);
}

void sum_windows(const std::uint32_t* words, const std::uint32_t* first, std::size_t windows,
                 std::size_t count, std::uint32_t* out) {
  TARN_SIMD_CALL(sum_windows)(words, first, windows, count, out);
}

}  // namespace tarn::statistics::gf2
#endif
