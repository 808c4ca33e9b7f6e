// SPDX-License-Identifier: Apache-2.0
// Events over tasks.
#include "sycl/detail/event.hpp"

#include "event_access.hpp"
#include "queue_core.hpp"
#include "task.hpp"

LUMEN_NAMESPACE_BEGIN

backend event::get_backend() const noexcept {
  return task_ && task_->queue() ? task_->queue()->dev.get_backend() : backend::host;
}
void event::wait() {
  if (task_) {
    task_->wait();
  }
}
void event::wait(const std::vector<event>& events) {
  for (event e : events) {
    e.wait();
  }
}
void event::wait_and_throw() {
  wait_and_throw({*this});
}
void event::wait_and_throw(const std::vector<event>& events) {
  wait(events);
  for (const event& e : events) {
    if (e.task_ && e.task_->queue()) {
      e.task_->queue()->throw_asynchronous();
    }
  }
}

std::vector<event> event::get_wait_list() {
  std::vector<event> result;
  if (task_) {
    for (detail::task_ref& dependency : task_->dependencies()) {
      result.push_back(detail::event_access::make(std::move(dependency)));
    }
  }
  return result;
}

template <>
LUMEN_EXPORT info::event_command_status event::get_info<info::event::command_execution_status>()
    const {
  if (!task_) {
    return info::event_command_status::complete;
  }
  switch (task_->state()) {
    case detail::task_state::running:
    case detail::task_state::issued:
      return info::event_command_status::running;
    case detail::task_state::done:
      return info::event_command_status::complete;
    default:
      return info::event_command_status::submitted;
  }
}

namespace {
detail::task& profiled(const detail::task_ref& task) {
  if (!task || !task->queue() || !task->queue()->profiling) {
    throw exception(make_error_code(errc::invalid),
                    "the event's queue was made without property::queue::enable_profiling");
  }
  return *task.get();
}
}  // namespace

template <>
LUMEN_EXPORT std::uint64_t event::get_profiling_info<info::event_profiling::command_submit>()
    const {
  return profiled(task_).submit_time;
}
template <>
LUMEN_EXPORT std::uint64_t event::get_profiling_info<info::event_profiling::command_start>() const {
  detail::task& task = profiled(task_);
  task.wait();
  return task.start_time;
}
template <>
LUMEN_EXPORT std::uint64_t event::get_profiling_info<info::event_profiling::command_end>() const {
  detail::task& task = profiled(task_);
  task.wait();
  return task.end_time;
}

LUMEN_NAMESPACE_END
