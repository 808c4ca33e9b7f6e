// SPDX-License-Identifier: Apache-2.0
// What the zeDriverGet* and zeDeviceGet* queries say, in the words of SYCL (SYCL 2020, section
// 4.6.4). What Level Zero does not tell (a vendor's name, the size of a cache line) stays empty.
#include "level_zero_devices.hpp"

#include <algorithm>
#include <cstdio>

#include "../common_properties.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// A record of answers by its type.
template <typename Properties, typename Query, typename Owner>
Properties ask(ze_structure_type_t type, const char* tried, Query query, Owner owner) {
  Properties answer{};
  answer.stype = type;
  check_level_zero(query(owner, &answer), tried);
  return answer;
}

// "1.4" for the number of a version.
std::string version_text(std::uint32_t version) {
  return std::to_string(ZE_MAJOR_VERSION(version)) + "." +
         std::to_string(ZE_MINOR_VERSION(version));
}

std::string hexadecimal(std::uint32_t number) {
  char text[16];
  std::snprintf(text, sizeof text, "0x%x", number);
  return text;
}

info::device_type type_of(ze_device_type_t type) {
  return type == ZE_DEVICE_TYPE_GPU    ? info::device_type::gpu
         : type == ZE_DEVICE_TYPE_CPU  ? info::device_type::cpu
         : type == ZE_DEVICE_TYPE_FPGA ? info::device_type::accelerator
                                       : info::device_type::custom;
}

aspect aspect_of(info::device_type type) {
  return type == info::device_type::gpu           ? aspect::gpu
         : type == info::device_type::cpu         ? aspect::cpu
         : type == info::device_type::accelerator ? aspect::accelerator
                                                  : aspect::custom;
}

std::vector<info::fp_config> fp_configs(ze_device_fp_flags_t flags) {
  constexpr std::pair<ze_device_fp_flags_t, info::fp_config> all[] = {
      {ZE_DEVICE_FP_FLAG_DENORM, info::fp_config::denorm},
      {ZE_DEVICE_FP_FLAG_INF_NAN, info::fp_config::inf_nan},
      {ZE_DEVICE_FP_FLAG_ROUND_TO_NEAREST, info::fp_config::round_to_nearest},
      {ZE_DEVICE_FP_FLAG_ROUND_TO_ZERO, info::fp_config::round_to_zero},
      {ZE_DEVICE_FP_FLAG_ROUND_TO_INF, info::fp_config::round_to_inf},
      {ZE_DEVICE_FP_FLAG_FMA, info::fp_config::fma},
      {ZE_DEVICE_FP_FLAG_ROUNDED_DIVIDE_SQRT, info::fp_config::correctly_rounded_divide_sqrt},
      {ZE_DEVICE_FP_FLAG_SOFT_FLOAT, info::fp_config::soft_float}};
  std::vector<info::fp_config> found;
  for (const auto& [flag, config] : all) {
    if ((flags & flag) != 0) {
      found.push_back(config);
    }
  }
  return found;
}

