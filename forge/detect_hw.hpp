// SPDX-License-Identifier: Apache-2.0
// Which hardware generation a device is.
#pragma once

#include <cstdint>

#include "hw_codes.hpp"
#include "level_zero_calls.hpp"
#include "opencl_calls.hpp"

namespace kestrel::tarn::forge {

enum class native_backend : std::int32_t { unknown = -1, opencl = 0, level_zero = 1 };

/// What stands behind a queue: cl_device_id and cl_context, or ze_device_handle_t and
/// ze_context_handle_t, as the backend says.
struct native_queue {
  void* device;
  void* context;
};

/// What detection asks for. The record of a backend that is not asked about may be empty.
struct detection_calls {
  opencl_calls opencl;
  level_zero_calls level_zero;
};

/// Asks the driver for the version of the device's instruction set. If it has no answer, or one
/// that is not known, a kernel that does nothing is compiled, and its binary tells. All 0 for an
/// unknown backend. \throws opencl_error, level_zero_error: the kernel could not be compiled
/// \throws what parse_binary does
detected_hw detect_hw(const native_queue& queue, native_backend backend,
                      const detection_calls& calls);

}  // namespace kestrel::tarn::forge
