// SPDX-License-Identifier: Apache-2.0
// Records of devices: their layout, and what OpenCL says of one.
#include "device_record.hpp"

#include <algorithm>
#include <cstddef>

#include "opencl_binding.hpp"

namespace kestrel::tarn::gpu {
namespace {

// Libraries of the family know the layout.
static_assert(sizeof(tarn_gpu_device_info_t) == 48 && sizeof(device_record) == 48);
static_assert(sizeof(tarn_gpu_arch_t) == 4 && sizeof(tarn_gpu_backend_t) == 4);
static_assert(sizeof(std::atomic<bool>) == 1 && std::atomic<bool>::is_always_lock_free);
#define TARN_SAME_PLACE(field, place)                                 \
  static_assert(offsetof(tarn_gpu_device_info_t, field) == (place) && \
                offsetof(device_record, field) == (place))
TARN_SAME_PLACE(device_id, 0);
TARN_SAME_PLACE(lock, 8);
TARN_SAME_PLACE(arch_ready, 12);
TARN_SAME_PLACE(arch, 16);
TARN_SAME_PLACE(stepping, 20);
TARN_SAME_PLACE(binary_checked, 24);
TARN_SAME_PLACE(binary_usable, 25);
TARN_SAME_PLACE(tile_count, 28);
TARN_SAME_PLACE(eu_count, 32);
TARN_SAME_PLACE(max_workgroup_size, 36);
TARN_SAME_PLACE(flags, 40);
TARN_SAME_PLACE(backend, 44);
#undef TARN_SAME_PLACE

/// False, and `value` is as before, if the driver does not know.
template <typename T>
bool ask(const device_record& record, cl_device_info what, T& value) {
  T answer{};
  if (cl::clGetDeviceInfo(static_cast<cl_device_id>(record.device_id), what, sizeof answer, &answer,
                          nullptr) != CL_SUCCESS) {
    return false;
  }
  value = answer;
  return true;
}

}  // namespace

tarn_gpu_device_info_t copy_of(const device_record& record) {
  tarn_gpu_device_info_t copy{};
  copy.device_id = record.device_id;
  copy.arch_ready = record.arch_ready.load(std::memory_order_acquire);
  if (copy.arch_ready) {
    copy.arch = record.arch;
    copy.stepping = record.stepping;
    copy.flags = record.flags;
  }
  copy.binary_checked = record.binary_checked;
  copy.binary_usable = record.binary_usable;
  copy.tile_count = record.tile_count;
  copy.eu_count = record.eu_count;
  copy.max_workgroup_size = record.max_workgroup_size;
  copy.backend = record.backend;
  return copy;
}

std::int32_t tiles_of(std::uint32_t sub_devices) {
  return std::max(1, static_cast<std::int32_t>(sub_devices));
}

void fill_opencl_counts(device_record& record) {
  cl_uint number = 0;
  if (ask(record, CL_DEVICE_PARTITION_MAX_SUB_DEVICES, number)) {
    record.tile_count = tiles_of(number);
  }
  if (ask(record, CL_DEVICE_MAX_COMPUTE_UNITS, number)) {
    record.eu_count = static_cast<std::int32_t>(number);
  }
  std::size_t size = 0;
  if (ask(record, CL_DEVICE_MAX_WORK_GROUP_SIZE, size)) {
    record.max_workgroup_size = static_cast<std::int32_t>(size);
  }
}

}  // namespace kestrel::tarn::gpu
