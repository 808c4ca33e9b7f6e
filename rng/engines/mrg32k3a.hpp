// SPDX-License-Identifier: Apache-2.0
// Stepping and skipping of mrg32k3a in kernels (L'Ecuyer, "Good parameters and implementations for
// combined multiple recursive random number generators", Oper. Res. 47, 1999):
//   x(n) = (1403580 x(n-2) - 810728 x(n-3)) mod m1
//   y(n) = (527612 y(n-1) - 1370589 y(n-3)) mod m2
// and the word is (x(n) - y(n)) mod m1, with m1 in place of 0. A skip multiplies the last three
// values of each by a power of its transition matrix (L'Ecuyer, Simard, Chen, Kelton, "An
// object-oriented random-number package with many long streams and substreams", Oper. Res. 50,
// 2002).
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"

namespace kestrel::tarn::rng::detail {

/// The state record as it stands in the host stream's memory: x(n-3), x(n-2), x(n-1), y(n-3),
/// y(n-2), y(n-1).
struct tag_rvx_sycl_brng_mrg32k3a_stream_t {
  std::uint32_t s[6];
};
static_assert(sizeof(tag_rvx_sycl_brng_mrg32k3a_stream_t) == 24);

/// A modulus 2^32 - excess. Since 2^32 is `excess` modulo it, the upper half of a number can be
/// folded onto the lower one.
template <std::int64_t excess>
struct mrg32k3a_modulus {
  static constexpr std::int64_t value = (std::int64_t{1} << 32) - excess;

  /// A smaller number of the same residue; the upper half of a negative one is rounded down.
  SYCL_EXTERNAL static std::int64_t fold(std::int64_t t) {
    return (t >> 32) * excess + (t & 0xFFFFFFFF);
  }
  SYCL_EXTERNAL static std::uint64_t fold(std::uint64_t t) {
    return (t >> 32) * static_cast<std::uint64_t>(excess) + (t & 0xFFFFFFFF);
  }

  /// The residue of -value < t < 2 value.
  SYCL_EXTERNAL static std::uint32_t residue(std::int64_t t) {
    if (t > value - 1) {
      t -= value;
    }
    if (t < 0) {
      t += value;
    }
    return static_cast<std::uint32_t>(t);
  }

  /// The residue of an inner product. The folded products are below (excess + 1) 2^32 each, so that
  /// their sum folds to less than 2 value.
  SYCL_EXTERNAL static std::uint32_t inner(const std::uint32_t* row, std::uint32_t v0,
                                           std::uint32_t v1, std::uint32_t v2) {
    const std::uint64_t sum = fold(std::uint64_t{row[0]} * v0) + fold(std::uint64_t{row[1]} * v1) +
                              fold(std::uint64_t{row[2]} * v2);
    return residue(static_cast<std::int64_t>(fold(sum)));
  }
};
using mrg32k3a_m1 = mrg32k3a_modulus<209>;
using mrg32k3a_m2 = mrg32k3a_modulus<22853>;

/// Moves to the next word, 1 to m1, and returns it.
SYCL_EXTERNAL inline std::uint32_t mrg32k3a_step(tag_rvx_sycl_brng_mrg32k3a_stream_t* state) {
  std::uint32_t* s = state->s;
  const std::int64_t t1 = 1403580 * std::int64_t{s[1]} - 810728 * std::int64_t{s[0]};
  const std::int64_t t2 = 527612 * std::int64_t{s[5]} - 1370589 * std::int64_t{s[3]};
  // The upper half of t2 has 21 bits, which times 22853 do not fit 32: hence the second fold.
  const std::uint32_t x = mrg32k3a_m1::residue(mrg32k3a_m1::fold(t1));
  const std::uint32_t y = mrg32k3a_m2::residue(mrg32k3a_m2::fold(mrg32k3a_m2::fold(t2)));
  s[0] = s[1];
  s[1] = s[2];
  s[2] = x;
  s[3] = s[4];
  s[4] = s[5];
  s[5] = y;
  return x > y ? x - y : x - y + static_cast<std::uint32_t>(mrg32k3a_m1::value);
}

/// A power of the two transition matrices, which act on the columns (x(n-3), x(n-2), x(n-1)) and
/// (y(n-3), y(n-2), y(n-1)).
struct mrg32k3a_power {
  std::uint32_t x[3][3];
  std::uint32_t y[3][3];
};

/// The power by digit * 8^level: level 0 to 20, digit 1 to 7. The table stands in the function,
/// where all compilers of kernels take it for device data.
SYCL_EXTERNAL inline const mrg32k3a_power& mrg32k3a_octal_power(int level, int digit) {
  static constexpr mrg32k3a_power powers[21 * 7] = {
#include "engines/mrg32k3a_octal_powers.inc"
  };
  return powers[7 * level + digit - 1];
}

/// The power by 2^76, the distance of the sub-sequences; from the paper of 2002.
inline constexpr mrg32k3a_power mrg32k3a_sub_sequence_jump = {
    {{82758667, 1871391091, 4127413238},
     {3672831523, 69195019, 1871391091},
     {3672091415, 3528743235, 69195019}},
    {{1511326704, 3759209742, 1610795712},
     {4292754251, 1511326704, 3889917532},
     {3859662829, 4292754251, 3708466080}}};

/// Moves the state by as many steps as the power stands for.
SYCL_EXTERNAL inline void mrg32k3a_jump(tag_rvx_sycl_brng_mrg32k3a_stream_t* state,
                                        const mrg32k3a_power& power) {
  const tag_rvx_sycl_brng_mrg32k3a_stream_t from = *state;
  const std::uint32_t* s = from.s;
  for (int i = 0; i < 3; ++i) {
    state->s[i] = mrg32k3a_m1::inner(power.x[i], s[0], s[1], s[2]);
    state->s[3 + i] = mrg32k3a_m2::inner(power.y[i], s[3], s[4], s[5]);
  }
}

/// Moves the state by `n` steps, 0 <= n < 2^63.
SYCL_EXTERNAL inline void mrg32k3a_skip(tag_rvx_sycl_brng_mrg32k3a_stream_t* state,
                                        std::int64_t n) {
  for (int level = 0; n != 0; ++level, n >>= 3) {
    const int digit = static_cast<int>(n & 7);
    if (digit != 0) {
      mrg32k3a_jump(state, mrg32k3a_octal_power(level, digit));
    }
  }
}

template <>
struct engine_traits<mrg32k3a> {
  using record = tag_rvx_sycl_brng_mrg32k3a_stream_t;

  /// Scale and offset. The float divisor is m1 rounded to float, as the greatest words are: they
  /// give hi or, where the scale is rounded up, more, which only a clamp brings back.
  static word_rule<float> rule(gpu::real_range<float> range) {
    return {(range.hi - range.lo) / 4294967040.0f, range.lo};
  }
  static word_rule<double> rule(gpu::real_range<double> range) {
    return {(range.hi - range.lo) / 4294967087.0, range.lo};
  }
};

}  // namespace kestrel::tarn::rng::detail
