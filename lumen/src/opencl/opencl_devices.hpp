// SPDX-License-Identifier: Apache-2.0
// OpenCL devices and their answers to the device queries.
#pragma once

#include <memory>

#include "../device_record.hpp"
#include "opencl_library.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Throws when the platform does not answer.
std::unique_ptr<platform_record> describe_platform(cl_platform_id id);

// Throws when the device does not answer what every version of OpenCL asks for; to questions of
// later versions a device without an answer has nothing.
std::unique_ptr<device_record> describe_device(cl_device_id id, const platform_record& platform);

// 300 for version 3.0.
int opencl_version(const device_record& device);

inline cl_device_id id_of(const device_record& device) {
  return static_cast<cl_device_id>(device.native);
}

}  // namespace detail
LUMEN_NAMESPACE_END
