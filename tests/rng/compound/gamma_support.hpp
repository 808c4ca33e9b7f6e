// SPDX-License-Identifier: Apache-2.0
// What the suites of gamma, chi_square and beta share: a suite for each real type, the uniforms
// that kernels get, and a candidate of two.
#pragma once

#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "queues.hpp"

namespace tarn_test {

template <typename T>
struct of_reals : testing::Test {
  /// What stands for ln(0).
  static constexpr T log_zero =
      static_cast<T>(std::is_same_v<T, float> ? -103.278931 : -744.44007192138122);
  static constexpr T nan = std::numeric_limits<T>::quiet_NaN();
  static T above(T x) { return std::nextafter(x, std::numeric_limits<T>::infinity()); }
  static T below(T x) { return std::nextafter(x, T(0)); }
};
using real_types = testing::Types<float, double>;

/// Of the engine with this seed, which both roads draw alike.
template <typename T>
std::vector<T> uniforms(std::uint32_t seed, std::int64_t n, T lo = 0, T hi = 1) {
  rng::philox4x32x10 engine(cpu_queue(), seed);
  return draw(rng::uniform<T>(lo, hi), engine, n);
}

/// Of a functor on pairs.
template <typename Functor>
typename Functor::source candidate(const Functor& functor, typename Functor::source u0,
                                   typename Functor::source u1) {
  typename Functor::source out;
  functor.pair(u0, u1, &out);
  return out;
}

}  // namespace tarn_test
