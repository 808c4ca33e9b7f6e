// SPDX-License-Identifier: Apache-2.0
// event (SYCL 2020, section 4.6.6): the fate of one submitted task. A waiter helps: waiting for
// a task that is ready but not yet started runs it on the calling thread.
#pragma once

#include <cstdint>
#include <vector>

#include "device.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
class task;
// Owning reference to a task, counted inside the task.
class LUMEN_EXPORT task_ref {
 public:
  task_ref() = default;
  // Takes over one count.
  explicit task_ref(task* owned) noexcept : task_(owned) {}
  task_ref(const task_ref& other) noexcept;
  task_ref(task_ref&& other) noexcept : task_(other.task_) { other.task_ = nullptr; }
  task_ref& operator=(task_ref other) noexcept {
    task* mine = task_;
    task_ = other.task_;
    other.task_ = mine;
    return *this;
  }
  ~task_ref() {
    if (task_ != nullptr) {
      release();
    }
  }
  task* get() const noexcept { return task_; }
  task* operator->() const noexcept { return task_; }
  explicit operator bool() const noexcept { return task_ != nullptr; }

 private:
  void release() noexcept;
  task* task_ = nullptr;
};
struct event_access;
}  // namespace detail

class LUMEN_EXPORT event {
 public:
  // An event that is already complete.
  event() = default;

  void wait();
  static void wait(const std::vector<event>& events);
  // Waits, then hands the queue's asynchronous errors to its handler.
  void wait_and_throw();
  static void wait_and_throw(const std::vector<event>& events);
  // The direct dependencies of a task that has not completed.
  std::vector<event> get_wait_list();
  // The host's for an event that is already complete.
  sycl::backend get_backend() const noexcept;
  template <typename Param>
  typename Param::return_type get_info() const;
  // Throws errc::invalid when the queue lacks property::queue::enable_profiling.
  template <typename Param>
  typename Param::return_type get_profiling_info() const;

  friend bool operator==(const event& a, const event& b) { return a.task_.get() == b.task_.get(); }
  friend bool operator!=(const event& a, const event& b) { return !(a == b); }

 private:
  friend struct detail::event_access;
  friend struct std::hash<event>;
  explicit event(detail::task_ref task) : task_(std::move(task)) {}
  detail::task_ref task_;
};

LUMEN_NAMESPACE_END

namespace std {
template <>
struct hash<sycl::event> {
  size_t operator()(const sycl::event& e) const noexcept {
    return hash<const void*>()(e.task_.get());
  }
};
}  // namespace std
