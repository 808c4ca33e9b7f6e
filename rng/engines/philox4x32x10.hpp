// SPDX-License-Identifier: Apache-2.0
// Stepping of philox4x32x10 in kernels: Philox4x32-10 of Salmon, Moraes, Dror and Shaw, "Parallel
// random numbers: as easy as 1, 2, 3", SC 2011. A work-item computes the four words at its own
// place of the sequence from a private copy of the state record; nothing is written back.
#pragma once

#include <cstddef>
#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"
#include "frame/engine_backend.hpp"

namespace kestrel::tarn::rng::detail {

/// The state record as it stands in the host stream's memory. The next word of the sequence has
/// the serial index 4 * ctr - idx, with ctr a 128-bit number, ctr[0] least significant.
struct tag_rvx_sycl_brng_philox4x32x10_stream_t {
  std::uint32_t key[2];
  std::uint32_t ctr[4];
  std::uint32_t idx;  // unread words of the block ctr - 1: 0 to 4
};
static_assert(sizeof(tag_rvx_sycl_brng_philox4x32x10_stream_t) == 28);

/// One of the ten rounds; the multipliers are those of the paper.
SYCL_EXTERNAL inline void philox4x32x10_round(std::uint32_t* ctr, const std::uint32_t* key) {
  const std::uint64_t p0 = std::uint64_t{ctr[0]} * 0xD2511F53u;
  const std::uint64_t p1 = std::uint64_t{ctr[2]} * 0xCD9E8D57u;
  ctr[0] = static_cast<std::uint32_t>(p1 >> 32) ^ ctr[1] ^ key[0];
  ctr[1] = static_cast<std::uint32_t>(p1);
  ctr[2] = static_cast<std::uint32_t>(p0 >> 32) ^ ctr[3] ^ key[1];
  ctr[3] = static_cast<std::uint32_t>(p0);
}

/// Between two rounds the key moves by the golden ratio and by sqrt(3) - 1, in units of 2^-32.
SYCL_EXTERNAL inline void philox4x32x10_next_key(std::uint32_t* key) {
  key[0] += 0x9E3779B9u;
  key[1] += 0xBB67AE85u;
}

/// Ten rounds in place, written out so that no loop is left in a kernel. `ctr` holds the four
/// output words afterwards; `key` is overwritten.
SYCL_EXTERNAL inline void philox4x32x10_round_brute_10(std::uint32_t* ctr, std::uint32_t* key) {
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
  philox4x32x10_next_key(key);
  philox4x32x10_round(ctr, key);
}

/// A word as a result: itself, or the signed number it stands for times `a` plus `b`.
SYCL_EXTERNAL inline std::uint32_t philox4x32x10_convert(std::uint32_t word, std::uint32_t,
                                                         std::uint32_t) {
  return word;
}
template <typename Real>
SYCL_EXTERNAL Real philox4x32x10_convert(std::uint32_t word, Real a, Real b) {
  return sycl::mad(static_cast<Real>(static_cast<std::int32_t>(word)), a, b);
}

/// Adds `increment` to the low half of the counter, and 1 to the high half if the sum is below the
/// increment. For `increment` = 2^64 - 1, a step back by one block, that carries into the high half
/// unless the low half was 0: kernels have always done so, and results depend on it.
SYCL_EXTERNAL inline void philox4x32x10_add_low(std::uint32_t* ctr, std::uint64_t increment) {
  const std::uint64_t low = (std::uint64_t{ctr[1]} << 32 | ctr[0]) + increment;
  ctr[0] = static_cast<std::uint32_t>(low);
  ctr[1] = static_cast<std::uint32_t>(low >> 32);
  if (low < increment) {
    const std::uint64_t high = (std::uint64_t{ctr[3]} << 32 | ctr[2]) + 1;
    ctr[2] = static_cast<std::uint32_t>(high);
    ctr[3] = static_cast<std::uint32_t>(high >> 32);
  }
}

/// Adds `increment` word by word, with a carry test at each word. For a step back by one block the
/// test at the second word carries into the third although nothing overflowed, when the first word
/// is 0 and the second is not; and does not when both are 0. Kept for the same reason.
SYCL_EXTERNAL inline void philox4x32x10_add_by_words(std::uint32_t* ctr, std::uint64_t increment) {
  const std::uint32_t low = static_cast<std::uint32_t>(increment);
  ctr[0] += low;
  const std::uint32_t carry = ctr[0] < low ? 1u : 0u;
  const std::uint32_t high = static_cast<std::uint32_t>(increment >> 32) + carry;
  ctr[1] += high;
  if (ctr[1] < high) {
    ++ctr[2];
    if (ctr[2] == 0) {
      ++ctr[3];
    }
  }
}

/// The four results of work-block `n`, counted from the record's position, in serial order: words
/// as they are for T = std::uint32_t (`a` and `b` are not read), for float and double the
/// word-to-real rule with scale `a` and offset `b`. Overwrites the record. With an `idx` above 4,
/// which no stream has, `out` stays unset.
template <typename T>
SYCL_EXTERNAL void philox4x32x10_generate(tag_rvx_sycl_brng_philox4x32x10_stream_t* state,
                                          std::uint64_t n, sycl::vec<T, 4>& out, T a, T b) {
  const std::uint32_t idx = state->idx;
  if ((idx & ~4u) == 0) {  // 0 or 4: the four words are one block
    philox4x32x10_add_low(state->ctr, n - (idx >> 2));
    philox4x32x10_round_brute_10(state->ctr, state->key);
    for (int i = 0; i < 4; ++i) {
      out[i] = philox4x32x10_convert(state->ctr[i], a, b);
    }
    return;
  }
  if (idx > 4) {
    return;
  }
  // The last idx words of one block, then the first 4 - idx of the next.
  std::uint32_t words[8];
  std::uint32_t key[2] = {state->key[0], state->key[1]};
  for (int i = 0; i < 4; ++i) {
    words[i] = state->ctr[i];
  }
  philox4x32x10_add_by_words(words, n - 1);
  philox4x32x10_round_brute_10(words, key);
  philox4x32x10_add_low(state->ctr, n);
  philox4x32x10_round_brute_10(state->ctr, state->key);
  for (int i = 0; i < 4; ++i) {
    words[4 + i] = state->ctr[i];
  }
  for (int i = 0; i < 4; ++i) {  // words[4 - idx + i]; places that are known stay in registers
    const std::uint32_t word = idx == 1 ? words[3 + i] : idx == 2 ? words[2 + i] : words[1 + i];
    out[i] = philox4x32x10_convert(word, a, b);
  }
}

template <>
struct engine_traits<philox4x32x10> {
  using record = tag_rvx_sycl_brng_philox4x32x10_stream_t;

  /// Scale and offset. A word is read as a signed number, so the offset is the middle of the range.
  template <typename Real>
  static word_rule<Real> rule(gpu::real_range<Real> range) {
    return {(range.hi - range.lo) * static_cast<Real>(0x1p-32),
            (range.lo + range.hi) * static_cast<Real>(0.5)};
  }

  /// A word has 32 equidistributed bits, so that words and bits are the same.
  template <gpu::drawn asks, typename R>
  SYCL_EXTERNAL static void four(record* state, std::uint64_t block, sycl::vec<R, 4>& out,
                                 word_rule<R> rule) {
    philox4x32x10_generate<R>(state, block, out, rule.a, rule.b);
  }
};

template <>
class engine_base_impl_backend<philox4x32x10, device_type::gpu>
    : public snapshot_backend<philox4x32x10> {
  using snapshot_backend<philox4x32x10>::snapshot_backend;
};

}  // namespace kestrel::tarn::rng::detail
