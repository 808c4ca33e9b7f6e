// SPDX-License-Identifier: Apache-2.0
// The calls of OpenCL that this folder makes. Whoever binds the OpenCL library hands them in, so
// that nothing here is linked to it and tests can put others in their place.
#pragma once

#include <CL/cl.h>

namespace kestrel::tarn::forge {

/// Each member has the name and the type of the function that it stands for, and is never null.
struct opencl_calls {
  decltype(&::clGetDeviceInfo) clGetDeviceInfo;
  decltype(&::clCreateProgramWithSource) clCreateProgramWithSource;
  decltype(&::clCreateProgramWithBinary) clCreateProgramWithBinary;
  decltype(&::clBuildProgram) clBuildProgram;
  decltype(&::clGetProgramInfo) clGetProgramInfo;
  decltype(&::clReleaseProgram) clReleaseProgram;
};

}  // namespace kestrel::tarn::forge
