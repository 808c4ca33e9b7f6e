// SPDX-License-Identifier: Apache-2.0
// Level Zero devices and their answers to the device queries.
#pragma once

#include <memory>

#include "../device_record.hpp"
#include "level_zero_library.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Throws when the driver does not answer.
std::unique_ptr<platform_record> describe_platform(ze_driver_handle_t driver);

// Throws when the device does not answer.
std::unique_ptr<device_record> describe_device(ze_device_handle_t device,
                                               const platform_record& platform);

inline ze_device_handle_t handle_of(const device_record& device) {
  return static_cast<ze_device_handle_t>(device.native);
}

// Its sub-devices.
std::vector<ze_device_handle_t> parts_of(ze_device_handle_t device);

// The properties, with the timer's resolution in ticks a second (Level Zero 1.2).
ze_device_properties_t properties_of(ze_device_handle_t device);

// The first group of a device's queues that runs kernels.
struct queue_group {
  std::uint32_t ordinal;
  std::size_t largest_fill_pattern;  // bytes
};
queue_group computing_group(ze_device_handle_t device);

}  // namespace detail
LUMEN_NAMESPACE_END
