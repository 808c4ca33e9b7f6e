// SPDX-License-Identifier: Apache-2.0
// The GPUs that verbose reports name.
#pragma once

#include <sycl/sycl.hpp>

namespace kestrel::tarn::gpu {

/// Finds the GPUs and prints them, the first time that it is called in the process: those of the
/// queue's backend, whichever queue this happens to be.
void report_detected_devices(const sycl::queue& queue);

/// The position among those of the first GPU with the vendor of `device`, or -1: all devices of one
/// vendor have the same. After report_detected_devices.
int detected_position(const sycl::device& device);

}  // namespace kestrel::tarn::gpu
