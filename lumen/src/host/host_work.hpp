// SPDX-License-Identifier: Apache-2.0
// Commands done by the host's threads, on whatever device they are asked for.
#pragma once

#include <cstddef>

#include "../device_record.hpp"
#include "sycl/detail/command.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Null when there is not enough; given back by std::free.
void* allocate_host(std::size_t alignment, std::size_t bytes);
void copy_bytes(void* to, const void* from, std::size_t bytes);
// `count` copies of the pattern.
void fill_pattern(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count);
// Returns after the last item; throws what an item threw.
void run_kernel(const device_record& device, const launch_shape& shape, kernel_command& kernel);

}  // namespace detail
LUMEN_NAMESPACE_END
