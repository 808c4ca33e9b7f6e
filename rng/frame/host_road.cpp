// SPDX-License-Identifier: Apache-2.0
// The one submission of the host road, in its pointer and its buffer form.
#include "frame/host_road.hpp"

#include "sycl_portable.hpp"

namespace kestrel::tarn::rng::detail {

sycl::event run_host_call(sycl::queue& queue, const host_call& call, void* r,
                          const std::vector<sycl::event>& dependencies) {
  sycl::event event = queue.submit([&](sycl::handler& group) {
    group.depends_on(dependencies);
    service::host_task(group, [call, r] { call.run(call.distribution, call.stream, call.n, r); });
  });
  event.wait();
  return event;
}

template <typename T>
sycl::event run_host_call(sycl::queue& queue, const host_call& call, sycl::buffer<T, 1>& r,
                          const std::vector<sycl::event>& dependencies) {
  sycl::event event = queue.submit([&](sycl::handler& group) {
    group.depends_on(dependencies);
    const auto values = service::host_task_accessor(r, group);
    service::host_task(group, [call, values] {
      call.run(call.distribution, call.stream, call.n, service::pointer_of(values));
    });
  });
  event.wait();
  return event;
}

#define TARN_RESULT_TYPE(type)                                                               \
  template sycl::event run_host_call(sycl::queue&, const host_call&, sycl::buffer<type, 1>&, \
                                     const std::vector<sycl::event>&);
#include "result_types.def"

}  // namespace kestrel::tarn::rng::detail
