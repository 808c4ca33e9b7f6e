// SPDX-License-Identifier: Apache-2.0
// Information descriptors (SYCL 2020, section 4.6), aspects and backends.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "atomic_ref.hpp"
#include "config.hpp"
#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

class platform;
class device;
class context;

// The numbers are those that siblings in other languages pass. Where the host runs the kernels, on
// the CPU and on virtual devices, the backend is host.
enum class backend : char { host = 0, opencl = 1, ext_kestrel_level_zero = 2, cuda = 3 };

enum class aspect {
  cpu,
  gpu,
  accelerator,
  custom,
  emulated,
  host_debuggable,
  fp16,
  fp64,
  atomic64,
  image,
  online_compiler,
  online_linker,
  queue_profiling,
  usm_device_allocations,
  usm_host_allocations,
  usm_atomic_host_allocations,
  usm_shared_allocations,
  usm_atomic_shared_allocations,
  usm_system_allocations,
};

namespace info {

enum class device_type : std::uint32_t { cpu, gpu, accelerator, custom, automatic, host, all };
enum class partition_property : int {
  no_partition,
  partition_equally,
  partition_by_counts,
  partition_by_affinity_domain,
};
enum class partition_affinity_domain : int {
  not_applicable,
  numa,
  L4_cache,
  L3_cache,
  L2_cache,
  L1_cache,
  next_partitionable,
};
enum class local_mem_type : int { none, local, global };
enum class fp_config : int {
  denorm,
  inf_nan,
  round_to_nearest,
  round_to_zero,
  round_to_inf,
  fma,
  correctly_rounded_divide_sqrt,
  soft_float,
};
enum class global_mem_cache_type : int { none, read_only, read_write };
enum class execution_capability : unsigned int { exec_kernel, exec_native_kernel };
enum class event_command_status : int { submitted, running, complete };

#define LUMEN_INFO(descriptor, type) \
  struct descriptor {                \
    using return_type = type;        \
  };

namespace platform {
LUMEN_INFO(profile, std::string)
LUMEN_INFO(version, std::string)
LUMEN_INFO(name, std::string)
LUMEN_INFO(vendor, std::string)
LUMEN_INFO(extensions, std::vector<std::string>)
}  // namespace platform

namespace context {
LUMEN_INFO(platform, sycl::platform)
LUMEN_INFO(devices, std::vector<sycl::device>)
LUMEN_INFO(atomic_memory_order_capabilities, std::vector<memory_order>)
LUMEN_INFO(atomic_fence_order_capabilities, std::vector<memory_order>)
LUMEN_INFO(atomic_memory_scope_capabilities, std::vector<memory_scope>)
LUMEN_INFO(atomic_fence_scope_capabilities, std::vector<memory_scope>)
}  // namespace context

namespace device {
#define LUMEN_DEVICE_INFO LUMEN_INFO
#include "info_device.def"
#undef LUMEN_DEVICE_INFO
LUMEN_INFO(platform, sycl::platform)
LUMEN_INFO(parent_device, sycl::device)
template <int Dimensions = 3>
struct max_work_item_sizes {
  using return_type = id<Dimensions>;
};
}  // namespace device

namespace queue {
LUMEN_INFO(context, sycl::context)
LUMEN_INFO(device, sycl::device)
}  // namespace queue

namespace event {
LUMEN_INFO(command_execution_status, event_command_status)
}  // namespace event

// Nanoseconds of one monotonic clock.
namespace event_profiling {
LUMEN_INFO(command_submit, std::uint64_t)
LUMEN_INFO(command_start, std::uint64_t)
LUMEN_INFO(command_end, std::uint64_t)
}  // namespace event_profiling
#undef LUMEN_INFO

}  // namespace info

LUMEN_NAMESPACE_END
