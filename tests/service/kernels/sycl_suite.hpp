// SPDX-License-Identifier: Apache-2.0
// A suite over the SYCL layer: its tables begin empty, its clean-up empties them, and nothing
// native is left.
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include <kestrel/tarn/gpu/kernel.hpp>

#include "../devices/sycl_queues.hpp"
#include "clean_up.hpp"
#include "kernel_suite.hpp"
#include "tarn_gpu.h"
#include "tarn_sycl_device.hpp"
#include "tarn_sycl_kernel.hpp"

inline int arguments_of(const tarn_gpu_kernel_struct_t* handle) {
  return static_cast<int>(
      static_cast<const sycl::kernel*>(handle->kernel)->get_info<sycl::info::kernel::num_args>());
}

class SyclKernels : public OpenCLGpu {
 protected:
  using handle = tarn_gpu_kernel_struct_t*;
  using layer = kestrel::tarn::gpu::sycl_kernel_layer;
  static constexpr int marker = 77;

  void SetUp() override {
    OpenCLGpu::SetUp();
    if (!IsSkipped()) {
      tarn_sycl_destructor();
      kestrel::tarn::gpu::sycl_tables().clear();
      blocks = serv_memory::live_blocks();
      const std::optional<sycl::device> gpu = find_gpu();
      if (!gpu) {
        GTEST_SKIP() << "no GPU of the suite's backend";
      }
      before = living();
      queue.emplace(queue_on(*gpu));
      with_queue = living();
    }
  }
  void TearDown() override {
    if (!queue) {
      return;  // skipped
    }
    opencl_layer::reset();
    tarn_sycl_destructor();
    kestrel::tarn::gpu::sycl_tables().clear();
    EXPECT_EQ(serv_memory::live_blocks(), blocks);
    queue.reset();
    // Another thread of the runtime may hold a finished command for a moment.
    for (int round = 0; round < 5000 && living() != before; ++round) {
      std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    OpenCLGpu::TearDown();
    EXPECT_EQ(status, marker) << "this layer does not touch it";
  }
  virtual std::optional<sycl::device> find_gpu() {
    return gpu_of(kestrel::tarn::service::backend_code::opencl);
  }

  /// The queue's, without a reference.
  cl_context native_context() const {
    const cl_context found = sycl::get_native<sycl::backend::opencl>(queue->get_context());
    opencl_loader::get().clReleaseContext(found);
    return found;
  }
  static auto& cache() { return layer::cache(); }
  static std::string name_of_device(const sycl::queue& of) {
    return of.get_device().get_info<sycl::info::device::name>();
  }

  /// A kernel `name` from OpenCL C with so many arguments.
  handle get(const std::string& name, int arguments = 1, const char* options = "", int domain = 0) {
    return kestrel::tarn::gpu::get_OCL_kernel(
        &status, &*queue, domain, taking(name, arguments).c_str(), name.c_str(), options);
  }
  void release(handle kernel) { kestrel::tarn::gpu::release_kernel(&status, kernel); }

  /// The end of what is thrown for most failures.
  std::string place(const std::string& kernel) const {
    return "'" + name_of_device(*queue) + "'\nin kernel: " + kernel +
           "\ninternal error: kernel failed to build.\n";
  }
  template <typename Call>
  void expect_opencl_error(int code, const std::string& kernel, Call call) const {
    expect_error(sycl::errc::runtime,
                 "OpenCL error " + std::to_string(code) + "\nOn device: " + place(kernel), call);
  }

  static int builds() { return opencl_layer::calls("clBuildProgram"); }
  int programs() const { return held(opencl_layer::object::program); }
  int kernels() const { return held(opencl_layer::object::kernel); }
  int held(opencl_layer::object kind) const {
    return opencl_layer::objects(kind) - before[static_cast<std::size_t>(kind)];
  }

  std::optional<sycl::queue> queue;
  std::vector<int> with_queue;  // what lives beside it
  std::int64_t blocks = 0;
  int status = marker;
};
