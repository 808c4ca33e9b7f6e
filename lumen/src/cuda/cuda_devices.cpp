// SPDX-License-Identifier: Apache-2.0
// The answers of CUDA devices to the device queries, from the properties that the CUDA runtime
// tells and the limits that the CUDA C++ programming guide states for compute capability 7.0 on.
#include "cuda_devices.hpp"

#include "../common_properties.hpp"
#include "sycl/detail/cuda_check.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// "13.0" for 13000.
std::string version_text(int version) {
  return std::to_string(version / 1000) + "." + std::to_string(version % 1000 / 10);
}

int attribute(cudaDeviceAttr name, int device) {
  int value = 0;
  check_cuda(cudaDeviceGetAttribute(&value, name, device), "cudaDeviceGetAttribute");
  return value;
}

void set_numbers(device_properties& p, const cudaDeviceProp& cuda, int device) {
  p.max_compute_units = static_cast<std::uint32_t>(cuda.multiProcessorCount);
  p.max_work_group_size = static_cast<std::size_t>(cuda.maxThreadsPerBlock);
  p.max_num_sub_groups = static_cast<std::uint32_t>(cuda.maxThreadsPerBlock);
  p.max_clock_frequency =
      static_cast<std::uint32_t>(attribute(cudaDevAttrClockRate, device) / 1000);  // MHz
  p.global_mem_size = cuda.totalGlobalMem;
  p.max_mem_alloc_size = cuda.totalGlobalMem;
  p.mem_base_addr_align = 2048;  // bits: what an allocation is aligned to
  p.global_mem_cache_line_size = 128;
  p.global_mem_cache_size = static_cast<std::uint64_t>(cuda.l2CacheSize);
  p.local_mem_type = info::local_mem_type::local;
  p.local_mem_size = cuda.sharedMemPerBlockOptin;
  p.error_correction_support = cuda.ECCEnabled != 0;
  p.host_unified_memory = cuda.integrated != 0;
  p.profiling_timer_resolution = 500;  // ns, of events
}

std::unique_ptr<device_record> describe(int number, const platform_record& platform) {
  cudaDeviceProp cuda{};
  check_cuda(cudaGetDeviceProperties(&cuda, number), "cudaGetDeviceProperties");
  auto record = std::make_unique<device_record>();
  device_properties& p = record->properties;
  p = common_properties();
  p.device_type = info::device_type::gpu;
  p.name = cuda.name;
  p.vendor = "NVIDIA";
  p.vendor_id = 0x10de;
  p.driver_version = platform.version;
  p.version = std::to_string(cuda.major) + "." + std::to_string(cuda.minor);
  p.backend_version = version_text(CUDART_VERSION);
  set_numbers(p, cuda, number);
  p.execution_capabilities = {info::execution_capability::exec_kernel};
  p.aspects = {aspect::gpu,
               aspect::fp64,
               aspect::atomic64,
               aspect::queue_profiling,
               aspect::usm_device_allocations,
               aspect::usm_host_allocations,
               aspect::usm_shared_allocations};
  record->platform = &platform;
  record->default_rating = 200;
  record->number = number;
  record->detached = true;
  return record;
}

}  // namespace

std::vector<std::unique_ptr<device_record>> cuda_devices() {
  std::vector<std::unique_ptr<device_record>> devices;
  int count = 0;
  int driver = 0;
  if (cudaGetDeviceCount(&count) != cudaSuccess || cudaDriverGetVersion(&driver) != cudaSuccess) {
    static_cast<void>(cudaGetLastError());
    return devices;
  }
  static const platform_record& platform = *new platform_record{
      backend::cuda, "CUDA", "NVIDIA", version_text(driver), "FULL_PROFILE", {}};
  for (int number = 0; number < count; ++number) {
    // A device that cannot answer (of another generation, or lost) is left out.
    try {
      devices.push_back(describe(number, platform));
    } catch (const exception&) {
    }
  }
  return devices;
}

}  // namespace detail
LUMEN_NAMESPACE_END
