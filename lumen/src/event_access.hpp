// SPDX-License-Identifier: Apache-2.0
// The runtime's way between events and tasks.
#pragma once

#include <utility>

#include "sycl/detail/event.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

struct event_access {
  static event make(task_ref task) { return event(std::move(task)); }
  static const task_ref& task_of(const event& e) { return e.task_; }
};

}  // namespace detail
LUMEN_NAMESPACE_END
