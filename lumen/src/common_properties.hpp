// SPDX-License-Identifier: Apache-2.0
// What all devices answer alike.
#pragma once

#include "device_record.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// The rest is for the backend to fill in.
device_properties common_properties();

}  // namespace detail
LUMEN_NAMESPACE_END
