// SPDX-License-Identifier: Apache-2.0
// Stepping of mcg59 in kernels: x = a x mod 2^59, a power of two, so that the arithmetic is that of
// 64-bit words and the modulus is a mask. A work-item raises the multiplier to the power of its
// first index; nothing is written back.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"
#include "frame/engine_backend.hpp"

namespace kestrel::tarn::rng::detail {

/// The state record as it stands in the host stream's memory. A split stream has the power of its
/// stride for a multiplier.
struct tag_rvx_sycl_brng_mcg59_stream_t {
  std::uint64_t x;  // the next word in the low 59 bits
  std::uint64_t a;
};
static_assert(sizeof(tag_rvx_sycl_brng_mcg59_stream_t) == 16);

inline constexpr std::uint64_t mcg59_mask = 0x07FFFFFFFFFFFFFF;

/// `a` to the power of `exponent` modulo 2^64.
SYCL_EXTERNAL inline std::uint64_t mcg59_power(std::uint64_t a, std::uint64_t exponent) {
  std::uint64_t power = 1;
  for (; exponent != 0; exponent >>= 1) {
    if ((exponent & 1) != 0) {
      power *= a;
    }
    a *= a;
  }
  return power;
}

/// A word as a real of [a, b), or as its 32 highest bits, which are the equidistributed ones.
template <typename Real>
SYCL_EXTERNAL Real mcg59_convert(std::uint64_t word, word_rule<Real> range) {
  const Real scale = (range.b - range.a) * static_cast<Real>(0x1p-59);
  return sycl::mad(static_cast<Real>(word), scale, range.a);
}
SYCL_EXTERNAL inline std::uint32_t mcg59_convert(std::uint64_t word, word_rule<std::uint32_t>) {
  return static_cast<std::uint32_t>(word >> 27);
}

template <>
struct engine_traits<mcg59> {
  using record = tag_rvx_sycl_brng_mcg59_stream_t;

  /// The range itself: its scale is computed in the kernel.
  template <typename Real>
  static word_rule<Real> rule(gpu::real_range<Real> range) {
    return {range.lo, range.hi};
  }

  /// Four reals or four times 32 bits of as many steps; words as they are take two values each, so
  /// that four values are two steps.
  template <gpu::drawn asks, typename R>
  SYCL_EXTERNAL static void four(record* state, std::uint64_t block, sycl::vec<R, 4>& out,
                                 word_rule<R> rule) {
    constexpr int steps = asks == gpu::drawn::words ? 2 : 4;
    std::uint64_t x = mcg59_power(state->a, steps * block) * state->x;
    for (int i = 0; i < steps; ++i, x *= state->a) {
      const std::uint64_t word = x & mcg59_mask;
      if constexpr (asks == gpu::drawn::words) {
        out[2 * i] = static_cast<std::uint32_t>(word);
        out[2 * i + 1] = static_cast<std::uint32_t>(word >> 32);
      } else {
        out[i] = mcg59_convert(word, rule);
      }
    }
  }
};

template <>
class engine_base_impl_backend<mcg59, device_type::gpu> : public snapshot_backend<mcg59> {
  using snapshot_backend<mcg59>::snapshot_backend;
};

}  // namespace kestrel::tarn::rng::detail
