// SPDX-License-Identifier: Apache-2.0
// The answers of CUDA devices to the device queries, from the properties that the CUDA runtime
// tells and the limits that the CUDA C++ programming guide states for compute capability 7.0 on.
#include "cuda_devices.hpp"

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
  p.max_work_item_dimensions = 3;
  p.max_work_group_size = static_cast<std::size_t>(cuda.maxThreadsPerBlock);
  p.max_num_sub_groups = static_cast<std::uint32_t>(cuda.maxThreadsPerBlock);
  p.sub_group_sizes = {1};
  p.preferred_vector_width_char = p.native_vector_width_char = 16;
  p.preferred_vector_width_short = p.native_vector_width_short = 8;
  p.preferred_vector_width_int = p.native_vector_width_int = 4;
  p.preferred_vector_width_long = p.native_vector_width_long = 2;
  p.preferred_vector_width_float = p.native_vector_width_float = 4;
  p.preferred_vector_width_double = p.native_vector_width_double = 2;
  p.preferred_vector_width_half = p.native_vector_width_half = 0;
  p.max_clock_frequency =
      static_cast<std::uint32_t>(attribute(cudaDevAttrClockRate, device) / 1000);  // MHz
  p.address_bits = 8 * sizeof(void*);
  p.global_mem_size = cuda.totalGlobalMem;
  p.max_mem_alloc_size = cuda.totalGlobalMem;
  p.max_parameter_size = 4096;
  p.mem_base_addr_align = 2048;  // bits: what an allocation is aligned to
  p.global_mem_cache_type = info::global_mem_cache_type::read_write;
  p.global_mem_cache_line_size = 128;
  p.global_mem_cache_size = static_cast<std::uint64_t>(cuda.l2CacheSize);
  p.local_mem_type = info::local_mem_type::local;
  p.local_mem_size = cuda.sharedMemPerBlockOptin;
  p.error_correction_support = cuda.ECCEnabled != 0;
  p.host_unified_memory = cuda.integrated != 0;
  p.profiling_timer_resolution = 500;  // ns, of events
}

void set_abilities(device_properties& p) {
  p.single_fp_config = {info::fp_config::denorm,
                        info::fp_config::inf_nan,
                        info::fp_config::round_to_nearest,
                        info::fp_config::round_to_zero,
                        info::fp_config::round_to_inf,
                        info::fp_config::fma,
                        info::fp_config::correctly_rounded_divide_sqrt};
  p.double_fp_config = p.single_fp_config;
  p.atomic_memory_order_capabilities = {memory_order::relaxed, memory_order::acquire,
                                        memory_order::release, memory_order::acq_rel,
                                        memory_order::seq_cst};
  p.atomic_fence_order_capabilities = p.atomic_memory_order_capabilities;
  p.atomic_memory_scope_capabilities = {memory_scope::work_item, memory_scope::sub_group,
                                        memory_scope::work_group, memory_scope::device,
                                        memory_scope::system};
  p.atomic_fence_scope_capabilities = p.atomic_memory_scope_capabilities;
  p.is_endian_little = true;
  p.is_available = true;
  p.is_compiler_available = false;
  p.is_linker_available = false;
  p.execution_capabilities = {info::execution_capability::exec_kernel};
  p.queue_profiling = true;
  p.preferred_interop_user_sync = true;
  p.partition_type_property = info::partition_property::no_partition;
  p.partition_type_affinity_domain = info::partition_affinity_domain::not_applicable;
  p.aspects = {aspect::gpu,
               aspect::fp64,
               aspect::atomic64,
               aspect::queue_profiling,
               aspect::usm_device_allocations,
               aspect::usm_host_allocations,
               aspect::usm_shared_allocations};
}

std::unique_ptr<device_record> describe(int number, const platform_record& platform) {
  cudaDeviceProp cuda{};
  check_cuda(cudaGetDeviceProperties(&cuda, number), "cudaGetDeviceProperties");
  auto record = std::make_unique<device_record>();
  device_properties& p = record->properties;
  p.device_type = info::device_type::gpu;
  p.name = cuda.name;
  p.vendor = "NVIDIA";
  p.vendor_id = 0x10de;
  p.driver_version = platform.version;
  p.version = std::to_string(cuda.major) + "." + std::to_string(cuda.minor);
  p.backend_version = version_text(CUDART_VERSION);
  p.profile = "FULL_PROFILE";
  set_numbers(p, cuda, number);
  set_abilities(p);
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
