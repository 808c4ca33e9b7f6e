// SPDX-License-Identifier: Apache-2.0
// The kernels that the suites launch, and a suite in which they are native ones of a GPU that the
// OpenCL layer shows.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "../devices/opencl_gpu.hpp"

inline const char* const kernel_source = R"(
  struct three { uchar a, b, c; };
  kernel void add(global int* place, int value) { place[get_global_id(0)] += value; }
  kernel void twice(global int* place) { place[get_global_id(0)] *= 2; }
  kernel void nothing() {}
  kernel void scalars(global ulong* out, uchar a, ushort b, uint c, ulong d, ulong2 e) {
    out[0] = a; out[1] = b; out[2] = c; out[3] = d; out[4] = e.x; out[5] = e.y;
  }
  kernel void one_scalar(global ulong* out, ulong value) { *out = value; }
  kernel void three_bytes(global ulong* out, struct three value) {
    *out = value.a | value.b << 8 | value.c << 16;
  }
  kernel void copy(global const int* from, global int* to) {
    to[get_global_id(0)] = from[get_global_id(0)];
  }
  kernel void reverse_groups(global int* values, local int* scratch) {
    const size_t i = get_local_id(0);
    scratch[i] = values[get_global_id(0)];
    barrier(CLK_LOCAL_MEM_FENCE);
    values[get_global_id(0)] = scratch[get_local_size(0) - 1 - i];
  }
  kernel void positions(global ulong* out) {
    const size_t item = (get_global_id(2) * get_global_size(1) + get_global_id(1)) *
                        get_global_size(0) + get_global_id(0);
    for (int d = 0; d < 3; ++d) {
      out[9 * item + d] = get_global_id(d);
      out[9 * item + 3 + d] = get_local_size(d);
      out[9 * item + 6 + d] = get_global_size(d);
    }
  }
)";

/// What `positions` says of items in groups, sizes in OpenCL's order.
inline std::vector<std::uint64_t> expected_positions(const std::vector<std::size_t>& global,
                                                     const std::vector<std::size_t>& local) {
  std::size_t sizes[3] = {1, 1, 1};
  std::size_t groups[3] = {1, 1, 1};
  for (std::size_t d = 0; d < global.size(); ++d) {
    sizes[d] = global[d];
    groups[d] = local[d];
  }
  std::vector<std::uint64_t> all;
  for (std::size_t z = 0; z < sizes[2]; ++z) {
    for (std::size_t y = 0; y < sizes[1]; ++y) {
      for (std::size_t x = 0; x < sizes[0]; ++x) {
        all.insert(all.end(),
                   {x, y, z, groups[0], groups[1], groups[2], sizes[0], sizes[1], sizes[2]});
      }
    }
  }
  return all;
}

/// The program of the kernels in a context, until the end of the block.
class native_program {
 public:
  native_program(cl_context context, cl_device_id device) {
    const opencl_loader::functions& cl = opencl_loader::get();
    const char* text = kernel_source;
    program_ = cl.clCreateProgramWithSource(context, 1, &text, nullptr, nullptr);
    EXPECT_EQ(cl.clBuildProgram(program_, 1, &device, "", nullptr, nullptr), CL_SUCCESS);
  }
  native_program(const native_program&) = delete;
  native_program& operator=(const native_program&) = delete;
  ~native_program() { EXPECT_EQ(opencl_loader::get().clReleaseProgram(program_), CL_SUCCESS); }

  /// The caller's.
  cl_kernel kernel(const char* name) const {
    cl_int code = -1;
    cl_kernel made = opencl_loader::get().clCreateKernel(program_, name, &code);
    EXPECT_EQ(code, CL_SUCCESS) << name;
    return made;
  }

 private:
  cl_program program_;
};

/// OpenCL objects for a case of the C layer. What is asked of them is undone when it ends.
class c_launches : public OpenCLGpu {
 protected:
  void SetUp() override {
    OpenCLGpu::SetUp();
    if (!IsSkipped()) {
      queues_.emplace(device);
      program_.emplace(queues_->context(), device);
    }
  }
  void TearDown() override {
    opencl_layer::reset();
    for (cl_kernel kernel : kernels_) {
      EXPECT_EQ(cl().clReleaseKernel(kernel), CL_SUCCESS);
    }
    for (cl_mem buffer : buffers_) {
      EXPECT_EQ(cl().clReleaseMemObject(buffer), CL_SUCCESS);
    }
    program_.reset();
    queues_.reset();
    OpenCLGpu::TearDown();
  }

  static const opencl_loader::functions& cl() { return opencl_loader::get(); }
  cl_command_queue queue() const { return queues_->get(); }
  cl_context context() const { return queues_->context(); }

  cl_kernel kernel(const char* name) {
    kernels_.push_back(program_->kernel(name));
    return kernels_.back();
  }
  template <typename T>
  cl_mem buffer(std::vector<T> values) {
    cl_int code = -1;
    buffers_.push_back(cl().clCreateBuffer(context(), CL_MEM_COPY_HOST_PTR,
                                           values.size() * sizeof(T), values.data(), &code));
    EXPECT_EQ(code, CL_SUCCESS);
    return buffers_.back();
  }
  template <typename T>
  std::vector<T> contents(cl_mem buffer, std::size_t count) const {
    std::vector<T> values(count, T(77));
    EXPECT_EQ(cl().clEnqueueReadBuffer(queue(), buffer, CL_TRUE, 0, count * sizeof(T),
                                       values.data(), 0, nullptr, nullptr),
              CL_SUCCESS);
    return values;
  }
  static cl_int state_of(cl_event event) {
    cl_int state = CL_INVALID_EVENT;
    EXPECT_EQ(cl().clGetEventInfo(event, CL_EVENT_COMMAND_EXECUTION_STATUS, sizeof state, &state,
                                  nullptr),
              CL_SUCCESS);
    return state;
  }

 private:
  std::optional<opencl_queue> queues_;
  std::optional<native_program> program_;
  std::vector<cl_kernel> kernels_;
  std::vector<cl_mem> buffers_;
};
