// SPDX-License-Identifier: Apache-2.0
// The driver and its devices: one platform, queries, clocks. The first group of queues
// only copies, so that whoever takes it without asking fails.
#include <algorithm>
#include <chrono>

#include "level_zero_driver_state.hpp"

namespace level_zero_driver {

namespace {

// ze_device_ip_version_ext_t, which headers of API version 1.4 do not have.
struct ip_version_query {
  std::uint32_t stype;
  void* next;
  std::uint32_t ip_version;
};
constexpr std::uint32_t ip_version_type = 0x1000f;

// The two forms of a query for a list: how many there are, or up to so many of them.
template <typename Item, typename Write>
ze_result_t answer_list(std::uint32_t* count, Item* items, std::size_t available, Write write) {
  if (count == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  const auto all = static_cast<std::uint32_t>(available);
  const std::uint32_t wanted = items == nullptr ? 0 : std::min(*count, all);
  if (*count == 0 || *count > all) {
    *count = all;
  }
  for (std::uint32_t i = 0; i < wanted; ++i) {
    write(items[i], i);
  }
  return ZE_RESULT_SUCCESS;
}

bool is_part(const _ze_device_handle_t& owner, ze_device_handle_t wanted) {
  return &owner == wanted || std::any_of(owner.parts.begin(), owner.parts.end(),
                                         [&](const auto& part) { return is_part(*part, wanted); });
}

template <typename Text, std::size_t Size>
void write_name(Text (&to)[Size], const std::string& name) {
  std::memset(to, 0, Size);
  std::memcpy(to, name.data(), std::min(name.size(), Size - 1));
}

void forget_devices() {
  for (auto& device : driver().devices) {
    driver().former_devices.push_back(std::move(device));
  }
  driver().devices.clear();
}

}  // namespace

void set_devices(const device_description* devices, std::size_t count) {
  forget_devices();
  driver().devices_are_set = true;
  for (std::size_t i = 0; i < count; ++i) {
    auto device = std::make_unique<_ze_device_handle_t>();
    device->description = devices[i];
    for (std::uint32_t number = 0; number < devices[i].sub_devices; ++number) {
      auto part = std::make_unique<_ze_device_handle_t>();
      part->description = devices[i];
      part->description.sub_devices = 0;
      part->parent = device.get();
      part->number = number;
      device->parts.push_back(std::move(part));
    }
    driver().devices.push_back(std::move(device));
  }
}

ze_result_t check(ze_driver_handle_t handle) {
  if (handle == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_HANDLE;
  }
  return handle == &driver().handle ? ZE_RESULT_SUCCESS : ZE_RESULT_ERROR_INVALID_ARGUMENT;
}

ze_result_t check(ze_device_handle_t device) {
  if (device == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_HANDLE;
  }
  const auto& all = driver().devices;
  const bool known = std::any_of(all.begin(), all.end(),
                                 [device](const auto& each) { return is_part(*each, device); });
  return known ? ZE_RESULT_SUCCESS : ZE_RESULT_ERROR_INVALID_ARGUMENT;
}

std::int64_t now() {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(
             std::chrono::steady_clock::now().time_since_epoch())
      .count();
}

std::uint64_t device_time(const _ze_device_handle_t& device) {
  return static_cast<std::uint64_t>((now() - driver().clock_zero) /
                                    std::int64_t{device.description.timer_nanoseconds});
}

ze_result_t zeInit(ze_init_flags_t) {
  if (!driver().devices_are_set) {
    const device_description plain;
    set_devices(&plain, 1);
  }
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDriverGet(std::uint32_t* count, ze_driver_handle_t* drivers) {
  return answer_list(count, drivers, 1,
                     [](ze_driver_handle_t& to, std::uint32_t) { to = &driver().handle; });
}

ze_result_t zeDriverGetApiVersion(ze_driver_handle_t handle, ze_api_version_t* version) {
  if (const ze_result_t wrong = check(handle)) {
    return wrong;
  }
  *version = ZE_API_VERSION_1_4;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDriverGetProperties(ze_driver_handle_t handle, ze_driver_properties_t* properties) {
  if (const ze_result_t wrong = check(handle)) {
    return wrong;
  }
  properties->driverVersion = 0x01030007;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDriverGetExtensionProperties(ze_driver_handle_t handle, std::uint32_t* count,
                                           ze_driver_extension_properties_t* properties) {
  if (const ze_result_t wrong = check(handle)) {
    return wrong;
  }
  return answer_list(count, properties, 1, [](ze_driver_extension_properties_t& to, std::uint32_t) {
    write_name(to.name, ZE_GLOBAL_OFFSET_EXP_NAME);
    to.version = ZE_GLOBAL_OFFSET_EXP_VERSION_1_0;
  });
}

ze_result_t zeDeviceGet(ze_driver_handle_t handle, std::uint32_t* count,
                        ze_device_handle_t* devices) {
  if (const ze_result_t wrong = check(handle)) {
    return wrong;
  }
  const auto& all = driver().devices;
  return answer_list(count, devices, all.size(),
                     [&](ze_device_handle_t& to, std::uint32_t i) { to = all[i].get(); });
}

ze_result_t zeDeviceGetSubDevices(ze_device_handle_t device, std::uint32_t* count,
                                  ze_device_handle_t* parts) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  return answer_list(count, parts, device->parts.size(),
                     [&](ze_device_handle_t& to, std::uint32_t i) { to = device->parts[i].get(); });
}

ze_result_t zeDeviceGetProperties(ze_device_handle_t device, ze_device_properties_t* properties) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  const device_description& d = device->description;
  ze_device_properties_t& p = *properties;
  p.type = d.type;
  p.vendorId = d.vendor_id;
  p.deviceId = d.device_id;
  p.flags = device->parent == nullptr
                ? 0U
                : static_cast<ze_device_property_flags_t>(ZE_DEVICE_PROPERTY_FLAG_SUBDEVICE);
  p.subdeviceId = device->number;
  p.coreClockRate = d.core_clock_rate;
  p.maxMemAllocSize = d.memory_bytes;
  p.maxHardwareContexts = 64;
  p.maxCommandQueuePriority = 0;
  p.numThreadsPerEU = 8;
  p.physicalEUSimdWidth = 16;
  p.numEUsPerSubslice = 8;
  p.numSubslicesPerSlice = 4;
  p.numSlices = d.slices;
  p.timerResolution = p.stype == ZE_STRUCTURE_TYPE_DEVICE_PROPERTIES_1_2
                          ? 1'000'000'000 / d.timer_nanoseconds
                          : d.timer_nanoseconds;
  p.timestampValidBits = 64;
  p.kernelTimestampValidBits = d.kernel_timestamp_bits;
  std::memset(p.uuid.id, 0, sizeof p.uuid.id);
  p.uuid.id[0] = static_cast<std::uint8_t>(device->number + 1);
  write_name(p.name, d.name);
  auto* const next = static_cast<ip_version_query*>(p.pNext);
  if (next != nullptr && next->stype == ip_version_type && d.ip_version != 0) {
    next->ip_version = d.ip_version;
  }
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDeviceGetComputeProperties(ze_device_handle_t device,
                                         ze_device_compute_properties_t* properties) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  const std::uint32_t size = device->description.max_group_size;
  properties->maxTotalGroupSize = size;
  properties->maxGroupSizeX = properties->maxGroupSizeY = properties->maxGroupSizeZ = size;
  properties->maxGroupCountX = properties->maxGroupCountY = properties->maxGroupCountZ = UINT32_MAX;
  properties->maxSharedLocalMemory = 65536;
  properties->numSubGroupSizes = 2;
  properties->subGroupSizes[0] = 16;
  properties->subGroupSizes[1] = 32;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDeviceGetModuleProperties(ze_device_handle_t device,
                                        ze_device_module_properties_t* properties) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  constexpr ze_device_fp_flags_t rounded = ZE_DEVICE_FP_FLAG_DENORM | ZE_DEVICE_FP_FLAG_INF_NAN |
                                           ZE_DEVICE_FP_FLAG_ROUND_TO_NEAREST |
                                           ZE_DEVICE_FP_FLAG_FMA;
  const ze_device_module_flags_t flags = device->description.module_flags;
  properties->spirvVersionSupported = ZE_MAKE_VERSION(1, 2);
  properties->flags = flags;
  properties->fp16flags = (flags & ZE_DEVICE_MODULE_FLAG_FP16) != 0 ? rounded : 0;
  properties->fp32flags = rounded;
  properties->fp64flags = (flags & ZE_DEVICE_MODULE_FLAG_FP64) != 0 ? rounded : 0;
  properties->maxArgumentsSize = 2048;
  properties->printfBufferSize = 4096;
  std::memset(properties->nativeKernelSupported.id, 7, sizeof properties->nativeKernelSupported.id);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDeviceGetCommandQueueGroupProperties(
    ze_device_handle_t device, std::uint32_t* count,
    ze_command_queue_group_properties_t* properties) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  constexpr ze_command_queue_group_property_flags_t copying =
      ZE_COMMAND_QUEUE_GROUP_PROPERTY_FLAG_COPY;
  constexpr ze_command_queue_group_property_flags_t all =
      ZE_COMMAND_QUEUE_GROUP_PROPERTY_FLAG_COPY | ZE_COMMAND_QUEUE_GROUP_PROPERTY_FLAG_COMPUTE;
  return answer_list(count, properties, 2,
                     [&](ze_command_queue_group_properties_t& to, std::uint32_t ordinal) {
                       to.flags = ordinal == computing_ordinal ? all : copying;
                       to.maxMemoryFillPatternSize = largest_fill_pattern;
                       to.numQueues = queues_of_group;
                     });
}

ze_result_t zeDeviceGetMemoryProperties(ze_device_handle_t device, std::uint32_t* count,
                                        ze_device_memory_properties_t* properties) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  return answer_list(count, properties, 1, [&](ze_device_memory_properties_t& to, std::uint32_t) {
    to.flags = 0;
    to.maxClockRate = 2000;
    to.maxBusWidth = 128;
    to.totalSize = device->description.memory_bytes;
    write_name(to.name, "memory");
  });
}

ze_result_t zeDeviceGetMemoryAccessProperties(ze_device_handle_t device,
                                              ze_device_memory_access_properties_t* properties) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  constexpr ze_memory_access_cap_flags_t all =
      ZE_MEMORY_ACCESS_CAP_FLAG_RW | ZE_MEMORY_ACCESS_CAP_FLAG_ATOMIC;
  properties->hostAllocCapabilities = all;
  properties->deviceAllocCapabilities = all;
  properties->sharedSingleDeviceAllocCapabilities = all;
  properties->sharedCrossDeviceAllocCapabilities = 0;
  properties->sharedSystemAllocCapabilities = 0;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDeviceGetCacheProperties(ze_device_handle_t device, std::uint32_t* count,
                                       ze_device_cache_properties_t* properties) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  return answer_list(count, properties, 1, [](ze_device_cache_properties_t& to, std::uint32_t) {
    to.flags = 0;
    to.cacheSize = std::size_t{4} << 20;
  });
}

ze_result_t zeDeviceCanAccessPeer(ze_device_handle_t device, ze_device_handle_t peer,
                                  ze_bool_t* value) {
  if (const ze_result_t wrong = check(device, peer)) {
    return wrong;
  }
  *value = device == peer ? 1 : 0;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeDeviceGetStatus(ze_device_handle_t device) {
  return check(device);
}

// The host's time is of a clock that nobody names.
ze_result_t zeDeviceGetGlobalTimestamps(ze_device_handle_t device, std::uint64_t* host_time,
                                        std::uint64_t* time) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  *host_time = 1;
  *time = device_time(*device);
  return ZE_RESULT_SUCCESS;
}

}  // namespace level_zero_driver
