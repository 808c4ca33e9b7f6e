// SPDX-License-Identifier: Apache-2.0
// The table of counterparts. It owns its contexts, and a clean-up releases them.
#include "cl_device_context.hpp"

#include <algorithm>
#include <cstdint>
#include <tarn_level_zero.h>

#include "clean_up.hpp"
#include "first_status.hpp"
#include "opencl_binding.hpp"
#include "serv_array.hpp"
#include "serv_lock.hpp"
#include "tarn_gpu.h"

namespace kestrel::tarn::gpu {
namespace {

constexpr cl_uint most_platforms = 16;
constexpr cl_uint most_devices = 16;  // of a platform
constexpr std::int32_t first_capacity = 16;

struct match {
  ze_device_handle_t device;
  opencl_counterpart opencl;
};

struct match_table {
  match* entries = nullptr;
  std::int32_t capacity = 0;
  std::int32_t count = 0;
  bool registered = false;
  int lock = 0;
};

match_table matches;

void release_matches(void*) {
  const serv_lock guard(&matches.lock);
  for (std::int32_t i = 0; i < matches.count; ++i) {
    cl::clReleaseContext(matches.entries[i].opencl.context);
  }
  tarn_serv_free(matches.entries);
  matches.entries = nullptr;
  matches.capacity = matches.count = 0;
  matches.registered = false;
}

bool answers(cl_device_id device, cl_device_info what, std::uint32_t expected) {
  cl_uint answer = 0;
  return cl::clGetDeviceInfo(device, what, sizeof answer, &answer, nullptr) == CL_SUCCESS &&
         answer == expected;
}

cl_context make_context(cl_device_id device) {
  cl_int code = CL_SUCCESS;
  const cl_context context = cl::clCreateContext(nullptr, 1, &device, nullptr, nullptr, &code);
  return code == CL_SUCCESS ? context : nullptr;
}

opencl_counterpart find_on(cl_platform_id platform, const ze_device_properties_t& wanted) {
  cl_device_id devices[most_devices];
  cl_uint count = 0;
  if (cl::clGetDeviceIDs(platform, CL_DEVICE_TYPE_GPU, most_devices, devices, &count) !=
      CL_SUCCESS) {
    return {};
  }
  for (cl_uint i = 0; i < std::min(count, most_devices); ++i) {
    if (answers(devices[i], CL_DEVICE_VENDOR_ID, wanted.vendorId) &&
        answers(devices[i], CL_DEVICE_MAX_CLOCK_FREQUENCY, wanted.coreClockRate)) {
      if (const cl_context context = make_context(devices[i])) {
        return {devices[i], context};
      }
    }
  }
  return {};
}

opencl_counterpart find_counterpart(ze_device_handle_t device) {
  ze_device_properties_t properties{};
  properties.stype = ZE_STRUCTURE_TYPE_DEVICE_PROPERTIES;
  if (tarn_zeDeviceGetProperties(device, &properties) != ZE_RESULT_SUCCESS ||
      properties.type != ZE_DEVICE_TYPE_GPU) {
    return {};
  }
  // A machine may have Level Zero alone: a call of OpenCL would end the process.
  if (bind_opencl() != 0) {
    return {};
  }
  cl_platform_id platforms[most_platforms];
  cl_uint count = 0;
  if (cl::clGetPlatformIDs(most_platforms, platforms, &count) != CL_SUCCESS) {
    return {};
  }
  for (cl_uint i = 0; i < std::min(count, most_platforms); ++i) {
    const opencl_counterpart found = find_on(platforms[i], properties);
    if (found.device != nullptr) {
      return found;
    }
  }
  return {};
}

/// False when memory is exhausted.
bool is_registered() {
  matches.registered = matches.registered || register_sycl_destructor_nolock(release_matches);
  return matches.registered;
}

bool has_room() {
  return matches.count < matches.capacity ||
         resize_array(matches.entries, matches.capacity,
                      std::max(first_capacity, 2 * matches.capacity));
}

}  // namespace

opencl_counterpart counterpart_of(int* status, ze_device_handle_t device) {
  const serv_lock guard(&matches.lock);
  if (!is_registered()) {
    keep_first(status, CL_OUT_OF_HOST_MEMORY);
    return {};
  }
  for (std::int32_t i = 0; i < matches.count; ++i) {
    if (matches.entries[i].device == device) {
      return matches.entries[i].opencl;
    }
  }
  if (!has_room()) {
    keep_first(status, CL_OUT_OF_HOST_MEMORY);
    return {};
  }
  const opencl_counterpart found = find_counterpart(device);
  if (found.device == nullptr) {
    keep_first(status, CL_DEVICE_NOT_FOUND);
    return {};
  }
  if (matches.count == 0) {
    // The core calls what was registered last first: asked once more, it calls the clean-up before
    // what the OpenCL drivers, which may have been loaded just now, do at the end of the process.
    tarn_serv_core_register_sycl_destructor(tarn_sycl_destructor);
  }
  matches.entries[matches.count++] = {device, found};
  return found;
}

}  // namespace kestrel::tarn::gpu
