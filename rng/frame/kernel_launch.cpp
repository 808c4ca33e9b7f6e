// SPDX-License-Identifier: Apache-2.0
// The one submission of engines whose state travels by value.
#include "frame/kernel_launch.hpp"

#include <cstring>

namespace kestrel::tarn::rng::detail {

sycl::event submit_with_snapshot(sycl::queue& queue, const std::vector<sycl::event>& dependencies,
                                 rvx_stream stream, std::uint64_t words,
                                 const kernel_launch& kernel) {
  return queue.submit([&](sycl::handler& group) {
    group.depends_on(dependencies);
    alignas(8) unsigned char record[max_record_size];
    std::memcpy(record, state_record(stream), kernel.record_size);
    skip_stream(stream, words);
    kernel.launch(group, kernel.context, record);
  });
}

}  // namespace kestrel::tarn::rng::detail
