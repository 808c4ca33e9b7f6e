// SPDX-License-Identifier: Apache-2.0
// SYCL queues over the devices of the doubles, and what the services throw.
#pragma once

#include <optional>
#include <string>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "sycl_extensions.hpp"

/// The GPU number `index` of a backend; empty if there are fewer.
inline std::optional<sycl::device> gpu_of(kestrel::tarn::service::backend_code backend,
                                          std::size_t index = 0) {
  for (const sycl::device& device : sycl::device::get_devices(sycl::info::device_type::gpu)) {
    if (kestrel::tarn::service::code_of(device.get_backend()) == backend && index-- == 0) {
      return device;
    }
  }
  return std::nullopt;
}

/// A queue in a context of its own, which goes with it: default contexts live for ever.
inline sycl::queue queue_on(const sycl::device& device) {
  return sycl::queue(sycl::context(device), device);
}

/// `call` throws sycl::exception with this code and text.
template <typename Call>
void expect_error(sycl::errc code, const std::string& text, Call call) {
  try {
    call();
    ADD_FAILURE() << "no " << text;
  } catch (const sycl::exception& error) {
    EXPECT_EQ(error.code(), sycl::make_error_code(code)) << error.what();
    EXPECT_EQ(error.what(), text);
  }
}
