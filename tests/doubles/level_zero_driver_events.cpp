// SPDX-License-Identifier: Apache-2.0
// Event pools and events.
#include "level_zero_driver_state.hpp"

namespace level_zero_driver {

namespace {

// A time of an event as a kernel's clock shows it, which wraps around early.
std::uint64_t kernel_time(ze_device_handle_t device, std::uint64_t ticks) {
  const std::uint32_t bits = device->description.kernel_timestamp_bits;
  return bits >= 64 ? ticks : ticks & ((std::uint64_t{1} << bits) - 1);
}

}  // namespace

ze_result_t zeEventPoolCreate(ze_context_handle_t context, const ze_event_pool_desc_t* description,
                              std::uint32_t count, ze_device_handle_t* devices,
                              ze_event_pool_handle_t* pool) {
  if (const ze_result_t wrong = check(context)) {
    return wrong;
  }
  if (description == nullptr || pool == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (description->count == 0 || (count == 0) != (devices == nullptr)) {
    return ZE_RESULT_ERROR_INVALID_SIZE;
  }
  for (std::uint32_t i = 0; i < count; ++i) {
    if (const ze_result_t wrong = check(devices[i])) {
      return wrong;
    }
  }
  auto* const made = make<ze_event_pool_handle_t>({context});
  made->context = context;
  made->timed = (description->flags & ZE_EVENT_POOL_FLAG_KERNEL_TIMESTAMP) != 0;
  made->visible = (description->flags & ZE_EVENT_POOL_FLAG_HOST_VISIBLE) != 0;
  made->taken.resize(description->count);
  *pool = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeEventPoolDestroy(ze_event_pool_handle_t pool) {
  return destroy(pool);
}

ze_result_t zeEventCreate(ze_event_pool_handle_t pool, const ze_event_desc_t* description,
                          ze_event_handle_t* event) {
  if (const ze_result_t wrong = check(pool)) {
    return wrong;
  }
  if (description == nullptr || event == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (description->index >= pool->taken.size() || pool->taken[description->index]) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  auto* const made = make<ze_event_handle_t>({pool});
  made->pool = pool;
  made->index = description->index;
  pool->taken[made->index] = true;
  *event = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeEventDestroy(ze_event_handle_t event) {
  if (const ze_result_t wrong = check(event)) {
    return wrong;
  }
  const ze_event_pool_handle_t pool = event->pool;
  const std::uint32_t index = event->index;
  const ze_result_t result = destroy(event);
  if (result == ZE_RESULT_SUCCESS) {
    pool->taken[index] = false;
  }
  return result;
}

ze_result_t zeEventHostSignal(ze_event_handle_t event) {
  if (const ze_result_t wrong = check(event)) {
    return wrong;
  }
  event->signalled = true;
  advance();
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeEventHostSynchronize(ze_event_handle_t event, std::uint64_t timeout) {
  if (const ze_result_t wrong = check(event)) {
    return wrong;
  }
  if (!event->pool->visible) {
    return ZE_RESULT_ERROR_INVALID_SYNCHRONIZATION_OBJECT;
  }
  return wait_until(timeout, [event] { return event->signalled; });
}

ze_result_t zeEventQueryStatus(ze_event_handle_t event) {
  if (const ze_result_t wrong = check(event)) {
    return wrong;
  }
  if (!event->pool->visible) {
    return ZE_RESULT_ERROR_INVALID_SYNCHRONIZATION_OBJECT;
  }
  return event->signalled ? ZE_RESULT_SUCCESS : ZE_RESULT_NOT_READY;
}

ze_result_t zeEventHostReset(ze_event_handle_t event) {
  if (const ze_result_t wrong = check(event)) {
    return wrong;
  }
  event->signalled = false;
  event->device = nullptr;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeEventQueryKernelTimestamp(ze_event_handle_t event,
                                        ze_kernel_timestamp_result_t* times) {
  if (const ze_result_t wrong = check(event)) {
    return wrong;
  }
  if (times == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (!event->pool->timed) {
    return ZE_RESULT_ERROR_INVALID_SYNCHRONIZATION_OBJECT;
  }
  // No command has signalled it.
  if (!event->signalled || event->device == nullptr) {
    return ZE_RESULT_NOT_READY;
  }
  times->global.kernelStart = times->context.kernelStart = kernel_time(event->device, event->start);
  times->global.kernelEnd = times->context.kernelEnd = kernel_time(event->device, event->end);
  return ZE_RESULT_SUCCESS;
}

}  // namespace level_zero_driver
