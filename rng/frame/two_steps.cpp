// SPDX-License-Identifier: Apache-2.0
// The second step of a call in two steps, and the end of the words between.
#include "frame/two_steps.hpp"

#include "sycl_portable.hpp"

namespace kestrel::tarn::rng::detail {

sycl::event submit_second_step(sycl::queue& queue, const std::shared_ptr<drawn_words>& words,
                               const kernel_launch& kernel) {
  words->last_kernel = queue.submit([&](sycl::handler& group) {
    group.depends_on(words->last_kernel);
    kernel.launch(group, kernel.context, nullptr);
  });
  const sycl::event results = words->last_kernel;
  queue.submit([&](sycl::handler& group) {
    group.depends_on(results);
    service::host_task(group, [words] {});
  });
  return results;
}

}  // namespace kestrel::tarn::rng::detail
