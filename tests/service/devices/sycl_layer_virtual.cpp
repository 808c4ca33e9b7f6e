// SPDX-License-Identifier: Apache-2.0
// The layer on SYCL queues, over devices that are neither OpenCL's nor Level Zero's.
#include <cstring>

#include "level_zero_binding.hpp"
#include "opencl_binding.hpp"
#include "sycl_queues.hpp"
#include "tarn_sycl_device.hpp"

namespace {

using namespace kestrel::tarn::gpu;

class SyclLayerVirtual : public testing::Test {
 protected:
  void SetUp() override { sycl_tables().clear(); }

  sycl::queue queue{sycl::gpu_selector_v};
  int status = 77;
};

TEST_F(SyclLayerVirtual, HasNoNativeDeviceAndCountsAsTheyBegin) {
  EXPECT_EQ(get_device_id(&status, &queue), nullptr);
  EXPECT_EQ(get_tile_count(&queue), 1);
  EXPECT_EQ(get_eu_count(&queue), 0);
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(&queue), 0);
  EXPECT_EQ(get_architecture(&status, &queue), TARN_GPU_ARCH_UNKNOWN);
  EXPECT_EQ(get_device_flags(&status, &queue), 0U);
  EXPECT_EQ(get_backend(&queue), TARN_GPU_BACKEND_UNKNOWN);
  EXPECT_EQ(status, 77);
  EXPECT_EQ(opencl_runtime::record.state, binding_state::not_tried);
  EXPECT_EQ(level_zero_runtime::record.state, binding_state::not_tried);
}

TEST_F(SyclLayerVirtual, InfoIsThatOfNoDevice) {
  tarn_gpu_device_info_t info;
  std::memset(&info, 77, sizeof info);
  EXPECT_EQ(get_device_info_with_arch(&queue, &info), 0);
  EXPECT_EQ(info.device_id, nullptr);
  EXPECT_EQ(info.lock, 0);
  EXPECT_TRUE(info.arch_ready);
  EXPECT_EQ(info.arch, TARN_GPU_ARCH_UNKNOWN);
  EXPECT_EQ(info.stepping, 0U);
  EXPECT_FALSE(info.binary_checked);
  EXPECT_FALSE(info.binary_usable);
  EXPECT_EQ(info.tile_count, 1);
  EXPECT_EQ(info.eu_count, 0);
  EXPECT_EQ(info.max_workgroup_size, 0);
  EXPECT_EQ(info.flags, 0U);
  EXPECT_EQ(info.backend, TARN_GPU_BACKEND_UNKNOWN);
}

TEST_F(SyclLayerVirtual, AllSuchDevicesShareARecord) {
  sycl::queue on_cpu{sycl::cpu_selector_v};
  EXPECT_EQ(&record_of(queue), &record_of(on_cpu));
  EXPECT_EQ(sycl_tables().infos.count, 1);
  EXPECT_EQ(sycl_tables().queues.count, 2);
}

TEST_F(SyclLayerVirtual, OpenCLDeviceAndContextAreNull) {
  int place = 0;
  auto device = reinterpret_cast<_cl_device_id*>(&place);
  auto context = reinterpret_cast<_cl_context*>(&place);
  tarn_gpu_get_cl_device_context(&status, &queue, nullptr, nullptr);
  tarn_gpu_get_cl_device_context(&status, &queue, &device, &context);
  EXPECT_EQ(device, nullptr);
  EXPECT_EQ(context, nullptr);
}

TEST_F(SyclLayerVirtual, ANativePathIsRefused) {
  for (const tarn_gpu_backend_t path : {TARN_GPU_BACKEND_OPENCL, TARN_GPU_BACKEND_LEVEL_ZERO}) {
    expect_error(sycl::errc::backend_mismatch, "Backends mismatch",
                 [&] { native_device(queue, path); });
  }
}

}  // namespace
