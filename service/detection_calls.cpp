// SPDX-License-Identifier: Apache-2.0
// The record of the hardware detection's calls.
#include "detection_calls.hpp"

#include <tarn_level_zero.h>

#include "level_zero_binding.hpp"
#include "opencl_binding.hpp"

namespace kestrel::tarn::gpu {

const forge::detection_calls& bound_detection_calls() {
  static constexpr forge::detection_calls calls = {
      {cl::clGetDeviceInfo, cl::clCreateProgramWithSource, cl::clCreateProgramWithBinary,
       cl::clBuildProgram, cl::clGetProgramInfo, cl::clReleaseProgram},
      {tarn_zeDeviceGetProperties, tarn_zeModuleCreate, tarn_zeModuleGetNativeBinary,
       tarn_zeModuleDestroy}};
  return calls;
}

}  // namespace kestrel::tarn::gpu
