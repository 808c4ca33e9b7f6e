// SPDX-License-Identifier: Apache-2.0
// Contexts and memory of all kinds, which is the host's. A device has as much as its description
// says.
#include <cstdlib>

#include "level_zero_driver_state.hpp"

namespace level_zero_driver {

namespace {

constexpr std::size_t page = 4096;

// Shared memory counts as the device's, if it has one.
ze_result_t allocate(ze_context_handle_t context, ze_device_handle_t device, ze_memory_type_t type,
                     std::size_t bytes, std::size_t alignment, void** pointer) {
  if (const ze_result_t wrong = check(context)) {
    return wrong;
  }
  if (pointer == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if ((alignment & (alignment - 1)) != 0) {
    return ZE_RESULT_ERROR_UNSUPPORTED_ALIGNMENT;
  }
  if (bytes == 0 || (device != nullptr && bytes > device->description.memory_bytes)) {
    return ZE_RESULT_ERROR_UNSUPPORTED_SIZE;
  }
  if (device != nullptr && bytes > device->description.memory_bytes - device->memory_used) {
    return ZE_RESULT_ERROR_OUT_OF_DEVICE_MEMORY;
  }
  void* start = nullptr;
  if (posix_memalign(&start, alignment < 64 ? 64 : alignment, bytes) != 0) {
    return ZE_RESULT_ERROR_OUT_OF_HOST_MEMORY;
  }
  auto* const made = make<allocation*>({context});
  made->context = context;
  made->device = device;
  made->type = type;
  made->id = ++driver().allocations_made;
  made->start = static_cast<char*>(start);
  made->bytes = bytes;
  driver().memory[made->start] = made;
  if (device != nullptr) {
    device->memory_used += bytes;
  }
  *pointer = start;
  return ZE_RESULT_SUCCESS;
}

ze_result_t create_context(ze_driver_handle_t handle, const ze_context_desc_t* description,
                           ze_context_handle_t* context) {
  if (const ze_result_t wrong = check(handle)) {
    return wrong;
  }
  if (description == nullptr || context == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  *context = make<ze_context_handle_t>({});
  return ZE_RESULT_SUCCESS;
}

}  // namespace

ze_result_t zeContextCreate(ze_driver_handle_t handle, const ze_context_desc_t* description,
                            ze_context_handle_t* context) {
  return create_context(handle, description, context);
}

ze_result_t zeContextCreateEx(ze_driver_handle_t handle, const ze_context_desc_t* description,
                              std::uint32_t count, ze_device_handle_t* devices,
                              ze_context_handle_t* context) {
  if ((count == 0) != (devices == nullptr)) {
    return ZE_RESULT_ERROR_INVALID_SIZE;
  }
  for (std::uint32_t i = 0; i < count; ++i) {
    if (const ze_result_t wrong = check(devices[i])) {
      return wrong;
    }
  }
  return create_context(handle, description, context);
}

ze_result_t zeContextDestroy(ze_context_handle_t context) {
  return destroy(context);
}

ze_result_t zeContextGetStatus(ze_context_handle_t context) {
  return check(context);
}

ze_result_t zeMemAllocDevice(ze_context_handle_t context,
                             const ze_device_mem_alloc_desc_t* description, std::size_t bytes,
                             std::size_t alignment, ze_device_handle_t device, void** pointer) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  if (description == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  return allocate(context, device, ZE_MEMORY_TYPE_DEVICE, bytes, alignment, pointer);
}

ze_result_t zeMemAllocHost(ze_context_handle_t context, const ze_host_mem_alloc_desc_t* description,
                           std::size_t bytes, std::size_t alignment, void** pointer) {
  if (description == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  return allocate(context, nullptr, ZE_MEMORY_TYPE_HOST, bytes, alignment, pointer);
}

ze_result_t zeMemAllocShared(ze_context_handle_t context,
                             const ze_device_mem_alloc_desc_t* device_description,
                             const ze_host_mem_alloc_desc_t* host_description, std::size_t bytes,
                             std::size_t alignment, ze_device_handle_t device, void** pointer) {
  if (device_description == nullptr || host_description == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (device != nullptr) {
    if (const ze_result_t wrong = check(device)) {
      return wrong;
    }
  }
  return allocate(context, device, ZE_MEMORY_TYPE_SHARED, bytes, alignment, pointer);
}

ze_result_t zeMemFree(ze_context_handle_t context, void* pointer) {
  if (const ze_result_t wrong = check(context)) {
    return wrong;
  }
  if (pointer == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  const auto found = driver().memory.find(static_cast<const char*>(pointer));
  if (found == driver().memory.end() || found->second->context != context) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  const allocation gone = *found->second;
  if (const ze_result_t wrong = destroy(found->second)) {
    return wrong;
  }
  driver().memory.erase(found);
  if (gone.device != nullptr) {
    gone.device->memory_used -= gone.bytes;
  }
  std::free(gone.start);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeMemGetAllocProperties(ze_context_handle_t context, const void* pointer,
                                    ze_memory_allocation_properties_t* properties,
                                    ze_device_handle_t* device) {
  if (const ze_result_t wrong = check(context)) {
    return wrong;
  }
  if (pointer == nullptr || properties == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  const allocation* const found = find_allocation(pointer);
  const bool known = found != nullptr && found->context == context;
  properties->type = known ? found->type : ZE_MEMORY_TYPE_UNKNOWN;
  properties->id = known ? found->id : 0;
  properties->pageSize = known ? page : 0;
  if (device != nullptr) {
    *device = known ? found->device : nullptr;
  }
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeMemGetAddressRange(ze_context_handle_t context, const void* pointer, void** start,
                                 std::size_t* bytes) {
  if (const ze_result_t wrong = check(context)) {
    return wrong;
  }
  const allocation* const found = find_allocation(pointer);
  if (found == nullptr || found->context != context) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  if (start != nullptr) {
    *start = found->start;
  }
  if (bytes != nullptr) {
    *bytes = found->bytes;
  }
  return ZE_RESULT_SUCCESS;
}

allocation* find_allocation(const void* pointer) {
  const auto* const place = static_cast<const char*>(pointer);
  auto after = driver().memory.upper_bound(place);
  if (after == driver().memory.begin()) {
    return nullptr;
  }
  allocation* const before = std::prev(after)->second;
  return place < before->start + before->bytes ? before : nullptr;
}

}  // namespace level_zero_driver
