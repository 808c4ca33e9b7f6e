// SPDX-License-Identifier: Apache-2.0
// From OpenCL C to the binary that a driver makes of it.
#pragma once

#include "bytes.hpp"
#include "opencl_calls.hpp"

namespace kestrel::tarn::forge {

/// Builds a program from its text and returns the binary for `device`, which belongs to `context`.
/// `source` and `options` end with NUL.
/// \throws opencl_error with the code of the call that failed, and with CL_INVALID_VALUE when the
///         program does not list the device.
byte_vector compile_program(const opencl_calls& opencl, cl_context context, cl_device_id device,
                            const char* source, const char* options);

/// Returns the binary for `device` of a program that has been built.
/// \throws opencl_error as compile_program does
byte_vector program_binary(const opencl_calls& opencl, cl_program program, cl_device_id device);

}  // namespace kestrel::tarn::forge
