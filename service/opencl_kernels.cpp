// SPDX-License-Identifier: Apache-2.0
// Programs and kernels of OpenCL.
#include "opencl_kernels.hpp"

#include "detection_calls.hpp"
#include "opencl_binding.hpp"
#include "opencl_program.hpp"

namespace kestrel::tarn::gpu {
namespace {

cl_program create_program(cl_device_id device, cl_context context, const program_code& code,
                          cl_int* status) {
  const auto* bytes = static_cast<const unsigned char*>(code.data);
  switch (code.format) {
    case program_format::binary:
      return cl::clCreateProgramWithBinary(context, 1, &device, &code.size, &bytes, nullptr,
                                           status);
    case program_format::spirv:
      return cl::clCreateProgramWithIL(context, code.data, code.size, status);
    default: {
      auto* text = static_cast<const char*>(code.data);
      return cl::clCreateProgramWithSource(context, 1, &text, nullptr, status);
    }
  }
}

}  // namespace

cl_int release_object(cl_program program) {
  return cl::clReleaseProgram(program);
}

cl_int release_object(cl_kernel kernel) {
  return cl::clReleaseKernel(kernel);
}

opencl_program shared_program(const opencl_program& program) {
  check_opencl(cl::clRetainProgram(program.get()));
  return opencl_program(program.get());
}

opencl_program build_program(cl_device_id device, cl_context context, const program_code& code) {
  cl_int status = CL_SUCCESS;
  const cl_program made = create_program(device, context, code, &status);
  check_opencl(status);
  opencl_program program(made);
  status = cl::clBuildProgram(made, 1, &device, code.options, nullptr, nullptr);
  if (status != CL_SUCCESS) {
    throw build_error(status, code.format);
  }
  return program;
}

opencl_kernel create_kernel(const opencl_program& program, const char* name) {
  cl_int status = CL_SUCCESS;
  const cl_kernel made = cl::clCreateKernel(program.get(), name, &status);
  check_opencl(status);
  return opencl_kernel(made);
}

forge::byte_vector binary_of(const opencl_program& program, cl_device_id device) {
  return forge::program_binary(bound_detection_calls().opencl, program.get(), device);
}

}  // namespace kestrel::tarn::gpu
