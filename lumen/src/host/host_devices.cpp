// SPDX-License-Identifier: Apache-2.0
// The answers of the host CPU to the device queries, from /proc/cpuinfo, sysconf and the limits
// of this runtime.
#include "host_devices.hpp"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <unistd.h>

#include "../common_properties.hpp"
#include "../settings.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

constexpr char runtime_version[] = "0.1.0";
constexpr std::size_t largest_group = 1024;
constexpr std::size_t local_memory_bytes = 256 * 1024;

// The value of the first line of /proc/cpuinfo with this key; empty when there is none.
std::string cpuinfo(const char* key) {
  std::string value;
  if (std::FILE* file = std::fopen("/proc/cpuinfo", "r")) {
    char line[4096];
    while (value.empty() && std::fgets(line, sizeof line, file) != nullptr) {
      const char* colon = std::strchr(line, ':');
      if (colon != nullptr && std::strncmp(line, key, std::strlen(key)) == 0) {
        value = colon + 1;
        const std::size_t first = value.find_first_not_of(" \t");
        const std::size_t last = value.find_last_not_of(" \t\n");
        value = first == std::string::npos ? "" : value.substr(first, last - first + 1);
      }
    }
    std::fclose(file);
  }
  return value;
}

std::uint64_t system_value(int name) {
  const long value = sysconf(name);
  return value > 0 ? static_cast<std::uint64_t>(value) : 0;
}

device_properties host_properties() {
  device_properties p = common_properties();
  p.device_type = info::device_type::cpu;
  p.name = cpuinfo("model name");
  if (p.name.empty()) {
    p.name = "host CPU";
  }
  p.vendor = cpuinfo("vendor_id");
  if (p.vendor.empty()) {
    p.vendor = "unknown";
  }
  p.vendor_id = 0;
  p.driver_version = runtime_version;
  p.version = "1.0";
  p.backend_version = runtime_version;
  p.max_compute_units = number_of_threads();
  p.max_work_group_size = largest_group;
  p.max_num_sub_groups = static_cast<std::uint32_t>(largest_group);
  p.max_clock_frequency =
      static_cast<std::uint32_t>(std::strtod(cpuinfo("cpu MHz").c_str(), nullptr));
  p.global_mem_size = system_value(_SC_PHYS_PAGES) * system_value(_SC_PAGESIZE);
  p.max_mem_alloc_size = p.global_mem_size;
  p.mem_base_addr_align = 1024;  // bits: the widest vector
  p.global_mem_cache_line_size =
      static_cast<std::uint32_t>(system_value(_SC_LEVEL1_DCACHE_LINESIZE));
  p.global_mem_cache_size = system_value(_SC_LEVEL3_CACHE_SIZE);
  if (p.global_mem_cache_size == 0) {
    p.global_mem_cache_size = system_value(_SC_LEVEL2_CACHE_SIZE);
  }
  p.local_mem_type = info::local_mem_type::global;
  p.local_mem_size = local_memory_bytes;
  p.host_unified_memory = true;
  p.profiling_timer_resolution = 1;
  p.execution_capabilities = {info::execution_capability::exec_kernel,
                              info::execution_capability::exec_native_kernel};
  p.aspects = {aspect::cpu,
               aspect::host_debuggable,
               aspect::fp64,
               aspect::atomic64,
               aspect::queue_profiling,
               aspect::usm_device_allocations,
               aspect::usm_host_allocations,
               aspect::usm_atomic_host_allocations,
               aspect::usm_shared_allocations,
               aspect::usm_atomic_shared_allocations,
               aspect::usm_system_allocations};
  return p;
}

device_properties virtual_properties(const device_properties& host,
                                     const virtual_device_setting& setting) {
  device_properties p = host;
  p.device_type = setting.is_gpu ? info::device_type::gpu : info::device_type::accelerator;
  p.name = setting.is_gpu ? "virtual GPU" : "virtual accelerator";
  p.vendor = "lumen";
  if (setting.compute_units != 0) {
    p.max_compute_units = setting.compute_units;
  }
  if (setting.max_work_group_size != 0) {
    p.max_work_group_size = setting.max_work_group_size;
    p.max_num_sub_groups = static_cast<std::uint32_t>(setting.max_work_group_size);
  }
  p.execution_capabilities = {info::execution_capability::exec_kernel};
  p.host_unified_memory = !setting.own_memory;
  p.aspects[0] = setting.is_gpu ? aspect::gpu : aspect::accelerator;
  p.aspects.push_back(aspect::emulated);
  if (setting.own_memory) {
    const auto reaches_all_memory = [](aspect a) {
      return a == aspect::usm_system_allocations || a == aspect::usm_atomic_host_allocations ||
             a == aspect::usm_atomic_shared_allocations;
    };
    p.aspects.erase(std::remove_if(p.aspects.begin(), p.aspects.end(), reaches_all_memory),
                    p.aspects.end());
  }
  return p;
}

// Appends the virtual devices of one kind.
void add_virtual_devices(std::vector<std::unique_ptr<device_record>>& devices,
                         const device_properties& host, bool own_memory) {
  static const platform_record& platform = *new platform_record{
      backend::host, "lumen virtual devices", "lumen", runtime_version, "FULL_PROFILE", {}};
  for (const virtual_device_setting& setting : virtual_devices_from_environment()) {
    if (setting.own_memory == own_memory) {
      auto record = std::make_unique<device_record>();
      record->properties = virtual_properties(host, setting);
      record->platform = &platform;
      record->default_rating = setting.is_gpu ? 50 : 40;
      record->detached = own_memory;
      devices.push_back(std::move(record));
    }
  }
}

}  // namespace

std::vector<std::unique_ptr<device_record>> host_devices() {
  static const platform_record& host_platform = *new platform_record{
      backend::host, "lumen host", "lumen", runtime_version, "FULL_PROFILE", {}};
  std::vector<std::unique_ptr<device_record>> devices;
  devices.push_back(std::make_unique<device_record>());
  device_record& host = *devices.back();
  host.properties = host_properties();
  host.platform = &host_platform;
  host.default_rating = 100;
  add_virtual_devices(devices, host_properties(), false);
  return devices;
}

std::vector<std::unique_ptr<device_record>> detached_devices() {
  std::vector<std::unique_ptr<device_record>> devices;
  add_virtual_devices(devices, host_properties(), true);
  return devices;
}

}  // namespace detail
LUMEN_NAMESPACE_END
