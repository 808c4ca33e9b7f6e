// SPDX-License-Identifier: Apache-2.0
// Marks in Level Zero streams, and the device's clock that they are read from.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>

#include "../backend.hpp"
#include "level_zero_context.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// How a device's times turn into the host's: both clocks at one moment. The device's times wrap
// around (32 bits of 50 ns after 214 s), so the moment has to be before them, and not too long.
struct device_clock {
  double nanoseconds;  // of a tick
  std::uint64_t mask;  // of the bits that times have
  std::uint64_t host;
  std::uint64_t ticks;

  std::uint64_t host_time(std::uint64_t device_time) const {
    const auto passed = static_cast<double>((device_time - ticks) & mask);
    return host + static_cast<std::uint64_t>(passed * nanoseconds);
  }
};
device_clock read_clock(ze_device_handle_t device);

// An event. Batches of commands whose lists name it keep the mark.
class level_zero_mark final : public stream_mark,
                              public std::enable_shared_from_this<level_zero_mark> {
 public:
  // With a clock where times are kept.
  level_zero_mark(std::shared_ptr<level_zero_context> context,
                  const std::optional<device_clock>& clock);
  ~level_zero_mark() override;

  // A failure counts as the end: wait tells of it.
  bool reached() noexcept override;
  void wait() override;
  std::uint64_t time() override;
  void* native_handle() const noexcept override { return event_; }

  ze_event_handle_t event() const noexcept { return event_; }
  // Whether the device is surely done with all before it.
  bool passed() const noexcept;

 private:
  level_zero_events& owner() const { return context_->events(clock_.has_value()); }

  const std::shared_ptr<level_zero_context> context_;
  const std::optional<device_clock> clock_;
  const ze_event_handle_t event_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
