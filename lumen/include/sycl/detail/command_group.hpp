// SPDX-License-Identifier: Apache-2.0
// What a command group function leaves behind: the work, its launch sizes and all that the
// work must come after.
#pragma once

#include <cstddef>
#include <memory>
#include <vector>

#include "command.hpp"
#include "event.hpp"
#include "native_argument.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

class buffer_core;
class queue_core;
struct memory_place;

// The task keeps the memory, even of a buffer that dies inside its command group function.
struct access_request {
  std::shared_ptr<buffer_core> core;
  bool writes;
  bool keeps;                 // false: what was there before is not read
  const memory_place* place;  // whose copy is used; null: the host's
};

enum class work_kind : char { none, host, device };
// Whether later command groups of the queue come after this one, and this one after all earlier.
enum class fence_kind : char { none, after_dependencies, after_all };

struct command_group {
  queue_core* queue = nullptr;
  work_kind kind = work_kind::none;
  std::unique_ptr<command> work;
  launch_shape shape;
  std::size_t local_bytes = 0;
  fence_kind fence = fence_kind::none;
  std::vector<kernel_argument> arguments;  // of a native kernel
  std::vector<task_ref> dependencies;
  std::vector<access_request> accesses;
};

}  // namespace detail

LUMEN_NAMESPACE_END
