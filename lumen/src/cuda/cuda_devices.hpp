// SPDX-License-Identifier: Apache-2.0
// What CUDA devices say of themselves.
#pragma once

#include <memory>
#include <vector>

#include "../device_record.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// In the order of their numbers; none where there is no driver.
std::vector<std::unique_ptr<device_record>> cuda_devices();

}  // namespace detail
LUMEN_NAMESPACE_END
