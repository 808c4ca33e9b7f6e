// SPDX-License-Identifier: Apache-2.0
// Events and immediate copies of a Level Zero context.
#include "level_zero_context.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

ze_event_handle_t level_zero_events::take() {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (free_.empty()) {
    add_event();
  }
  const ze_event_handle_t taken = free_.back();
  free_.pop_back();
  return taken;
}

void level_zero_events::add_event() {
  if (made_of_last_pool_ == events_of_pool) {
    ze_event_pool_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_EVENT_POOL_DESC;
    description.flags = ZE_EVENT_POOL_FLAG_HOST_VISIBLE;
    if (timed_) {
      description.flags |= ZE_EVENT_POOL_FLAG_KERNEL_TIMESTAMP;
    }
    description.count = events_of_pool;
    level_zero_object<ze_event_pool_handle_t> pool;
    check_level_zero(ze().zeEventPoolCreate(context_, &description, 0, nullptr, pool.place()),
                     "zeEventPoolCreate");
    pools_.push_back(std::move(pool));
    made_of_last_pool_ = 0;
  }
  free_.reserve(all_.size() + 1);
  ze_event_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_EVENT_DESC;
  description.index = made_of_last_pool_;
  // The host reads what the commands before it wrote, other queues of the device too.
  description.signal = ZE_EVENT_SCOPE_FLAG_HOST;
  description.wait = ZE_EVENT_SCOPE_FLAG_DEVICE;
  level_zero_object<ze_event_handle_t> event;
  check_level_zero(ze().zeEventCreate(pools_.back().get(), &description, event.place()),
                   "zeEventCreate");
  const ze_event_handle_t made = event.get();
  all_.push_back(std::move(event));
  ++made_of_last_pool_;
  free_.push_back(made);
}

// One that cannot be made as new stays with the others until the context goes.
void level_zero_events::give_back(ze_event_handle_t event) noexcept {
  if (ze().zeEventHostReset(event) == ZE_RESULT_SUCCESS) {
    const std::lock_guard<std::mutex> lock(mutex_);
    free_.push_back(event);
  }
}

void level_zero_context::copy(ze_device_handle_t device, void* to, const void* from,
                              std::size_t bytes) {
  if (bytes != 0) {
    const std::lock_guard<std::mutex> lock(mutex_);
    check_level_zero(ze().zeCommandListAppendMemoryCopy(copying_list(device), to, from, bytes,
                                                        nullptr, 0, nullptr),
                     "zeCommandListAppendMemoryCopy");
  }
}

ze_command_list_handle_t level_zero_context::copying_list(ze_device_handle_t device) {
  level_zero_object<ze_command_list_handle_t>& list = copying_[device];
  if (list.get() == nullptr) {
    ze_command_queue_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_COMMAND_QUEUE_DESC;
    description.ordinal = computing_group(device).ordinal;
    description.mode = ZE_COMMAND_QUEUE_MODE_SYNCHRONOUS;
    check_level_zero(ze().zeCommandListCreateImmediate(get(), device, &description, list.place()),
                     "zeCommandListCreateImmediate");
  }
  return list.get();
}

}  // namespace detail
LUMEN_NAMESPACE_END
