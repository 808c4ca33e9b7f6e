// SPDX-License-Identifier: Apache-2.0
// Runs of Philox4x32-10 blocks with SIMD, one block per 64-bit lane. A counter word stands in the
// low half of its lane; the high half holds leftovers that the even-lane multiply never reads, so
// a round of one vector is two multiplies, two shifts and two three-way exclusive ors.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/philox4x32x10_simd.cpp"
#include <algorithm>
#include <cstring>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/philox4x32x10.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::philox::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET == HWY_SCALAR

void write_blocks(const std::uint32_t key[2], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const std::uint64_t first = ctr[0] | std::uint64_t{ctr[1]} << 32;
  for (std::size_t i = 0; i < count; ++i) {
    const std::uint64_t low = first + i;
    const block b = evaluate(
        {{static_cast<std::uint32_t>(low), static_cast<std::uint32_t>(low >> 32), ctr[2], ctr[3]}},
        key[0], key[1]);
    std::copy_n(b.word, 4, out + 4 * i);
  }
}

#else

using d64 = hn::ScalableTag<std::uint64_t>;
using d32 = hn::Repartition<std::uint32_t, d64>;
using lanes64 = hn::Vec<d64>;
using lanes32 = hn::Vec<d32>;

// Vectors that one step has in flight, to hide the latency of the multiply. Measured: six spill a
// few registers where there are 16, yet beat two by a third there and four by a fifth with 32.
constexpr int in_flight = 6;

// The key of each round in every lane, and the counter's distance from the first of a vector.
struct constants {
  HWY_ALIGN std::uint64_t key[2 * rounds][HWY_MAX_BYTES / 8];
  HWY_ALIGN std::uint64_t distance[HWY_MAX_BYTES / 8];
};

HWY_INLINE void prepare(const std::uint32_t key[2], constants& c) {
  const d64 d;
  std::uint32_t k0 = key[0], k1 = key[1];
  for (int r = 0; r < rounds; ++r) {
    hn::Store(hn::Set(d, k0), d, c.key[2 * r]);
    hn::Store(hn::Set(d, k1), d, c.key[2 * r + 1]);
    k0 += key_step[0];
    k1 += key_step[1];
  }
  // Even lanes hold the first half of the blocks, odd lanes the second: then interleaving within
  // 128 bits gives blocks in order and no word crosses lanes.
  const std::size_t half = hn::Lanes(d) / 2;
  for (std::size_t j = 0; j < half; ++j) {
    c.distance[2 * j] = j;
    c.distance[2 * j + 1] = half + j;
  }
}

// Writes `Vectors` vectors of blocks from the counter (low, c2, c3) on.
template <int Vectors>
HWY_INLINE void write_step(const constants& c, std::uint64_t low, lanes64 c2, lanes64 c3,
                           std::uint32_t* HWY_RESTRICT out) {
  const d64 d;
  const d32 d_word;
  const std::size_t blocks = hn::Lanes(d);
  const lanes32 m0 = hn::Set(d_word, multiplier[0]);
  const lanes32 m1 = hn::Set(d_word, multiplier[1]);

  lanes64 w0[Vectors], w1[Vectors], w2[Vectors], w3[Vectors];
  const lanes64 distance = hn::Load(d, c.distance);
  for (int v = 0; v < Vectors; ++v) {
    w0[v] = hn::Add(hn::Set(d, low + static_cast<std::uint64_t>(v) * blocks), distance);
    w1[v] = hn::ShiftRight<32>(w0[v]);
    w2[v] = c2;
    w3[v] = c3;
  }
  HWY_UNROLL(10)
  for (int r = 0; r < rounds; ++r) {
    const lanes64 k0 = hn::Load(d, c.key[2 * r]);
    const lanes64 k1 = hn::Load(d, c.key[2 * r + 1]);
    for (int v = 0; v < Vectors; ++v) {
      const lanes64 p0 = hn::MulEven(hn::BitCast(d_word, w0[v]), m0);
      const lanes64 p1 = hn::MulEven(hn::BitCast(d_word, w2[v]), m1);
      w0[v] = hn::Xor3(hn::ShiftRight<32>(p1), w1[v], k0);
      w2[v] = hn::Xor3(hn::ShiftRight<32>(p0), w3[v], k1);
      w1[v] = p1;
      w3[v] = p0;
    }
  }
  for (int v = 0; v < Vectors; ++v) {
    const auto pair = [&](lanes64 even, lanes64 odd) {
      return hn::BitCast(
          d, hn::OddEven(hn::BitCast(d_word, hn::ShiftLeft<32>(odd)), hn::BitCast(d_word, even)));
    };
    const lanes64 w01 = pair(w0[v], w1[v]);
    const lanes64 w23 = pair(w2[v], w3[v]);
    std::uint32_t* to = out + 4 * blocks * static_cast<std::size_t>(v);
    hn::StoreU(hn::BitCast(d_word, hn::InterleaveLower(d, w01, w23)), d_word, to);
    hn::StoreU(hn::BitCast(d_word, hn::InterleaveUpper(d, w01, w23)), d_word, to + 2 * blocks);
  }
}

void write_blocks(const std::uint32_t key[2], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const d64 d;
  const std::size_t vector = hn::Lanes(d);
  const std::size_t step = vector * in_flight;
  constants c;
  prepare(key, c);
  std::uint64_t low = ctr[0] | std::uint64_t{ctr[1]} << 32;
  const lanes64 c2 = hn::Set(d, ctr[2]);
  const lanes64 c3 = hn::Set(d, ctr[3]);

  for (; count >= step; count -= step, low += step, out += 4 * step)
    write_step<in_flight>(c, low, c2, c3, out);
  for (; count >= vector; count -= vector, low += vector, out += 4 * vector)
    write_step<1>(c, low, c2, c3, out);
  if (count != 0) {
    HWY_ALIGN std::uint32_t last[HWY_MAX_BYTES / 2];  // 16 bytes for each 64-bit lane
    write_step<1>(c, low, c2, c3, last);
    std::memcpy(out, last, 4 * count * sizeof *out);
  }
}

#endif

}  // namespace tarn::statistics::philox::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::philox {

HWY_EXPORT(write_blocks);

void write_blocks(const std::uint32_t key[2], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* out) {
  TARN_SIMD_CALL(write_blocks)(key, ctr, count, out);
}

}  // namespace tarn::statistics::philox
#endif
