// SPDX-License-Identifier: Apache-2.0
// The few standard SYCL 2020 features that other implementations lack or get wrong, each behind
// one function with the standard form as the default. AdaptiveCpp (24.06) has no host_task and no
// target::host_task; its custom operation runs on the host in the same order.
#pragma once

#include <utility>

#include <sycl/sycl.hpp>

namespace kestrel::tarn::service {

#if defined(__ADAPTIVECPP__)

template <typename Task>
void host_task(sycl::handler& group, Task&& task) {
  group.AdaptiveCpp_enqueue_custom_operation([task](sycl::interop_handle&) { task(); });
}

template <typename T>
auto host_task_accessor(sycl::buffer<T, 1>& buffer, sycl::handler& group) {
  return sycl::accessor<T, 1, sycl::access_mode::read_write>(buffer, group);
}

#else

/// Runs `task` on the host when the command group's dependencies are met.
template <typename Task>
void host_task(sycl::handler& group, Task&& task) {
  group.host_task(std::forward<Task>(task));
}

/// An accessor that a host task writes through. Elements that the task leaves alone keep their
/// values, so the buffer's content is not dropped.
template <typename T>
auto host_task_accessor(sycl::buffer<T, 1>& buffer, sycl::handler& group) {
  return sycl::accessor<T, 1, sycl::access_mode::read_write, sycl::target::host_task>(buffer,
                                                                                      group);
}

#endif

/// The elements behind an accessor; null for an empty one.
template <typename Accessor>
auto* pointer_of(const Accessor& accessor) {
  return accessor.size() == 0 ? nullptr : &accessor[0];
}

}  // namespace kestrel::tarn::service
