// SPDX-License-Identifier: Apache-2.0
// A Level Zero context, with what all its queues share: events, and a way to copy at once.
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include "../native.hpp"
#include "level_zero_devices.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Events that are used again and again, as making one is slow. Timed ones keep when the device
// signalled them.
class level_zero_events {
 public:
  level_zero_events(ze_context_handle_t context, bool timed) noexcept
      : context_(context), timed_(timed) {}

  // Not signalled.
  ze_event_handle_t take();
  // No command refers to it any more.
  void give_back(ze_event_handle_t event) noexcept;

 private:
  static constexpr std::uint32_t events_of_pool = 64;

  void add_event();

  const ze_context_handle_t context_;
  const bool timed_;
  std::mutex mutex_;
  std::vector<level_zero_object<ze_event_pool_handle_t>> pools_;
  std::uint32_t made_of_last_pool_ = events_of_pool;
  std::vector<level_zero_object<ze_event_handle_t>> all_;
  std::vector<ze_event_handle_t> free_;  // has room for all
};

class level_zero_context final : public native_context {
 public:
  explicit level_zero_context(level_zero_object<ze_context_handle_t> object) noexcept
      : object_(std::move(object)), plain_(object_.get(), false), timed_(object_.get(), true) {}

  void* handle() const noexcept override { return object_.get(); }
  ze_context_handle_t get() const noexcept { return object_.get(); }

  level_zero_events& events(bool timed) { return timed ? timed_ : plain_; }
  // Returns when the bytes are there.
  void copy(ze_device_handle_t device, void* to, const void* from, std::size_t bytes);

 private:
  ze_command_list_handle_t copying_list(ze_device_handle_t device);

  const level_zero_object<ze_context_handle_t> object_;
  level_zero_events plain_;
  level_zero_events timed_;
  std::mutex mutex_;
  std::map<ze_device_handle_t, level_zero_object<ze_command_list_handle_t>> copying_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
