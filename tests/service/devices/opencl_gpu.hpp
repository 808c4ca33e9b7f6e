// SPDX-License-Identifier: Apache-2.0
// A suite over the GPU that the OpenCL layer shows: the device tables begin empty, and every native
// object is given back.
#pragma once

#include <vector>

#include <gtest/gtest.h>

#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"

class OpenCLGpu : public testing::Test {
 protected:
  void SetUp() override {
    if (opencl_loader::find() == nullptr) {
      GTEST_SKIP() << "no OpenCL loader";
    }
    device = opencl_loader::first_gpu();
    if (device == nullptr) {
      GTEST_SKIP() << "no PoCL";
    }
    opencl_layer::reset();
    before = living();
  }
  void TearDown() override {
    if (device != nullptr) {
      opencl_layer::reset();
      EXPECT_EQ(living(), before);
    }
  }

  /// References to native objects of each kind.
  static std::vector<int> living() {
    std::vector<int> all;
    for (int kind = 0; kind <= static_cast<int>(opencl_layer::object::sub_device); ++kind) {
      all.push_back(opencl_layer::objects(static_cast<opencl_layer::object>(kind)));
    }
    return all;
  }

  template <typename T>
  T told(cl_device_info what) const {
    T value{};
    EXPECT_EQ(opencl_loader::get().clGetDeviceInfo(device, what, sizeof value, &value, nullptr),
              CL_SUCCESS);
    return value;
  }

  cl_device_id device = nullptr;
  std::vector<int> before;
};

/// A context and a queue over a device.
class opencl_queue {
 public:
  explicit opencl_queue(cl_device_id device) {
    const opencl_loader::functions& cl = opencl_loader::get();
    context_ = cl.clCreateContext(nullptr, 1, &device, nullptr, nullptr, nullptr);
    queue_ = cl.clCreateCommandQueueWithProperties(context_, device, nullptr, nullptr);
    EXPECT_NE(queue_, nullptr);
  }
  opencl_queue(const opencl_queue&) = delete;
  opencl_queue& operator=(const opencl_queue&) = delete;
  ~opencl_queue() {
    opencl_loader::get().clReleaseCommandQueue(queue_);
    opencl_loader::get().clReleaseContext(context_);
  }

  cl_command_queue get() const { return queue_; }
  cl_context context() const { return context_; }

 private:
  cl_context context_;
  cl_command_queue queue_;
};