void set_device(device_properties& p, ze_device_handle_t device) {
  const ze_device_properties_t d = properties_of(device);
  p.device_type = type_of(d.type);
  p.name = d.name;
  p.vendor = "PCI vendor " + hexadecimal(d.vendorId);
  p.vendor_id = d.vendorId;
  p.max_clock_frequency = d.coreClockRate;
  p.max_mem_alloc_size = d.maxMemAllocSize;
  p.max_compute_units = d.numSlices * d.numSubslicesPerSlice * d.numEUsPerSubslice;
  p.error_correction_support = (d.flags & ZE_DEVICE_PROPERTY_FLAG_ECC) != 0;
  p.host_unified_memory = (d.flags & ZE_DEVICE_PROPERTY_FLAG_INTEGRATED) != 0;
  // Nanoseconds in a tick, rounded up: never 0.
  const std::uint64_t ticks = std::max<std::uint64_t>(1, d.timerResolution);
  p.profiling_timer_resolution = (1'000'000'000 + ticks - 1) / ticks;
  p.partition_max_sub_devices = static_cast<std::uint32_t>(parts_of(device).size());
  if ((d.flags & ZE_DEVICE_PROPERTY_FLAG_SUBDEVICE) != 0) {
    p.partition_type_property = info::partition_property::partition_by_affinity_domain;
    p.partition_type_affinity_domain = info::partition_affinity_domain::next_partitionable;
  }
}

void set_groups(device_properties& p, ze_device_handle_t device) {
  const auto c = ask<ze_device_compute_properties_t>(ZE_STRUCTURE_TYPE_DEVICE_COMPUTE_PROPERTIES,
                                                     "zeDeviceGetComputeProperties",
                                                     ze().zeDeviceGetComputeProperties, device);
  p.max_work_group_size = c.maxTotalGroupSize;
  p.local_mem_size = c.maxSharedLocalMemory;
  p.local_mem_type =
      c.maxSharedLocalMemory == 0 ? info::local_mem_type::none : info::local_mem_type::local;
  p.sub_group_sizes.assign(
      c.subGroupSizes,
      c.subGroupSizes + std::min<std::uint32_t>(c.numSubGroupSizes, ZE_SUBGROUPSIZE_COUNT));
  const auto smallest = std::min_element(p.sub_group_sizes.begin(), p.sub_group_sizes.end());
  p.max_num_sub_groups = smallest == p.sub_group_sizes.end() || *smallest == 0
                             ? 0
                             : static_cast<std::uint32_t>(c.maxTotalGroupSize / *smallest);
}

// Returns the flags that are aspects.
ze_device_module_flags_t set_arithmetic(device_properties& p, ze_device_handle_t device) {
  const auto m = ask<ze_device_module_properties_t>(ZE_STRUCTURE_TYPE_DEVICE_MODULE_PROPERTIES,
                                                    "zeDeviceGetModuleProperties",
                                                    ze().zeDeviceGetModuleProperties, device);
  p.half_fp_config = fp_configs(m.fp16flags);
  p.single_fp_config = fp_configs(m.fp32flags);
  p.double_fp_config = fp_configs(m.fp64flags);
  p.max_parameter_size = m.maxArgumentsSize;
  p.printf_buffer_size = m.printfBufferSize;
  return m.flags;
}

void set_memory(device_properties& p, ze_device_handle_t device) {
  ze_device_memory_properties_t memory{};
  memory.stype = ZE_STRUCTURE_TYPE_DEVICE_MEMORY_PROPERTIES;
  for (const auto& each :
       list_of("zeDeviceGetMemoryProperties", memory, ze().zeDeviceGetMemoryProperties, device)) {
    p.global_mem_size += each.totalSize;
  }
  ze_device_cache_properties_t cache{};
  cache.stype = ZE_STRUCTURE_TYPE_DEVICE_CACHE_PROPERTIES;
  for (const auto& each :
       list_of("zeDeviceGetCacheProperties", cache, ze().zeDeviceGetCacheProperties, device)) {
    p.global_mem_cache_size = std::max<std::uint64_t>(p.global_mem_cache_size, each.cacheSize);
  }
  p.mem_base_addr_align = 512;  // bits: of the largest vectors
  p.global_mem_cache_type = p.global_mem_cache_size == 0 ? info::global_mem_cache_type::none
                                                         : info::global_mem_cache_type::read_write;
}

void set_aspects(device_properties& p, ze_device_handle_t device, ze_device_module_flags_t flags) {
  const auto access = ask<ze_device_memory_access_properties_t>(
      ZE_STRUCTURE_TYPE_DEVICE_MEMORY_ACCESS_PROPERTIES, "zeDeviceGetMemoryAccessProperties",
      ze().zeDeviceGetMemoryAccessProperties, device);
  const auto can = [](ze_memory_access_cap_flags_t memory, ze_memory_access_cap_flags_t what) {
    return (memory & what) != 0;
  };
  constexpr auto plain = ZE_MEMORY_ACCESS_CAP_FLAG_RW;
  constexpr auto atomic = ZE_MEMORY_ACCESS_CAP_FLAG_CONCURRENT_ATOMIC;
  const std::pair<bool, aspect> others[] = {
      {(flags & ZE_DEVICE_MODULE_FLAG_FP16) != 0, aspect::fp16},
      {(flags & ZE_DEVICE_MODULE_FLAG_FP64) != 0, aspect::fp64},
      {(flags & ZE_DEVICE_MODULE_FLAG_INT64_ATOMICS) != 0, aspect::atomic64},
      {can(access.deviceAllocCapabilities, plain), aspect::usm_device_allocations},
      {can(access.hostAllocCapabilities, plain), aspect::usm_host_allocations},
      {can(access.hostAllocCapabilities, atomic), aspect::usm_atomic_host_allocations},
      {can(access.sharedSingleDeviceAllocCapabilities, plain), aspect::usm_shared_allocations},
      {can(access.sharedSingleDeviceAllocCapabilities, atomic),
       aspect::usm_atomic_shared_allocations},
      {can(access.sharedSystemAllocCapabilities, plain), aspect::usm_system_allocations}};
  p.aspects = {aspect_of(p.device_type), aspect::queue_profiling};
  for (const auto& [has, its] : others) {
    if (has) {
      p.aspects.push_back(its);
    }
  }
}

}  // namespace

