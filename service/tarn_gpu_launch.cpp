// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on OpenCL queues: arguments, launches, memory, events.
#include "tarn_gpu_launch.h"

#include "event_list.hpp"
#include "first_status.hpp"
#include "kernel_argument.hpp"
#include "opencl_binding.hpp"
#include "tarn_gpu.h"

using namespace kestrel::tarn::gpu;

namespace {

struct wait_list {
  cl_uint count = 0;
  const cl_event* events = nullptr;  // OpenCL wants null where there are none

  explicit wait_list(const tarn_gpu_event_list_t* list) {
    if (has_events(list)) {
      count = static_cast<cl_uint>(list->count);
      events = events_of<cl_event>(*list);
    }
  }
};

/// An OpenCL code. A kind says nothing here: all values go in as they stand in their records.
cl_int set_arguments(cl_kernel kernel, const tarn_gpu_argument_t* args) {
  cl_uint count = 0;
  cl_int code = cl::clGetKernelInfo(kernel, CL_KERNEL_NUM_ARGS, sizeof count, &count, nullptr);
  for (cl_uint i = 0; code == CL_SUCCESS && i < count; ++i) {
    code = cl::clSetKernelArg(kernel, i, args[i].size, &args[i]);
  }
  return code;
}

cl_event launch(int* status, cl_command_queue queue, cl_kernel kernel,
                const tarn_gpu_argument_t* args, cl_uint dimensions, const std::size_t* global,
                const std::size_t* local, const tarn_gpu_event_list_t* events) {
  cl_event launched = nullptr;
  cl_int code = set_arguments(kernel, args);
  if (code == CL_SUCCESS) {
    const wait_list before(events);
    code = cl::clEnqueueNDRangeKernel(queue, kernel, dimensions, nullptr, global, local,
                                      before.count, before.events, &launched);
  }
  keep_first(status, code);
  return code == CL_SUCCESS ? launched : nullptr;
}

/// Complete when this returns, an OpenCL code.
cl_int fill_with_zeros(cl_command_queue queue, cl_mem buffer, std::size_t size) {
  const unsigned char zero = 0;
  const cl_int code =
      cl::clEnqueueFillBuffer(queue, buffer, &zero, sizeof zero, 0, size, 0, nullptr, nullptr);
  return code == CL_SUCCESS ? cl::clFinish(queue) : code;
}

cl_int release_in_order(const wait_list& consumed) {
  cl_int code = CL_SUCCESS;
  for (cl_uint i = 0; code == CL_SUCCESS && i < consumed.count; ++i) {
    code = cl::clReleaseEvent(consumed.events[i]);
  }
  return code;
}

}  // namespace

void tarn_serv_gpu_set_buffer_arg(tarn_gpu_argument_t* arg, cl_mem buffer,
                                  tarn_gpu_access_t access) {
  fill_buffer(*arg, buffer, access);
}

void tarn_gpu_set_usm_arg(tarn_gpu_argument_t* arg, const void* pointer) {
  fill_pointer(*arg, pointer);
}

void tarn_serv_gpu_set_SLM_arg(tarn_gpu_argument_t* arg, std::size_t bytes) {
  fill_local(*arg, bytes);
}

void tarn_serv_gpu_set_scalar_arg_internal(tarn_gpu_argument_t* arg, const void* value, int size) {
  fill_scalar(*arg, value, size < 0 ? sizeof arg->value : static_cast<std::size_t>(size));
}

cl_event tarn_serv_gpu_launch_kernel_1D(int* status, cl_command_queue queue, cl_kernel kernel,
                                        const tarn_gpu_argument_t* args, std::size_t global,
                                        std::size_t local, const tarn_gpu_event_list_t* events) {
  return launch(status, queue, kernel, args, 1, &global, &local, events);
}

cl_event tarn_serv_gpu_launch_kernel_2D(int* status, cl_command_queue queue, cl_kernel kernel,
                                        const tarn_gpu_argument_t* args, const std::size_t* global,
                                        const std::size_t* local,
                                        const tarn_gpu_event_list_t* events) {
  return launch(status, queue, kernel, args, 2, global, local, events);
}

cl_event tarn_serv_gpu_launch_kernel_3D(int* status, cl_command_queue queue, cl_kernel kernel,
                                        const tarn_gpu_argument_t* args, const std::size_t* global,
                                        const std::size_t* local,
                                        const tarn_gpu_event_list_t* events) {
  return launch(status, queue, kernel, args, 3, global, local, events);
}

cl_mem tarn_serv_gpu_alloc_temp_buffer(int* status, cl_command_queue queue, std::size_t size) {
  int code = CL_SUCCESS;
  cl_context context = nullptr;
  cl_mem buffer = nullptr;
  tarn_gpu_get_cl_device_context(&code, queue, nullptr, &context);
  if (code == CL_SUCCESS) {
    buffer = cl::clCreateBuffer(context, CL_MEM_READ_WRITE, size, nullptr, &code);
  }
  keep_first(status, code);
  return buffer;
}

cl_mem tarn_serv_gpu_calloc_temp_buffer(int* status, cl_command_queue queue, std::size_t size) {
  cl_mem buffer = tarn_serv_gpu_alloc_temp_buffer(status, queue, size);
  if (buffer == nullptr) {
    return nullptr;
  }
  const cl_int code = fill_with_zeros(queue, buffer, size);
  if (code != CL_SUCCESS) {
    keep_first(status, code);
    static_cast<void>(cl::clReleaseMemObject(buffer));
    return nullptr;
  }
  return buffer;
}

void tarn_serv_gpu_free_buffer(int* status, cl_mem buffer) {
  keep_first(status, cl::clReleaseMemObject(buffer));
}

cl_event tarn_serv_gpu_coalesce_events(int* status, cl_command_queue queue,
                                       const tarn_gpu_event_list_t* events) {
  const wait_list consumed(events);
  cl_event all = nullptr;
  cl_int code = cl::clEnqueueMarkerWithWaitList(queue, consumed.count, consumed.events, &all);
  if (code != CL_SUCCESS) {
    keep_first(status, code);
    return nullptr;
  }
  code = release_in_order(consumed);
  if (code != CL_SUCCESS) {
    keep_first(status, code);
    static_cast<void>(cl::clReleaseEvent(all));
    return nullptr;
  }
  return all;
}

void tarn_serv_gpu_release_event(int* status, cl_event event) {
  if (event != nullptr) {
    keep_first(status, cl::clReleaseEvent(event));
  }
}

void tarn_serv_gpu_host_wait(int* status, cl_event event) {
  keep_first(status, cl::clWaitForEvents(1, &event));
}
