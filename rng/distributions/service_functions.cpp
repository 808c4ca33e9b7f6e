// SPDX-License-Identifier: Apache-2.0
// The kernel that fills, in its pointer and its buffer form.
#include "distributions/service_functions.hpp"

#include "frame/kernel_launch.hpp"

namespace kestrel::tarn::rng::detail::gpu {

namespace {

template <typename Out>
struct single_num {
  Out out;
  std::int32_t value;

  SYCL_EXTERNAL void operator()(sycl::id<1> item) const { out[item[0]] = value; }
};

}  // namespace

template <typename Out>
sycl::event fill_single_num(sycl::queue& queue, std::int64_t n, Out out, std::int32_t value) {
  return queue.submit([&](sycl::handler& group) {
    auto bound = bind_output(group, out);
    group.parallel_for(sycl::range<1>(work_items(n, 1)), single_num<decltype(bound)>{bound, value});
  });
}

template sycl::event fill_single_num(sycl::queue&, std::int64_t, std::int32_t*, std::int32_t);
template sycl::event fill_single_num(sycl::queue&, std::int64_t, sycl::buffer<std::int32_t, 1>,
                                     std::int32_t);

}  // namespace kestrel::tarn::rng::detail::gpu
