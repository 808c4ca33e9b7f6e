// SPDX-License-Identifier: Apache-2.0
// Interop objects over OpenCL's own queues. The entries take them; where the SYCL implementation
// has no kernels for such a device, its refusal is told and the stream has not moved.
#include <cstdint>
#include <cstdlib>
#include <string>
#include <tarn_rvx_offload.h>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "caller_stream.hpp"
#include "gpu_interop.hpp"
#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"

namespace {

using namespace tarn_test;

class offload_opencl : public testing::Test {
 protected:
  void SetUp() override {
    device_ = opencl_loader::first_gpu();
    if (device_ == nullptr) {
      GTEST_SKIP() << "no PoCL";
    }
    context_ = cl().clCreateContext(nullptr, 1, &device_, nullptr, nullptr, nullptr);
    queue_ = cl().clCreateCommandQueueWithProperties(context_, device_, nullptr, nullptr);
    ASSERT_NE(queue_, nullptr);
    interop_.set_int(id_property, opencl_id);
    interop_.set_nowait(false);
    interop_.set_native(kind_property, reinterpret_cast<void*>(std::uintptr_t{1}));
    interop_.set_native(device_property, device_);
    interop_.set_native(context_property, context_);
    interop_.set_native(queue_property, queue_);
  }
  void TearDown() override {
    if (device_ != nullptr) {
      EXPECT_EQ(cl().clReleaseCommandQueue(queue_), CL_SUCCESS);
      EXPECT_EQ(cl().clReleaseContext(context_), CL_SUCCESS);
      EXPECT_EQ(omptarget::mistakes(), 0);
    }
  }
  static const opencl_loader::functions& cl() { return opencl_loader::get(); }

  /// The status of a call that must leave everything alone, and what it tells.
  std::pair<int, std::string> refusal_of(std::int64_t code) {
    const caller_stream stream(code, {5});
    const auto before = stream.image();
    std::uint32_t values[] = {0xA5A5A5A5u, 0xA5A5A5A5u, 0xA5A5A5A5u, 0xA5A5A5A5u};
    testing::internal::CaptureStderr();
    const int status =
        tarn_rvx_viRngUniformBits_omp_offload_lp64(0, stream, 2, values, interop_.handle());
    const std::string told = testing::internal::GetCapturedStderr();
    EXPECT_EQ(stream.image(), before);
    for (const std::uint32_t value : values) {
      EXPECT_EQ(value, 0xA5A5A5A5u);
    }
    return {status, told};
  }

  cl_device_id device_ = nullptr;
  cl_context context_ = nullptr;
  cl_command_queue queue_ = nullptr;
  omptarget::interop interop_;
};

TEST_F(offload_opencl, tells_what_the_implementation_lacks) {
  for (const std::int64_t code : {RVX_BRNG_MCG31, RVX_BRNG_MRG32K3A, RVX_BRNG_MCG59, RVX_BRNG_SOBOL,
                                  RVX_BRNG_MT19937, RVX_BRNG_MT2203, RVX_BRNG_PHILOX4X32X10}) {
    for (const bool nowait : {false, true}) {
      interop_.set_nowait(nowait);
      interop_.set_completion([](void*) { ADD_FAILURE() << "told of a refused call"; });
      const auto [status, told] = refusal_of(code);
      EXPECT_EQ(status, -2) << std::hex << code;
      EXPECT_EQ(told.find("Tarn RNG: "), 0u) << told;
      EXPECT_NE(told.find("exception"), std::string::npos) << told;
    }
  }
}

TEST_F(offload_opencl, is_minus_1_with_shared_virtual_memory_before_any_queue_is_made) {
  constexpr const char* name = "LIBOMPTARGET_OPENCL_USE_SVM";
  const int references = opencl_layer::objects(opencl_layer::object::queue);
  ::setenv(name, "1", 1);
  EXPECT_EQ(refusal_of(RVX_BRNG_PHILOX4X32X10), std::make_pair(-1, std::string()));
  ::unsetenv(name);
  EXPECT_EQ(opencl_layer::objects(opencl_layer::object::queue), references);
}

}  // namespace
