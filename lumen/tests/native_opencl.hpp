// SPDX-License-Identifier: Apache-2.0
// What the suites of the OpenCL backend share: a driver's CPU that the layer for tests shows as a
// GPU, native objects, and the proof that every reference is given back.
#pragma once

#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "every_device.hpp"
#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"

constexpr auto opencl = sycl::backend::opencl;

inline std::vector<sycl::device> opencl_devices() {
  std::vector<sycl::device> found;
  for (const sycl::device& each : sycl::device::get_devices()) {
    if (each.get_backend() == opencl) {
      found.push_back(each);
    }
  }
  return found;
}

// A reference to a native object, given back at the end of scope.
template <typename Handle>
class native {
 public:
  native(Handle object, cl_int(CL_API_CALL* release)(Handle))
      : object_(object), release_(release) {}
  native(const native&) = delete;
  native& operator=(const native&) = delete;
  ~native() { EXPECT_EQ(release_(object_), CL_SUCCESS); }
  Handle get() const { return object_; }

 private:
  Handle object_;
  cl_int(CL_API_CALL* release_)(Handle);
};

class native_opencl : public testing::Test {
 protected:
  void SetUp() override {
    if (opencl_loader::find() == nullptr) {
      GTEST_SKIP() << "no OpenCL loader";
    }
    if (opencl_devices().empty()) {
      GTEST_SKIP() << "no PoCL";
    }
    before_ = counts();
  }
  void TearDown() override {
    if (!IsSkipped()) {
      opencl_layer::reset();
      expect_given_back();
    }
  }

  // Where a queue went before its commands were done, another thread of the runtime may still hold
  // one of them.
  void expect_given_back() const {
    for (int round = 0; round < 2000 && counts() != before_; ++round) {
      std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    EXPECT_EQ(counts(), before_);
  }
  // Of all kinds but sub-devices, whose records stay.
  static std::vector<int> counts() {
    std::vector<int> all;
    for (int kind = 0; kind < static_cast<int>(opencl_layer::object::sub_device); ++kind) {
      all.push_back(opencl_layer::objects(static_cast<opencl_layer::object>(kind)));
    }
    return all;
  }

  static const opencl_loader::functions& cl() { return opencl_loader::get(); }
  static sycl::device device() { return opencl_devices()[0]; }
  static cl_device_id id_of(const sycl::device& device) {
    const cl_device_id id = sycl::get_native<opencl>(device);
    EXPECT_EQ(cl().clReleaseDevice(id), CL_SUCCESS);
    return id;
  }

  static native<cl_context> native_context(const sycl::context& context) {
    return {sycl::get_native<opencl>(context), cl().clReleaseContext};
  }
  static native<cl_context> new_context(const std::vector<cl_device_id>& ids) {
    cl_int code = -1;
    cl_context made = cl().clCreateContext(nullptr, static_cast<cl_uint>(ids.size()), ids.data(),
                                           nullptr, nullptr, &code);
    EXPECT_EQ(code, CL_SUCCESS);
    return {made, cl().clReleaseContext};
  }
  static native<cl_command_queue> new_queue(cl_context context, cl_device_id id,
                                            cl_command_queue_properties wanted = 0) {
    const cl_queue_properties properties[] = {CL_QUEUE_PROPERTIES, wanted, 0};
    cl_int code = -1;
    cl_command_queue made = cl().clCreateCommandQueueWithProperties(context, id, properties, &code);
    EXPECT_EQ(code, CL_SUCCESS);
    return {made, cl().clReleaseCommandQueue};
  }
  static native<cl_program> new_program(cl_context context, const char* source) {
    cl_int code = -1;
    cl_program made = cl().clCreateProgramWithSource(context, 1, &source, nullptr, &code);
    EXPECT_EQ(code, CL_SUCCESS);
    EXPECT_EQ(cl().clBuildProgram(made, 0, nullptr, "-cl-std=CL3.0", nullptr, nullptr), CL_SUCCESS);
    return {made, cl().clReleaseProgram};
  }
  static native<cl_kernel> new_kernel(cl_program program, const char* name) {
    cl_int code = -1;
    cl_kernel made = cl().clCreateKernel(program, name, &code);
    EXPECT_EQ(code, CL_SUCCESS);
    return {made, cl().clReleaseKernel};
  }
  // A kernel of a program with nothing else.
  static sycl::kernel make_kernel(const sycl::context& context, const char* source,
                                  const char* name) {
    const native<cl_context> owner = native_context(context);
    const native<cl_program> program = new_program(owner.get(), source);
    const native<cl_kernel> kernel = new_kernel(program.get(), name);
    return sycl::make_kernel<opencl>(kernel.get(), context);
  }

 private:
  std::vector<int> before_;
};
