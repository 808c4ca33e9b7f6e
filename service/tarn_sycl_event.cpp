// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on SYCL queues: events, each an object on the heap that is its
// caller's.
#include <memory>

#include "event_list.hpp"
#include "kestrel/tarn/gpu/launch.hpp"
#include "sycl_extensions.hpp"
#include "tarn_sycl_launch_kernel.hpp"

namespace kestrel::tarn::gpu {
namespace {

sycl::event* coalesce(sycl::queue& queue, const tarn_gpu_event_list_t* list, memory_family family) {
  auto all = std::make_unique<sycl::event>();
  const std::vector<sycl::event> events = copy_events(list, family);
  if (!events.empty()) {
    for (std::size_t i = 0; i < events.size(); ++i) {
      delete events_of<sycl::event*>(*list)[i];
    }
    *all = service::submit_barrier(queue, events);
  }
  return all.release();
}

}  // namespace

sycl::event* coalesce_events(int*, sycl::queue* queue, const tarn_gpu_event_list_t* events) {
  return coalesce(*queue, events, memory_family::buffers);
}

sycl::event* coalesce_events_usm(int*, sycl::queue* queue, const tarn_gpu_event_list_t* events) {
  return coalesce(*queue, events, memory_family::shared);
}

void release_event(int*, sycl::event* event) {
  delete event;
}

void release_event_usm(int* status, sycl::event* event) {
  release_event(status, event);
}

void host_wait(int*, sycl::event* event) {
  event->wait();
}

void host_wait_usm(int* status, sycl::event* event) {
  host_wait(status, event);
}

}  // namespace kestrel::tarn::gpu
