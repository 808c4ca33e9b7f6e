// SPDX-License-Identifier: Apache-2.0
// Identification of devices behind OpenCL queues: what the library itself uses besides tarn_gpu.h.
#pragma once

#include <CL/cl.h>

#include "device_info_table.hpp"
#include "device_ring.hpp"

namespace kestrel::tarn::gpu::c_layer {

/// In this layer a queue is not found again, and each call asks the driver: a handle says nothing
/// of the queue's life, so one that was released and given out anew would be taken for the old one.
struct queue_entry {
  using queue_key = cl_command_queue;

  void* device = nullptr;
  cl_command_queue queue = nullptr;
  const void* found_by = this;  // never stored to: no queue is at this address

  bool is_of(cl_command_queue key) const { return found_by == key; }
  void assign(void* new_device, cl_command_queue key) {
    device = new_device;
    queue = key;
  }
};
static_assert(sizeof(queue_entry) == 24, "three words");

using layer_tables = device_tables<device_ring<queue_entry>>;
layer_tables& tables();

/// The record of the queue's device, or null, when `*status` tells why unless it was set before.
device_record* record_of(int* status, cl_command_queue queue);

/// The same with the architecture decided.
device_record* record_with_arch(int* status, cl_command_queue queue);

/// -1 on failure.
tarn_gpu_backend_t get_backend(cl_command_queue queue);

}  // namespace kestrel::tarn::gpu::c_layer
