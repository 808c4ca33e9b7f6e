// SPDX-License-Identifier: Apache-2.0
// The queues that suites over devices walk: one on each CPU and each GPU there is. Test programs
// run with a virtual GPU (see the environment in CMakeLists.txt); its absence is a failure.
#pragma once

#include <ostream>
#include <string>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace tarn_test {

struct named_queue {
  std::string name;
  sycl::queue queue;
};

inline void PrintTo(const named_queue& value, std::ostream* out) {
  *out << value.name;
}

inline sycl::queue cpu_queue() {
  return sycl::queue(sycl::cpu_selector_v);
}
inline sycl::queue gpu_queue() {
  return sycl::queue(sycl::gpu_selector_v);
}
inline sycl::queue accelerator_queue() {
  return sycl::queue(sycl::accelerator_selector_v);
}

inline std::vector<named_queue> all_queues() {
  std::vector<named_queue> queues;
  int number = 0;
  for (const sycl::device& device : sycl::device::get_devices()) {
    if (device.is_cpu() || device.is_gpu()) {
      queues.push_back(
          {(device.is_cpu() ? "cpu" : "gpu") + std::to_string(number++), sycl::queue(device)});
    }
  }
  return queues;
}

/// A fixture per queue.
class over_queues : public testing::TestWithParam<named_queue> {
 protected:
  sycl::queue queue() const { return GetParam().queue; }
};

inline std::string queue_name(const testing::TestParamInfo<named_queue>& info) {
  return info.param.name;
}

#define TARN_OVER_QUEUES(suite)                                                       \
  INSTANTIATE_TEST_SUITE_P(queues, suite, testing::ValuesIn(tarn_test::all_queues()), \
                           tarn_test::queue_name)

}  // namespace tarn_test
