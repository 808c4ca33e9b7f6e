// SPDX-License-Identifier: Apache-2.0
// Identification of devices behind SYCL queues: what the library itself uses besides
// kestrel/tarn/gpu/device_info.hpp.
#pragma once

#include <memory>

#include "device_info_table.hpp"
#include "device_ring.hpp"
#include "kestrel/tarn/gpu/device_info.hpp"

namespace kestrel::tarn::gpu {

/// A queue is found again as long as it lives: another one at its address is not taken for it.
struct sycl_queue_entry {
  using queue_key = std::shared_ptr<const void>;

  void* device = nullptr;
  const void* key = nullptr;
  std::weak_ptr<const void> state;

  bool is_of(const queue_key& queue) const { return state.use_count() != 0 && key == queue.get(); }
  void assign(void* new_device, const queue_key& queue) {
    device = new_device;
    key = queue.get();
    state = queue;
  }
};
static_assert(sizeof(sycl_queue_entry) == 32, "a device, a key and a weak reference");

using sycl_layer_tables = device_tables<device_ring<sycl_queue_entry>>;
sycl_layer_tables& sycl_tables();

/// The native handle of the queue's device, asked for as `backend` has it: null for an unknown one,
/// and TARN_GPU_BACKEND_OF_QUEUE stands for the queue's own. \throws sycl::exception with
/// errc::backend_mismatch if the device is of another backend
void* native_device(const sycl::queue& queue, tarn_gpu_backend_t backend);

/// The record of the queue's device. \throws as get_device_info
device_record& record_of(const sycl::queue& queue);

/// The same with the architecture decided.
device_record& record_with_arch(const sycl::queue& queue);

/// The backend of the queue's device, from its record. \throws as get_device_info
tarn_gpu_backend_t get_backend(sycl::queue* queue);

}  // namespace kestrel::tarn::gpu
