// SPDX-License-Identifier: Apache-2.0
// Runs of ARS-5 blocks with the processor's AES, one block per 128 bits. A block costs five AES
// instructions, and a processor starts about as many wide ones as narrow ones in a cycle. So
// AVX3_DL, the target whose AES takes whole vectors, is compiled here besides those of the other
// kernels.
#define HWY_WANT_AVX3_DL 1
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/ars5_simd.cpp"
#include <cstring>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/ars5.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::ars5::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET == HWY_SCALAR

void write_blocks(const std::uint32_t key[4], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const std::uint64_t first = ctr[0] | std::uint64_t{ctr[1]} << 32;
  for (std::size_t i = 0; i < count; ++i) {
    const std::uint64_t low = first + i;
    const std::uint32_t at[4] = {static_cast<std::uint32_t>(low),
                                 static_cast<std::uint32_t>(low >> 32), ctr[2], ctr[3]};
    evaluate(key, at, out + 4 * i);
  }
}

#else

// AVX2 and AVX3 would take wider vectors apart for each round.
#if HWY_TARGET == HWY_AVX3_DL
using d64 = hn::ScalableTag<std::uint64_t>;
#else
using d64 = hn::Full128<std::uint64_t>;
#endif
using d8 = hn::Repartition<std::uint8_t, d64>;
using d32 = hn::Repartition<std::uint32_t, d64>;
using lanes64 = hn::Vec<d64>;
using lanes8 = hn::Vec<d8>;

constexpr std::size_t blocks_per_vector = hn::MaxLanes(d64()) / 2;

// Vectors that one step has in flight: two instructions a cycle of a latency of four cycles.
constexpr int in_flight = 8;

struct round_keys {
  lanes8 of[rounds + 1];
};

// `low` and `high` in the halves of each block.
HWY_INLINE lanes64 halves(std::uint64_t low, std::uint64_t high) {
  const d64 d;
  return hn::OddEven(hn::Set(d, high), hn::Set(d, low));
}

HWY_INLINE round_keys prepare(const std::uint32_t key[4]) {
  const d64 d;
  const d8 d_byte;
  const lanes64 step = halves(key_step[0], key_step[1]);
  lanes64 k = hn::BitCast(d, hn::LoadDup128(d32(), key));
  round_keys keys;
  for (lanes8& of_round : keys.of) {
    of_round = hn::BitCast(d_byte, k);
    k = hn::Add(k, step);
  }
  return keys;
}

// Writes `Vectors` vectors of blocks from the counters `ctr` on.
template <int Vectors>
HWY_INLINE void write_step(const round_keys& keys, lanes64 ctr, std::uint32_t* HWY_RESTRICT out) {
  const d64 d;
  const d8 d_byte;
  lanes8 state[Vectors];
  for (int v = 0; v < Vectors; ++v) {
    const lanes64 distance = halves(static_cast<std::uint64_t>(v) * blocks_per_vector, 0);
    state[v] = hn::Xor(hn::BitCast(d_byte, hn::Add(ctr, distance)), keys.of[0]);
  }
  HWY_UNROLL(4)
  for (int r = 1; r < rounds; ++r)
    for (int v = 0; v < Vectors; ++v)
      state[v] = hn::AESRound(state[v], keys.of[r]);
  for (int v = 0; v < Vectors; ++v)
    state[v] = hn::AESLastRound(state[v], keys.of[rounds]);
  for (int v = 0; v < Vectors; ++v)
    hn::StoreU(hn::BitCast(d32(), state[v]), d32(), out + 4 * blocks_per_vector * v);
}

void write_blocks(const std::uint32_t key[4], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  const d64 d;
  constexpr std::size_t vector = blocks_per_vector;
  constexpr std::size_t step = vector * in_flight;
  const round_keys keys = prepare(key);
  // Block i of a vector has the counter ctr + i.
  lanes64 next = hn::Add(hn::BitCast(d, hn::LoadDup128(d32(), ctr)),
                         hn::OddEven(hn::Zero(d), hn::ShiftRight<1>(hn::Iota(d, 0))));

  for (; count >= step; count -= step, out += 4 * step) {
    write_step<in_flight>(keys, next, out);
    next = hn::Add(next, halves(step, 0));
  }
  for (; count >= vector; count -= vector, out += 4 * vector) {
    write_step<1>(keys, next, out);
    next = hn::Add(next, halves(vector, 0));
  }
  if (count != 0) {
    HWY_ALIGN std::uint32_t last[4 * vector];
    write_step<1>(keys, next, last);
    std::memcpy(out, last, 4 * count * sizeof *out);
  }
}

#endif

}  // namespace tarn::statistics::ars5::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::ars5 {

HWY_EXPORT(write_blocks);

void write_blocks(const std::uint32_t key[4], const std::uint32_t ctr[4], std::size_t count,
                  std::uint32_t* out) {
  TARN_SIMD_CALL(write_blocks)(key, ctr, count, out);
}

}  // namespace tarn::statistics::ars5
#endif
