// SPDX-License-Identifier: Apache-2.0
// OpenCL counterparts of Level Zero devices, for what only OpenCL can do: compiling source.
#pragma once

#include <CL/cl.h>
#include <level_zero/ze_api.h>

namespace kestrel::tarn::gpu {

struct opencl_counterpart {
  cl_device_id device;  // null: there is none
  cl_context context;   // the table's own; lives until tarn_sycl_destructor
};

/// The first OpenCL GPU with the vendor and the clock rate of `device`, and a context over it; the
/// same for every later call. Two like devices have one OpenCL device, with a context for each. A
/// `*status` of 0 becomes -1 if there is none, -6 when memory is exhausted.
opencl_counterpart counterpart_of(int* status, ze_device_handle_t device);

}  // namespace kestrel::tarn::gpu
