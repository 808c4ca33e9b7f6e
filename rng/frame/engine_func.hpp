// SPDX-License-Identifier: Apache-2.0
// The kernel of engines whose state travels by value: each work-item makes vec_size results at
// its own place of the sequence, and the last one drops what lies past the end.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "engines/engine_traits.hpp"

namespace kestrel::tarn::rng::detail {

/// T is the result type, R the type that the engine delivers (real or raw word), Out a pointer or
/// a write accessor.
template <typename Engine, typename T, typename R, typename Functor, typename Out>
struct engine_func {
  using record = typename engine_traits<Engine>::record;

  std::int32_t vec_size;
  Out r;
  Functor functor;
  record state;
  R scale;
  R shift;
  std::uint64_t n;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const {
    record position = state;
    const std::uint64_t g = item[0];
    sycl::vec<R, 4> drawn;
    engine_traits<Engine>::template four<R>(&position, g, drawn, scale, shift);
    const sycl::vec<T, Functor::results> values = functor(drawn);

    const std::uint64_t base = g * static_cast<std::uint64_t>(vec_size);
    if (base + static_cast<std::uint64_t>(vec_size) <= n) {
      for (int j = 0; j < Functor::results; ++j) {
        r[base + static_cast<std::uint64_t>(j)] = values[j];
      }
    } else {
      for (int j = 0; base + static_cast<std::uint64_t>(j) < n; ++j) {
        r[base + static_cast<std::uint64_t>(j)] = values[j];
      }
    }
  }
};

}  // namespace kestrel::tarn::rng::detail
