// SPDX-License-Identifier: Apache-2.0
// Memory and commands of the host, on whatever device they are asked for.
#pragma once

#include <cstddef>

#include "../backend.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Backends whose devices have their memory in the host's.
class host_memory_driver : public backend_driver {
 public:
  void* allocate(const memory_place& place, usm::alloc kind, std::size_t alignment,
                 std::size_t bytes) override;
  void release(const memory_place& place, usm::alloc kind, void* pointer) noexcept override;
  void copy(const memory_place& place, void* to, const void* from, std::size_t bytes) override;
};

void copy_bytes(void* to, const void* from, std::size_t bytes);
// `count` copies of the pattern.
void fill_pattern(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count);
// Returns after the last item; throws what an item threw.
void run_kernel(const device_record& device, const launch_shape& shape, kernel_command& kernel);

}  // namespace detail
LUMEN_NAMESPACE_END
