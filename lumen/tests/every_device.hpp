// SPDX-License-Identifier: Apache-2.0
// Runs a test on every device there is: TEST_P(suite, name) with a suite derived from
// on_every_device and LUMEN_ON_EVERY_DEVICE(suite). The device's number is in the test's name.
// Such suites compile as CUDA too: their kernels are functors at namespace scope, and what kernels
// write lies in buffers or USM. What only host threads can run (lambdas as kernels, exceptions in
// kernels, reductions) stands in host_*.cpp with LUMEN_ON_HOST_RUN_DEVICES(suite).
#pragma once

#include <algorithm>
#include <new>
#include <string>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

class on_every_device : public testing::TestWithParam<std::size_t> {
 protected:
  sycl::device device() const { return sycl::device::get_devices()[GetParam()]; }
  sycl::queue in_order() const { return sycl::queue(device(), sycl::property::queue::in_order()); }
};

inline std::string device_label(const testing::TestParamInfo<std::size_t>& number) {
  const sycl::device device = sycl::device::get_devices()[number.param];
  return std::to_string(number.param) + (device.is_cpu()   ? "_cpu"
                                         : device.is_gpu() ? "_gpu"
                                                           : "_accelerator");
}

// The numbers of the devices whose kernels run on host threads.
inline std::vector<std::size_t> host_run_devices() {
  const std::vector<sycl::device> devices = sycl::device::get_devices();
  std::vector<std::size_t> numbers;
  for (std::size_t i = 0; i < devices.size(); ++i) {
    if (devices[i].get_backend() == sycl::backend::host) {
      numbers.push_back(i);
    }
  }
  return numbers;
}

// True where kernels cannot reach ordinary host memory: buffers are copied to the device.
inline bool has_own_memory(const sycl::device& device) {
  return !device.get_info<sycl::info::device::host_unified_memory>();
}

#define LUMEN_ON_EVERY_DEVICE(suite)                                                           \
  INSTANTIATE_TEST_SUITE_P(devices, suite,                                                     \
                           testing::Range(std::size_t{0}, sycl::device::get_devices().size()), \
                           device_label)
#define LUMEN_ON_HOST_RUN_DEVICES(suite) \
  INSTANTIATE_TEST_SUITE_P(devices, suite, testing::ValuesIn(host_run_devices()), device_label)

// A test that says in the report whether this unit's kernels ran on a CUDA device as well.
#define LUMEN_REPORTS_CUDA(suite)                                    \
  TEST(suite##_on_cuda, a_kernel_of_this_unit_runs) {                \
    bool found = false;                                              \
    for (const sycl::device& device : sycl::device::get_devices()) { \
      if (device.get_backend() == sycl::backend::cuda) {             \
        found = true;                                                \
        sycl::queue(device).single_task(nothing()).wait_and_throw(); \
      }                                                              \
    }                                                                \
    if (!found) {                                                    \
      GTEST_SKIP() << "no CUDA device";                              \
    }                                                                \
  }

// A handler that appends the texts of asynchronous errors.
inline sycl::async_handler appends_to(std::vector<std::string>& texts) {
  return [&texts](sycl::exception_list errors) {
    for (const std::exception_ptr& error : errors) {
      try {
        std::rethrow_exception(error);
      } catch (const std::exception& known) {
        texts.push_back(known.what());
      }
    }
  };
}

// The error code of the sycl::exception that a call throws; success when it throws none.
template <typename Call>
sycl::errc code_of(const Call& call) {
  try {
    call();
  } catch (const sycl::exception& error) {
    return static_cast<sycl::errc>(error.code().value());
  }
  return sycl::errc::success;
}

// Elements that the host and the kernels of a queue's device both see, freed at the end of scope.
template <typename T>
class shared_array {
 public:
  shared_array(std::size_t size, const sycl::queue& q, const T& value = T())
      : place_(sycl::malloc_shared<T>(size, q)), size_(size), context_(q.get_context()) {
    if (place_ == nullptr) {
      throw std::bad_alloc();
    }
    std::fill_n(place_, size_, value);
  }
  shared_array(const shared_array&) = delete;
  shared_array& operator=(const shared_array&) = delete;
  ~shared_array() { sycl::free(place_, context_); }

  T* data() const { return place_; }
  std::size_t size() const { return size_; }
  T* begin() const { return place_; }
  T* end() const { return place_ + size_; }
  T& operator[](std::size_t i) const { return place_[i]; }
  std::vector<T> values() const { return std::vector<T>(begin(), end()); }

 private:
  T* place_;
  std::size_t size_;
  sycl::context context_;
};

// Each unit has its own: the launch of a kernel type that a C++ and a CUDA unit share would be
// whichever of the two the linker meets first.
namespace {
struct nothing {
  SYCL_EXTERNAL void operator()() const {}
  template <typename Item>
  SYCL_EXTERNAL void operator()(const Item&) const {}
};
}  // namespace
