// SPDX-License-Identifier: Apache-2.0
// Stepping and jumping of sobol in kernels: the sequence of I. M. Sobol' (1967) in the Gray-code
// order of I. A. Antonov and V. M. Saleev (USSR Comput. Math. Math. Phys. 19, 1979). With the
// direction words v[0], ..., v[31] of a dimension, the word of point i is the xor of the v[k] over
// the bits k of its Gray code i xor i/2.
#pragma once

#include <cstddef>
#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"
#include "frame/streams.hpp"

namespace kestrel::tarn::rng::detail {

/// Direction words of a dimension.
inline constexpr std::uint32_t sobol_directions = 32;

/// The state record in a host stream's memory, through which an engine on a device is read and
/// written. Of the dimensions, the direction words have a word 0 behind them, and the current point
/// stands below the direction words as long as it fits there.
struct sobol_record {
  explicit sobol_record(rvx_stream stream)
      : words(reinterpret_cast<std::uint32_t*>(static_cast<unsigned char*>(stream) + 16)) {}

  /// Of the point in progress or, when none is, of the next one: 1 to 2^32 - 1, and 0 for 2^32, the
  /// end of the sequence. It never is that of point 0, which the sequence leaves out.
  std::uint32_t& index() const { return words[0]; }
  std::uint32_t dimensions() const { return words[1]; }
  /// All bits are set in streams that may run on a device, which are those of our own statistics
  /// library.
  std::uint32_t marker() const { return words[2]; }
  /// Coordinates that the point in progress still owes; 0: none is in progress.
  std::uint32_t& offset() const { return words[3]; }
  const std::uint32_t* directions(std::size_t dimension) const {
    return words + 60 + 33 * dimension;
  }
  std::uint32_t* point() const {
    return dimensions() <= 48 ? words + 12 : words + 60 + 33 * std::size_t{dimensions()};
  }

  std::uint32_t* words;
};
inline constexpr std::uint32_t sobol_runs_on_devices = 0xFFFFFFFF;

SYCL_EXTERNAL inline std::uint32_t sobol_gray_code(std::uint32_t i) {
  return i ^ i >> 1;
}

/// The direction word of the step from point i to i + 1: the number of trailing one bits of i. The
/// last point has 32 of them and no word for them; there it is word 31, which leads back to point
/// 0, as the indices do modulo 2^32.
SYCL_EXTERNAL inline std::uint32_t sobol_step(std::uint32_t i) {
  std::uint32_t k = 0;
  for (; (i & 1) != 0 && k < sobol_directions - 1; i >>= 1) {
    ++k;
  }
  return k;
}

/// The xor between the words of two points, whose indices are taken modulo 2^32. `Directions` is a
/// pointer or a local accessor to the direction words of the dimension.
template <typename Directions>
SYCL_EXTERNAL std::uint32_t sobol_jump(const Directions& directions, std::uint32_t from,
                                       std::uint32_t to) {
  std::uint32_t jump = 0;
  std::uint32_t bits = sobol_gray_code(from) ^ sobol_gray_code(to);
  for (std::uint32_t k = 0; bits != 0; ++k, bits >>= 1) {
    if ((bits & 1) != 0) {
      jump ^= directions[k];
    }
  }
  return jump;
}

template <>
struct engine_traits<sobol> {
  template <typename Real>
  static word_rule<Real> rule(gpu::real_range<Real> range) {
    return unsigned_rule(range);
  }
};

}  // namespace kestrel::tarn::rng::detail
