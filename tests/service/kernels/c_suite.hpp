// SPDX-License-Identifier: Apache-2.0
// A suite over the C layer: its tables begin empty and are emptied, and nothing native is left.
#pragma once

#include <functional>
#include <optional>
#include <string>

#include "kernel_suite.hpp"
#include "tarn_gpu_int.hpp"
#include "tarn_gpu_kernel.hpp"

class CKernels : public OpenCLGpu {
 protected:
  using handle = tarn_gpu_kernel_struct_t*;
  using layer = kestrel::tarn::gpu::c_layer::kernel_layer;

  void SetUp() override {
    OpenCLGpu::SetUp();
    if (!IsSkipped()) {
      clean_up();
      blocks = serv_memory::live_blocks();
      queue_.emplace(device);
      before = living();
    }
  }
  void TearDown() override {
    if (queue_) {
      opencl_layer::reset();
      clean_up();
      EXPECT_EQ(serv_memory::live_blocks(), blocks);
    }
    OpenCLGpu::TearDown();
    queue_.reset();
  }

  static void clean_up() {
    int status = 0;
    kestrel::tarn::gpu::c_layer::clean_up(&status);
    EXPECT_EQ(status, 0);
  }
  static auto& cache() { return layer::cache(); }

  cl_command_queue queue() const { return queue_->get(); }
  cl_context context() const { return queue_->context(); }
  static int arguments_of(cl_kernel kernel) { return ::arguments_of(kernel); }
  static int arguments_of(handle kernel) {
    return ::arguments_of(static_cast<cl_kernel>(kernel->kernel));
  }

  /// A kernel `name` from OpenCL C with so many arguments; the calls are well.
  handle get(const std::string& name, int arguments, const char* options = "", int domain = 0) {
    const handle found = try_get(name, arguments, options, domain);
    EXPECT_EQ(status, 0) << name;
    EXPECT_NE(found, nullptr) << name;
    return found;
  }
  handle try_get(const std::string& name, int arguments, const char* options = "", int domain = 0) {
    return tarn_serv_gpu_get_OCL_kernel(&status, queue(), domain, taking(name, arguments).c_str(),
                                        name.c_str(), options);
  }
  void release(handle kernel) {
    tarn_serv_gpu_release_kernel(&status, kernel);
    EXPECT_EQ(status, 0);
  }

  /// The cache's entry of a program of domain 0; null if there is none.
  const auto* entry_of(const char* name, const std::string& key = "") const {
    return cache()
        .fetch({device, context(), TARN_GPU_BACKEND_OPENCL}, {0, name, {key.data(), key.size()}},
               false)
        .where;
  }

  static int builds() { return opencl_layer::calls("clBuildProgram"); }
  static int kernels_made() { return opencl_layer::calls("clCreateKernel"); }
  /// References that the case holds.
  int programs() const { return held(opencl_layer::object::program); }
  int kernels() const { return held(opencl_layer::object::kernel); }
  int held(opencl_layer::object kind) const {
    return opencl_layer::objects(kind) - before[static_cast<std::size_t>(kind)];
  }

  int status = 0;
  std::int64_t blocks = 0;

 private:
  std::optional<opencl_queue> queue_;
};
