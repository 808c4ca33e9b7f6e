// SPDX-License-Identifier: Apache-2.0
// Contexts.
#include "sycl/detail/context.hpp"

#include <algorithm>
#include <mutex>
#include <utility>

#include "backend.hpp"
#include "context_state.hpp"
#include "sycl/detail/buffer_core.hpp"
#include "sycl/detail/usm.hpp"

LUMEN_NAMESPACE_BEGIN

using detail::context_state;

context::context(const property_list& properties) : context(device(), properties) {}
context::context(async_handler handler, const property_list& properties)
    : context(device(), std::move(handler), properties) {}
context::context(const device& dev, const property_list& properties)
    : context(std::vector<device>{dev}, async_handler(), properties) {}
context::context(const device& dev, async_handler handler, const property_list& properties)
    : context(std::vector<device>{dev}, std::move(handler), properties) {}
context::context(const std::vector<device>& devices, const property_list& properties)
    : context(devices, async_handler(), properties) {}
context::context(const std::vector<device>& devices, async_handler handler, const property_list&)
    : state_(std::make_shared<context_state>()) {
  if (devices.empty()) {
    detail::throw_invalid("a context needs a device");
  }
  for (const device& dev : devices) {
    if (dev.get_platform() != devices.front().get_platform()) {
      detail::throw_invalid("the devices of a context must be of one platform");
    }
  }
  state_->devices = devices;
  state_->handler = std::move(handler);
  std::vector<const detail::device_record*> records;
  for (const device& dev : devices) {
    records.push_back(&detail::device_record::of(dev));
  }
  if (detail::native_platform* const platform = records.front()->driver->native()) {
    state_->native = platform->make_context(records);
  }
  state_->make_places();
}

backend context::get_backend() const noexcept {
  return state_->devices.front().get_backend();
}
platform context::get_platform() const {
  return state_->devices.front().get_platform();
}
std::vector<device> context::get_devices() const {
  return state_->devices;
}

template <>
LUMEN_EXPORT platform context::get_info<info::context::platform>() const {
  return get_platform();
}
template <>
LUMEN_EXPORT std::vector<device> context::get_info<info::context::devices>() const {
  return get_devices();
}
// All devices of one platform have the same abilities.
#define LUMEN_CONTEXT_INFO(name, type)                                            \
  template <>                                                                     \
  LUMEN_EXPORT std::vector<type> context::get_info<info::context::name>() const { \
    return state_->devices.front().get_info<info::device::name>();                \
  }
LUMEN_CONTEXT_INFO(atomic_memory_order_capabilities, memory_order)
LUMEN_CONTEXT_INFO(atomic_fence_order_capabilities, memory_order)
LUMEN_CONTEXT_INFO(atomic_memory_scope_capabilities, memory_scope)
LUMEN_CONTEXT_INFO(atomic_fence_scope_capabilities, memory_scope)
#undef LUMEN_CONTEXT_INFO

namespace detail {

void context_state::make_places() {
  for (const device& dev : devices) {
    const device_record& record = device_record::of(dev);
    places.push_back(record.place ? record.place : std::make_shared<memory_place>(record, native));
  }
}

const std::shared_ptr<memory_place>& context_state::place_of(const device& dev) const {
  const auto found = std::find(devices.begin(), devices.end(), dev);
  if (found == devices.end()) {
    throw_invalid("the device is not of the context");
  }
  return places[static_cast<std::size_t>(found - devices.begin())];
}

// Queues made from a device alone share one context a platform, which holds all its devices:
// memory allocated through one such queue is known to the others. A sub-device has a context of its
// own.
context default_context(const device& dev) {
  static std::mutex mutex;
  static auto& made = *new std::vector<context>;
  const platform owner = dev.get_platform();
  const std::vector<device> wanted =
      device_record::of(dev).parent == nullptr ? owner.get_devices() : std::vector<device>{dev};
  const std::lock_guard<std::mutex> lock(mutex);
  for (const context& each : made) {
    if (context_state::of(each).devices == wanted) {
      return each;
    }
  }
  made.emplace_back(wanted);
  return made.back();
}

device first_device(const context& ctx) {
  return context_state::of(ctx).devices.front();
}
}  // namespace detail

LUMEN_NAMESPACE_END
