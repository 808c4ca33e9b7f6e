// SPDX-License-Identifier: Apache-2.0
// The callback of OpenCL events.
#include "opencl_completion.hpp"

#include "interop.hpp"
#include "service/opencl_binding.hpp"
#include "statuses.hpp"

namespace kestrel::tarn::rng::detail::openmp {
namespace {

void CL_CALLBACK at_the_end(cl_event event, cl_int status, void* interop) {
  if (status == CL_COMPLETE) {
    complete(interop);
  }
  gpu::cl::clReleaseEvent(event);
}

}  // namespace

int complete_after(cl_event event, void* interop) {
  gpu::cl::clRetainEvent(event);
  if (gpu::cl::clSetEventCallback(event, CL_COMPLETE, at_the_end, interop) != CL_SUCCESS) {
    gpu::cl::clReleaseEvent(event);
    return no_device;
  }
  return done;
}

}  // namespace kestrel::tarn::rng::detail::openmp
