// SPDX-License-Identifier: Apache-2.0
// Stepping of mcg31m1 in kernels: x = a x mod 2^31 - 1 (L'Ecuyer, "Tables of linear congruential
// generators of different sizes and good lattice structure", Math. Comp. 68, 1999). A work-item
// raises the multiplier to the power of its first index; nothing is written back.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"
#include "frame/engine_backend.hpp"

namespace kestrel::tarn::rng::detail {

/// The state record as it stands in the host stream's memory. A split stream has the power of its
/// stride for a multiplier.
struct tag_rvx_sycl_brng_mcg31m1_stream_t {
  std::uint32_t x;  // the next word, 31 bits
  std::uint32_t a;
};
static_assert(sizeof(tag_rvx_sycl_brng_mcg31m1_stream_t) == 8);

inline constexpr std::uint64_t mcg31m1_modulus = 0x7FFFFFFF;

/// The residue of a product of two numbers up to the modulus.
SYCL_EXTERNAL inline std::uint64_t mcg31m1_reduce(std::uint64_t t) {
  const std::uint64_t sum = (t & mcg31m1_modulus) + (t >> 31);
  return sum < mcg31m1_modulus ? sum : sum - mcg31m1_modulus;
}

/// A number up to the modulus with the same residue. The modulus itself stays, as it does in the
/// serial sequence.
SYCL_EXTERNAL inline std::uint64_t mcg31m1_fold(std::uint64_t t) {
  do {
    t = (t & mcg31m1_modulus) + (t >> 31);
  } while (t > mcg31m1_modulus);
  return t;
}

/// `a` to the power of `exponent`, from the low bit of the exponent up.
SYCL_EXTERNAL inline std::uint64_t mcg31m1_power(std::uint64_t a, std::uint64_t exponent) {
  std::uint64_t power = 1;
  for (; exponent != 0; exponent >>= 1) {
    if ((exponent & 1) != 0) {
      power = mcg31m1_reduce(power * a);
    }
    a = mcg31m1_reduce(a * a);
  }
  return power;
}

/// A word as a number, or as a real of [a, b). In float the unit is a power of two, in double the
/// reciprocal of the modulus, so that only a double reaches b.
SYCL_EXTERNAL inline std::uint32_t mcg31m1_convert(std::uint64_t word, word_rule<std::uint32_t>) {
  return static_cast<std::uint32_t>(word);
}
SYCL_EXTERNAL inline float mcg31m1_convert(std::uint64_t word, word_rule<float> range) {
  return sycl::mad(static_cast<float>(word), (range.b - range.a) * 0x1p-31f, range.a);
}
SYCL_EXTERNAL inline double mcg31m1_convert(std::uint64_t word, word_rule<double> range) {
  return sycl::mad(static_cast<double>(word), (range.b - range.a) / 2147483647.0, range.a);
}

template <>
struct engine_traits<mcg31m1> {
  using record = tag_rvx_sycl_brng_mcg31m1_stream_t;

  /// The range itself: its scale is computed in the kernel.
  template <typename Real>
  static word_rule<Real> rule(gpu::real_range<Real> range) {
    return {range.lo, range.hi};
  }

  template <gpu::drawn asks, typename R>
  SYCL_EXTERNAL static void four(record* state, std::uint64_t block, sycl::vec<R, 4>& out,
                                 word_rule<R> rule) {
    std::uint64_t word = mcg31m1_fold(mcg31m1_power(state->a, 4 * block) * state->x);
    out[0] = mcg31m1_convert(word, rule);
    for (int i = 1; i < 4; ++i) {
      word = mcg31m1_fold(word * state->a);
      out[i] = mcg31m1_convert(word, rule);
    }
  }
};

template <>
class engine_base_impl_backend<mcg31m1, device_type::gpu> : public snapshot_backend<mcg31m1> {
  using snapshot_backend<mcg31m1>::snapshot_backend;
};

}  // namespace kestrel::tarn::rng::detail
