// SPDX-License-Identifier: Apache-2.0
// Marks in Level Zero streams.
#include "level_zero_mark.hpp"

#include <algorithm>

#include "../clock.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {
constexpr int readings = 5;

// Both clocks at about one moment, and for how long the two differ from that. The host's is read
// first: times come out early by as much, and never lie in the future.
struct clock_reading {
  std::uint64_t host;
  std::uint64_t ticks;
  std::uint64_t lasted;
};
clock_reading read_clocks(ze_device_handle_t device) {
  clock_reading taken{now_nanoseconds(), 0, 0};
  std::uint64_t unused = 0;  // the host's time on a clock that differs between systems
  check_level_zero(ze().zeDeviceGetGlobalTimestamps(device, &unused, &taken.ticks),
                   "zeDeviceGetGlobalTimestamps");
  taken.lasted = now_nanoseconds() - taken.host;
  return taken;
}
}  // namespace

// The best of several readings (F. Cristian, Probabilistic clock synchronization, Distributed
// Computing 3, 1989).
device_clock read_clock(ze_device_handle_t device) {
  const ze_device_properties_t p = properties_of(device);
  const std::uint32_t bits = p.kernelTimestampValidBits;
  clock_reading best = read_clocks(device);
  for (int i = 1; i < readings; ++i) {
    const clock_reading another = read_clocks(device);
    best = another.lasted < best.lasted ? another : best;
  }
  return {1e9 / static_cast<double>(std::max<std::uint64_t>(1, p.timerResolution)),
          bits >= 64 ? UINT64_MAX : (std::uint64_t{1} << bits) - 1, best.host, best.ticks};
}

level_zero_mark::level_zero_mark(std::shared_ptr<level_zero_context> context,
                                 const std::optional<device_clock>& clock)
    : context_(std::move(context)), clock_(clock), event_(owner().take()) {}

level_zero_mark::~level_zero_mark() {
  owner().give_back(event_);
}

bool level_zero_mark::reached() noexcept {
  return ze().zeEventQueryStatus(event_) != ZE_RESULT_NOT_READY;
}

bool level_zero_mark::passed() const noexcept {
  return ze().zeEventQueryStatus(event_) == ZE_RESULT_SUCCESS;
}

void level_zero_mark::wait() {
  check_level_zero(ze().zeEventHostSynchronize(event_, UINT64_MAX), "zeEventHostSynchronize");
}

std::uint64_t level_zero_mark::time() {
  ze_kernel_timestamp_result_t times{};
  check_level_zero(ze().zeEventQueryKernelTimestamp(event_, &times), "zeEventQueryKernelTimestamp");
  return clock_.value().host_time(times.global.kernelEnd);
}

}  // namespace detail
LUMEN_NAMESPACE_END
