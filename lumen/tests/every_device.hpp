// SPDX-License-Identifier: Apache-2.0
// Runs a test on every device there is: TEST_P(suite, name) with a suite derived from
// on_every_device and LUMEN_ON_EVERY_DEVICE(suite). The device's number is in the test's name.
#pragma once

#include <string>

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

#define LUMEN_ON_EVERY_DEVICE(suite)                                                           \
  INSTANTIATE_TEST_SUITE_P(devices, suite,                                                     \
                           testing::Range(std::size_t{0}, sycl::device::get_devices().size()), \
                           device_label)

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
