// SPDX-License-Identifier: Apache-2.0
// What the host says of itself, and the virtual devices that are made in its image.
#pragma once

#include <memory>
#include <vector>

#include "../device_record.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// The host CPU first, then the devices of LUMEN_VIRTUAL_DEVICES that share its memory, in their
// order.
std::vector<std::unique_ptr<device_record>> host_devices();
// Those with memory of their own.
std::vector<std::unique_ptr<device_record>> detached_devices();

}  // namespace detail
LUMEN_NAMESPACE_END
