// SPDX-License-Identifier: Apache-2.0
// What the SYCL layer says of a kernel that cannot be had.
#pragma once

#include <cstdint>

#include <sycl/sycl.hpp>

#include "opencl_kernels.hpp"

namespace kestrel::tarn::gpu {

/// Whose kernel, for messages.
struct kernel_of_domain {
  std::int32_t domain;
  const char* name;  // may be null
};

/// Each for sycl::errc::runtime.
sycl::exception kernel_failure(const forge::opencl_error& error, const sycl::device& device,
                               const kernel_of_domain& kernel);
sycl::exception kernel_failure(const forge::level_zero_error& error, const sycl::device& device,
                               const kernel_of_domain& kernel);

/// Tells of a device without double precision, if that is likely to be the reason.
sycl::exception kernel_failure(const build_error& error, const sycl::device& device,
                               const kernel_of_domain& kernel);

}  // namespace kestrel::tarn::gpu
