// SPDX-License-Identifier: Apache-2.0
// Skipping an engine: on its stream, or by the GPU level, which knows of state on the device.
#pragma once

#include <kestrel/tarn/rng/device_level.hpp>
#include <sycl/sycl.hpp>

#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"

namespace kestrel::tarn::rng::detail {

/// `Count` is a number, or a list of 64-bit digits.
template <typename Engine, typename Count>
void skip_engine(sycl::queue& queue, engine_base_impl<Engine>* impl, Count count) {
  if constexpr (engine_row<Engine>::gpu) {
    if (queue.get_device().is_gpu()) {
      gpu::skip_ahead<Engine>(queue, impl, count);
      return;
    }
  }
  skip_stream(impl->stream.get(), count);
}

}  // namespace kestrel::tarn::rng::detail
