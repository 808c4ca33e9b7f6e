// SPDX-License-Identifier: Apache-2.0
// Interop objects over queues of SYCL, as a runtime that made such a queue would fill them in.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "omptarget.hpp"

namespace tarn_test {

// Foreign runtimes, as OpenMP numbers them.
constexpr std::intptr_t opencl_id = 3;
constexpr std::intptr_t sycl_id = 4;
constexpr std::intptr_t level_zero_id = 6;

constexpr int id_property = -1;  // of omp_get_interop_int
// Of __tgt_get_interop_property.
constexpr int nowait_property = 2;
constexpr int completion_property = 4;
constexpr int context_property = 5;
constexpr int device_property = 6;
constexpr int queue_property = 7;
constexpr int kind_property = 8;
constexpr int device_of_kind_2_property = 9;

class gpu_interop : public omptarget::interop {
 public:
  explicit gpu_interop(const sycl::queue& queue, std::intptr_t id = sycl_id) {
    set_int(id_property, id);
    set_nowait(false);
    set_native(kind_property, reinterpret_cast<void*>(std::uintptr_t{2}));
    set_native(device_of_kind_2_property, sycl::detail::native_of(queue.get_device()));
    set_native(context_property, sycl::detail::native_of(queue.get_context()));
    set_native(queue_property, sycl::detail::native_of(queue));
  }
};

/// A queue whose native handle lives as long as the process: the library keeps what it has made
/// over a handle.
inline const sycl::queue& common_queue() {
  static const auto* const queue = new sycl::queue(sycl::gpu_selector_v);
  return *queue;
}

}  // namespace tarn_test
