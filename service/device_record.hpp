// SPDX-License-Identifier: Apache-2.0
// The library's own record of a device: tarn_gpu_device_info_t in the same layout, with atomic
// fields where threads that hold no lock look.
#pragma once

#include <atomic>
#include <cstdint>

#include "architecture.hpp"
#include "serv_lock.hpp"

namespace kestrel::tarn::gpu {

struct device_record {
  void* device_id = nullptr;
  int lock = 0;                         // guards what is filled in after the record was made
  std::atomic<bool> arch_ready{false};  // when true, the three fields of architecture are final
  tarn_gpu_arch_t arch = TARN_GPU_ARCH_UNKNOWN;
  std::uint32_t stepping = 0;
  std::atomic<bool> binary_checked{false};
  std::atomic<bool> binary_usable{false};
  std::int32_t tile_count = 1;
  std::int32_t eu_count = 0;
  std::int32_t max_workgroup_size = 0;
  std::uint32_t flags = 0;
  tarn_gpu_backend_t backend = TARN_GPU_BACKEND_UNKNOWN;
};

/// For callers, who see no lock.
tarn_gpu_device_info_t copy_of(const device_record& record);

/// Reads the counts of an OpenCL device; a count that the driver does not give is left as it is.
void fill_opencl_counts(device_record& record);

/// A driver's number of sub-devices as a number of tiles.
std::int32_t tiles_of(std::uint32_t sub_devices);

/// Decides the architecture by `detect`, which gives a forge::detected_hw, the first time for this
/// record. Whatever it throws makes the architecture unknown, and it is not tried again.
template <typename Detect>
void decide_architecture(device_record& record, Detect detect) {
  if (record.arch_ready.load(std::memory_order_acquire)) {
    return;
  }
  const serv_lock guard(&record.lock);
  if (record.arch_ready.load(std::memory_order_relaxed)) {
    return;
  }
  architecture found{};
  try {
    found = architecture_of(detect());
  } catch (...) {  // unknown, as found was made
  }
  record.arch = found.arch;
  record.stepping = found.stepping;
  record.flags = found.flags;
  record.arch_ready.store(true, std::memory_order_release);
}

}  // namespace kestrel::tarn::gpu
