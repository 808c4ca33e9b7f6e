// SPDX-License-Identifier: Apache-2.0
// What the kernel functors of closed formulas share: the logarithm that is finite at 0, and the
// formula of one value, or of a pair, on four delivered values.
#pragma once

#include <cstdint>
#include <type_traits>

#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail::gpu {

/// What stands for ln(0), so that no result is infinite: about the logarithm of the least subnormal
/// number of the type. The host road takes the same two numbers.
template <typename R>
inline constexpr R log_of_zero = static_cast<R>(std::is_same_v<R, float> ? -0x1.9D1DAp6
                                                                         : -0x1.74385446D71C3p9);

/// ln(u) for u >= 0.
template <typename R>
SYCL_EXTERNAL R guarded_log(R u) {
  return u == 0 ? log_of_zero<R> : sycl::log(u);
}

/// In a table of sums of probabilities the greatest count up to `k` whose own moves the sum: where
/// a search ends that no sum satisfies.
SYCL_EXTERNAL inline std::int32_t last_in_sums(const double* cdf, std::int32_t k) {
  while (k > 0 && cdf[k - 1] == cdf[k]) {
    k -= 1;
  }
  return k;
}

/// functor.one(u) of each value.
template <typename T, typename Functor, typename R>
SYCL_EXTERNAL sycl::vec<T, 4> each_of(const Functor& functor, const sycl::vec<R, 4>& u) {
  sycl::vec<T, 4> out;
  for (int i = 0; i < 4; ++i) {
    out[i] = functor.one(u[i]);
  }
  return out;
}

/// functor.pair(u0, u1, out) of the first two values, then of the last two.
template <typename T, typename Functor, typename R>
SYCL_EXTERNAL sycl::vec<T, Functor::results> pairs_of(const Functor& functor,
                                                      const sycl::vec<R, 4>& u) {
  T values[Functor::results];
  functor.pair(u[0], u[1], values);
  functor.pair(u[2], u[3], values + Functor::pair_results);
  sycl::vec<T, Functor::results> out;
  for (int i = 0; i < Functor::results; ++i) {
    out[i] = values[i];
  }
  return out;
}

}  // namespace kestrel::tarn::rng::detail::gpu
