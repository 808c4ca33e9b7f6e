// SPDX-License-Identifier: Apache-2.0
// The queues that suites over devices walk: one on each CPU and each GPU there is. Test programs
// run with a virtual GPU (see the environment in CMakeLists.txt); its absence is a failure. A CUDA
// device may be there or not: TARN_REPORTS_CUDA (drawing.hpp) says which.
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

inline std::vector<sycl::queue> gpu_queues() {
  std::vector<sycl::queue> queues;
  for (const sycl::device& device : sycl::device::get_devices(sycl::info::device_type::gpu)) {
    queues.emplace_back(device);
  }
  return queues;
}

inline bool is_cuda(const sycl::queue& queue) {
  return queue.get_backend() == sycl::backend::cuda;
}

inline std::vector<sycl::queue> gpu_queues_of(bool cuda) {
  std::vector<sycl::queue> queues;
  for (const sycl::queue& queue : gpu_queues()) {
    if (is_cuda(queue) == cuda) {
      queues.push_back(queue);
    }
  }
  return queues;
}

inline std::vector<sycl::queue> cuda_queues() {
  return gpu_queues_of(true);
}

/// The virtual GPUs, whose kernels run on the host, with its elementary functions: there a model
/// that the test computes with these gives the same bits, and with a device's own it need not.
inline std::vector<sycl::queue> host_run_gpu_queues() {
  return gpu_queues_of(false);
}
inline sycl::queue host_run_gpu_queue() {
  return host_run_gpu_queues().at(0);
}

/// A GPU for suites that need one: a CUDA device if there is one.
inline sycl::queue gpu_queue() {
  const std::vector<sycl::queue> cuda = cuda_queues();
  return cuda.empty() ? sycl::queue(sycl::gpu_selector_v) : cuda.front();
}

inline sycl::queue accelerator_queue() {
  return sycl::queue(sycl::accelerator_selector_v);
}

inline std::vector<named_queue> all_queues() {
  std::vector<named_queue> queues;
  int number = 0;
  for (const sycl::device& device : sycl::device::get_devices()) {
    if (device.is_cpu() || device.is_gpu()) {
      const sycl::queue queue(device);
      const char* kind = device.is_cpu() ? "cpu" : is_cuda(queue) ? "cuda" : "gpu";
      queues.push_back({kind + std::to_string(number++), queue});
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
