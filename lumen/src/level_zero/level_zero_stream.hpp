// SPDX-License-Identifier: Apache-2.0
// Streams over Level Zero queues.
#pragma once

#include <memory>

#include "../backend.hpp"
#include "level_zero_context.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Over a queue of its own.
std::unique_ptr<command_stream> make_level_zero_stream(const memory_place& place, bool timed);
// Over a queue made elsewhere, which has to be of the group that lists are made for: the device's
// first one that runs kernels.
std::unique_ptr<command_stream> make_level_zero_stream(
    const memory_place& place, bool timed, level_zero_object<ze_command_queue_handle_t> queue);

inline level_zero_context& context_of(const memory_place& place) {
  return static_cast<level_zero_context&>(*place.context);
}

}  // namespace detail
LUMEN_NAMESPACE_END
