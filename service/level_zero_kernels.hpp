// SPDX-License-Identifier: Apache-2.0
// Modules and kernels of Level Zero as SYCL objects, which own them.
#pragma once

#include <memory>

#include "opencl_kernels.hpp"
#include "sycl_extensions.hpp"

namespace kestrel::tarn::gpu {

/// A module for a device, `device` its native handle. Device code is taken as such, all else as
/// SPIR-V. \throws forge::level_zero_error
service::kernel_bundle build_module(void* device, const sycl::context& context,
                                    const program_code& code);

/// \throws forge::level_zero_error; sycl::exception with errc::backend_mismatch for a bundle of
/// another backend
std::unique_ptr<service::kernel> create_kernel(const service::kernel_bundle& bundle,
                                               const sycl::context& context, const char* name);

}  // namespace kestrel::tarn::gpu
