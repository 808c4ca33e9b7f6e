// SPDX-License-Identifier: Apache-2.0
// The texts.
#include "kernel_failure.hpp"

#include <sstream>
#include <string>

#include "kernel_name.hpp"

namespace kestrel::tarn::gpu {
namespace {

sycl::exception failure(const std::string& text) {
  return sycl::exception(sycl::make_error_code(sycl::errc::runtime), text);
}

const char* name_of(const kernel_of_domain& kernel) {
  return kernel.name == nullptr ? "" : kernel.name;
}

/// From the device's name on.
std::string place_of(const sycl::device& device, const kernel_of_domain& kernel,
                     const char* between = "") {
  return "'" + device.get_info<sycl::info::device::name>() + "'" + between +
         "\nin kernel: " + full_kernel_name(kernel.domain, name_of(kernel)) +
         "\ninternal error: kernel failed to build.\n";
}

bool lacks_double(const sycl::device& device) {
  return device.get_info<sycl::info::device::double_fp_config>().empty();
}

}  // namespace

sycl::exception kernel_failure(const forge::opencl_error& error, const sycl::device& device,
                               const kernel_of_domain& kernel) {
  return failure("OpenCL error " + std::to_string(error.status) +
                 "\nOn device: " + place_of(device, kernel));
}

sycl::exception kernel_failure(const forge::level_zero_error& error, const sycl::device& device,
                               const kernel_of_domain& kernel) {
  std::ostringstream code;
  code << std::hex << error.status;
  return failure("Level-Zero error:" + code.str() + "\nOn device: " + place_of(device, kernel));
}

sycl::exception kernel_failure(const build_error& error, const sycl::device& device,
                               const kernel_of_domain& kernel) {
  if (error.status != CL_BUILD_PROGRAM_FAILURE || !lacks_double(device) ||
      !seems_double(kernel.domain, name_of(kernel))) {
    return kernel_failure(static_cast<const forge::opencl_error&>(error), device, kernel);
  }
  // A space stands after the device unless source was compiled; who reads the text knows it so.
  const char* const between = error.format == program_format::source ? "" : " ";
  return failure("error: double type is not supported on this device: " +
                 place_of(device, kernel, between));
}

}  // namespace kestrel::tarn::gpu