std::unique_ptr<platform_record> describe_platform(ze_driver_handle_t driver) {
  ze_api_version_t version{};
  check_level_zero(ze().zeDriverGetApiVersion(driver, &version), "zeDriverGetApiVersion");
  auto record = std::make_unique<platform_record>();
  record->kind = backend::ext_kestrel_level_zero;
  record->name = "Level Zero";
  record->version = version_text(version);
  record->profile = "FULL_PROFILE";
  for (const ze_driver_extension_properties_t& each :
       list_of("zeDriverGetExtensionProperties", ze_driver_extension_properties_t{},
               ze().zeDriverGetExtensionProperties, driver)) {
    record->extensions.emplace_back(each.name);
  }
  record->native = driver;
  return record;
}

std::unique_ptr<device_record> describe_device(ze_device_handle_t device,
                                               const platform_record& platform) {
  auto record = std::make_unique<device_record>();
  device_properties& p = record->properties;
  p = common_properties();
  set_device(p, device);
  set_groups(p, device);
  const ze_device_module_flags_t flags = set_arithmetic(p, device);
  set_memory(p, device);
  set_aspects(p, device, flags);
  const auto driver = ask<ze_driver_properties_t>(
      ZE_STRUCTURE_TYPE_DRIVER_PROPERTIES, "zeDriverGetProperties", ze().zeDriverGetProperties,
      static_cast<ze_driver_handle_t>(platform.native));
  p.driver_version = hexadecimal(driver.driverVersion);
  p.version = platform.version;
  p.backend_version = platform.version;
  p.execution_capabilities = {info::execution_capability::exec_kernel};
  static_cast<void>(computing_group(device));  // without one it runs nothing
  record->platform = &platform;
  // Below the devices that run this program's own kernels.
  record->default_rating = p.device_type == info::device_type::gpu ? 30 : 5;
  record->detached = true;
  record->native = device;
  return record;
}

std::vector<ze_device_handle_t> parts_of(ze_device_handle_t device) {
  return list_of("zeDeviceGetSubDevices", ze_device_handle_t{}, ze().zeDeviceGetSubDevices, device);
}

ze_device_properties_t properties_of(ze_device_handle_t device) {
  return ask<ze_device_properties_t>(ZE_STRUCTURE_TYPE_DEVICE_PROPERTIES_1_2,
                                     "zeDeviceGetProperties", ze().zeDeviceGetProperties, device);
}

queue_group computing_group(ze_device_handle_t device) {
  ze_command_queue_group_properties_t group{};
  group.stype = ZE_STRUCTURE_TYPE_COMMAND_QUEUE_GROUP_PROPERTIES;
  const auto groups = list_of("zeDeviceGetCommandQueueGroupProperties", group,
                              ze().zeDeviceGetCommandQueueGroupProperties, device);
  const auto found = std::find_if(groups.begin(), groups.end(), [](const auto& each) {
    return (each.flags & ZE_COMMAND_QUEUE_GROUP_PROPERTY_FLAG_COMPUTE) != 0;
  });
  if (found == groups.end()) {
    throw exception(make_error_code(errc::platform), "a Level Zero device runs no kernels");
  }
  return {static_cast<std::uint32_t>(found - groups.begin()), found->maxMemoryFillPatternSize};
}

}  // namespace detail
LUMEN_NAMESPACE_END
