// SPDX-License-Identifier: Apache-2.0
// The kernel of engines whose state travels by value and whose jump is cheap: each work-item makes
// vec_size values at its own place of the sequence, and the last one drops what lies past the end.
// Engines that need another shape specialise engine_func or have one of the kernels named below.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"

namespace kestrel::tarn::rng::detail {

/// Stores neighbouring results by 16 bytes at once, which is what a GPU writes in one instruction,
/// or by all of them where they are fewer bytes. An output may begin at any element: where it is
/// not aligned for that, which is the same for all work-items of a call, each goes out by itself. A
/// vec lies in memory as its elements do, one behind the other (SYCL 2020, section 4.14.2.6).
template <typename T, int size>
SYCL_EXTERNAL void store_neighbours(T* to, const sycl::vec<T, size>& values) {
  constexpr int at_once = 16 / static_cast<int>(sizeof(T));
  constexpr int width = size < at_once ? size : at_once;
  using part = sycl::vec<T, width>;
  if (reinterpret_cast<std::uintptr_t>(to) % alignof(part) == 0) {
    for (int j = 0; j < size; j += width) {
      part together;
      for (int k = 0; k < width; ++k) {
        together[k] = values[j + k];
      }
      *reinterpret_cast<part*>(to + j) = together;
    }
  } else {
    for (int j = 0; j < size; ++j) {
      to[j] = values[j];
    }
  }
}

/// Stores a work-item's values from `base` on: all of them, or those below `n`.
template <typename T, int size, typename Out>
SYCL_EXTERNAL void store_values(const Out& r, std::uint64_t base, std::uint64_t n,
                                const sycl::vec<T, size>& values) {
  if (base + static_cast<std::uint64_t>(size) <= n) {
    store_neighbours(&r[base], values);
  } else {
    for (int j = 0; j < size; ++j) {  // a fixed count keeps the values in registers
      if (base + static_cast<std::uint64_t>(j) < n) {
        r[base + static_cast<std::uint64_t>(j)] = values[j];
      }
    }
  }
}

/// The results of four values, the first of which stands at place `first` of the call and the
/// others `step` apart.
template <typename T, typename R, typename Functor>
SYCL_EXTERNAL sycl::vec<T, Functor::results> results_of(const Functor& functor,
                                                        const sycl::vec<R, 4>& values,
                                                        std::uint64_t first,
                                                        std::uint64_t step = 1) {
  if constexpr (gpu::has_place<Functor>) {
    sycl::vec<T, 4> results;
    for (int i = 0; i < 4; ++i) {
      results[i] = functor.at(values[i], first + static_cast<std::uint64_t>(i) * step);
    }
    return results;
  } else {
    return functor(values);
  }
}

/// The results of as many values as the functor has to be given together, the first of which stands
/// at place `first`.
template <typename T, typename R, typename Functor>
SYCL_EXTERNAL sycl::vec<T, gpu::results_together<Functor>> results_of_some(const Functor& functor,
                                                                           const R* values,
                                                                           std::uint64_t first) {
  constexpr int together = gpu::values_together<Functor>;
  T out[gpu::results_together<Functor>];
  if constexpr (gpu::has_one<Functor>) {
    out[0] = functor.one(values[0]);
  } else if constexpr (gpu::has_pair<Functor>) {
    functor.pair(values[0], values[1], out);
  } else {
    // What makes four results makes more than are asked for.
    sycl::vec<R, 4> four;
    for (int i = 0; i < 4; ++i) {
      four[i] = values[i % together];
    }
    const sycl::vec<T, Functor::results> results = results_of<T>(functor, four, first, 0);
    for (int i = 0; i < gpu::results_together<Functor>; ++i) {
      out[i] = results[i];
    }
  }
  sycl::vec<T, gpu::results_together<Functor>> results;
  for (int i = 0; i < gpu::results_together<Functor>; ++i) {
    results[i] = out[i];
  }
  return results;
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
    const std::uint64_t base = g * static_cast<std::uint64_t>(vec_size);
    store_values<T, Functor::results>(r, base, n, results_of<T>(functor, values, base));
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
