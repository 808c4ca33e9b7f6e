// SPDX-License-Identifier: Apache-2.0
// A suite over the layer on OpenCL queues: a queue on the layer's GPU, and empty tables.
#pragma once

#include <optional>

#include <gtest/gtest.h>

#include "opencl_gpu.hpp"
#include "tarn_gpu.h"
#include "tarn_gpu_int.hpp"

namespace c_layer_test {

constexpr cl_device_info ip_version_query = 0x4250;
constexpr int marker = 77;

inline tarn_gpu_arch_t another_arch(tarn_gpu_arch_t expected) {
  return expected == TARN_GPU_ARCH_ELM ? TARN_GPU_ARCH_OAK : TARN_GPU_ARCH_ELM;
}

class CLayerTest : public OpenCLGpu {
 protected:
  void SetUp() override {
    OpenCLGpu::SetUp();
    if (!IsSkipped()) {
      kestrel::tarn::gpu::c_layer::tables().clear();
      queue_.emplace(device);
      before = living();
    }
  }
  void TearDown() override {
    OpenCLGpu::TearDown();
    kestrel::tarn::gpu::c_layer::tables().clear();
    queue_.reset();
  }

  cl_command_queue queue() const { return queue_->get(); }
  /// The device has this version and is new to the tables.
  void begin_with_version(cl_uint version) {
    opencl_layer::answer(ip_version_query, version);
    kestrel::tarn::gpu::c_layer::tables().clear();
  }
  static int compilations() { return opencl_layer::calls("clCreateProgramWithSource"); }

  tarn_gpu_arch_t arch() {
    int status = 0;
    const tarn_gpu_arch_t found = tarn_serv_gpu_get_architecture(&status, queue());
    EXPECT_EQ(status, 0);
    return found;
  }

 private:
  std::optional<opencl_queue> queue_;
};

}  // namespace c_layer_test
