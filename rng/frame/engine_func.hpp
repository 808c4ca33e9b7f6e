// SPDX-License-Identifier: Apache-2.0
// The kernel of engines whose state travels by value and whose jump is cheap: each work-item makes
// vec_size values at its own place of the sequence, and the last one drops what lies past the end.
// Engines that need another shape specialise engine_func or have one of the kernels named below.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"

namespace kestrel::tarn::rng::detail {

/// Stores a work-item's values from `base` on: all of them, or those below `n`.
template <typename T, int size, typename Out>
SYCL_EXTERNAL void store_values(const Out& r, std::uint64_t base, std::uint64_t n,
                                const sycl::vec<T, size>& values) {
  if (base + static_cast<std::uint64_t>(size) <= n) {
    for (int j = 0; j < size; ++j) {
      r[base + static_cast<std::uint64_t>(j)] = values[j];
    }
  } else {
    for (int j = 0; base + static_cast<std::uint64_t>(j) < n; ++j) {
      r[base + static_cast<std::uint64_t>(j)] = values[j];
    }
  }
}

/// T is the result type, R the type that the engine delivers (real or word), Out a pointer or a
/// write accessor.
template <typename Engine, typename T, typename R, typename Functor, typename Out>
struct engine_func {
  using record = typename engine_traits<Engine>::record;

  std::int32_t vec_size;
  Out r;
  Functor functor;
  record state;
  word_rule<R> rule;
  std::uint64_t n;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    record position = state;
    const std::uint64_t g = item[0];
    sycl::vec<R, 4> values;
    engine_traits<Engine>::template four<Functor::asks>(&position, g, values, rule);
    store_values<T, Functor::results>(r, g * static_cast<std::uint64_t>(vec_size), n,
                                      functor(values));
  }
};

/// One work-item for each sub-sequence: engines that are split into many states in device memory.
template <typename Engine, typename T, typename R, typename Functor, typename Out>
struct engine_func_sub_seq;

/// Work-groups that walk a twister's recurrence together: `pairs` if the functor works on pairs of
/// values, `mid_block` if the stream stood inside a block when the engine was made. The second one
/// chooses between two ways to the same words.
template <typename Engine, typename T, typename R, typename Functor, typename Out, bool pairs,
          bool mid_block>
struct engine_func_mt;

}  // namespace kestrel::tarn::rng::detail
