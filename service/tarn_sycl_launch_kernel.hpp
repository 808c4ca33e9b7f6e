// SPDX-License-Identifier: Apache-2.0
// What launches on SYCL queues and the merging of events share.
#pragma once

#include <vector>

#include <sycl/sycl.hpp>

#include "tarn_gpu_launch.h"

namespace kestrel::tarn::gpu {

/// Where the memory of a kernel lies.
enum class memory_family { buffers, shared };

/// Copies of the events of a list: none where there is no list, or where a list of the family of
/// buffers is to be skipped.
std::vector<sycl::event> copy_events(const tarn_gpu_event_list_t* list, memory_family family);

}  // namespace kestrel::tarn::gpu
