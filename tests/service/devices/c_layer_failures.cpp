// SPDX-License-Identifier: Apache-2.0
// The layer on OpenCL queues when something fails: results, statuses, and what is left.
#include <cstring>

#include "c_layer.hpp"
#include "ip_versions.hpp"
#include "serv_memory.hpp"

namespace {

using namespace kestrel::tarn::gpu;
using namespace c_layer_test;

class CLayerFailures : public CLayerTest {};

TEST_F(CLayerFailures, ADeviceThatIsNotToldIsNullAndTheStatusIsKeptBack) {
  int status = 0;
  opencl_layer::fail("clGetCommandQueueInfo", 0, -36);
  EXPECT_EQ(tarn_serv_gpu_get_device_id(&status, queue()), nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(tarn_serv_gpu_get_device_id(&status, nullptr), nullptr);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(c_layer::tables().queues.count, 0);
}

TEST_F(CLayerFailures, ACountThatIsNotToldIsAsBefore) {
  opencl_layer::answer(CL_DEVICE_PARTITION_MAX_SUB_DEVICES, cl_uint{4});
  opencl_layer::answer(CL_DEVICE_MAX_COMPUTE_UNITS, cl_uint{5});
  opencl_layer::answer(CL_DEVICE_MAX_WORK_GROUP_SIZE, std::size_t{6});
  constexpr cl_device_info queries[] = {CL_DEVICE_PARTITION_MAX_SUB_DEVICES,
                                        CL_DEVICE_MAX_COMPUTE_UNITS, CL_DEVICE_MAX_WORK_GROUP_SIZE};
  for (int failing = 0; failing < 3; ++failing) {
    c_layer::tables().clear();
    opencl_layer::fail("clGetDeviceInfo", failing, -30);
    tarn_gpu_device_info_t info{};
    EXPECT_EQ(tarn_serv_gpu_get_device_info(queue(), &info), 0);
    EXPECT_EQ(info.tile_count, failing == 0 ? 1 : 4);
    EXPECT_EQ(info.eu_count, failing == 1 ? 0 : 5);
    EXPECT_EQ(info.max_workgroup_size, failing == 2 ? 0 : 6);
  }
  for (const cl_device_info query : queries) {
    opencl_layer::answer_fails(query, -30);
  }
  c_layer::tables().clear();
  EXPECT_EQ(tarn_serv_gpu_get_tile_count(queue()), 1);
  EXPECT_EQ(tarn_serv_gpu_get_eu_count(queue()), 0);
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(queue()), 0);
}

TEST_F(CLayerFailures, AFailedDetectionIsNotRepeated) {
  opencl_layer::answer_fails(ip_version_query, -30);
  opencl_layer::fail("clBuildProgram", 0, -11);
  EXPECT_EQ(arch(), TARN_GPU_ARCH_UNKNOWN);
  opencl_layer::answer(ip_version_query, ip_versions::word(9, 0, 1));
  EXPECT_EQ(arch(), TARN_GPU_ARCH_UNKNOWN);
  tarn_gpu_device_info_t info{};
  EXPECT_EQ(tarn_serv_gpu_get_device_info(queue(), &info), 0);
  EXPECT_TRUE(info.arch_ready);
  EXPECT_EQ(info.flags, 0U);
}

TEST_F(CLayerFailures, WhateverFailsInDetectionTheArchitectureIsUnknownAndNothingIsLeft) {
  struct step {
    const char* function;
    int after;
  };
  constexpr step steps[] = {{"clGetCommandQueueInfo", 1}, {"clCreateProgramWithSource", 0},
                            {"clBuildProgram", 0},        {"clGetProgramInfo", 0},
                            {"clGetProgramInfo", 1},      {"clGetProgramInfo", 2},
                            {"clGetProgramInfo", 3}};
  for (const step& failing : steps) {
    opencl_layer::answer_fails(ip_version_query, -30);
    c_layer::tables().clear();
    const int called = opencl_layer::calls(failing.function);
    opencl_layer::fail(failing.function, failing.after, -5);
    int status = 0;
    EXPECT_EQ(tarn_serv_gpu_get_architecture(&status, queue()), TARN_GPU_ARCH_UNKNOWN);
    EXPECT_EQ(status, 0) << failing.function;
    EXPECT_GT(opencl_layer::calls(failing.function), called + failing.after) << failing.function;
    opencl_layer::reset();
    EXPECT_EQ(living(), before) << failing.function;
  }
}

TEST_F(CLayerFailures, WhatIsGivenForAQueueWithoutADevice) {
  int status = 0;
  opencl_layer::fail_always("clGetCommandQueueInfo", -36);
  tarn_gpu_device_info_t info;
  std::memset(&info, marker, sizeof info);
  const tarn_gpu_device_info_t untouched = info;
  EXPECT_EQ(tarn_serv_gpu_get_device_info(queue(), &info), 1);
  EXPECT_EQ(tarn_serv_gpu_get_device_info_with_arch(queue(), &info), 1);
  EXPECT_EQ(std::memcmp(&info, &untouched, sizeof info), 0);
  EXPECT_EQ(tarn_serv_gpu_get_architecture(&status, queue()), TARN_GPU_ARCH_UNKNOWN);
  EXPECT_EQ(status, -36);
  tarn_gpu_arch_t found = another_arch(TARN_GPU_ARCH_UNKNOWN);
  std::uint32_t stepping = marker;
  status = 0;
  tarn_serv_gpu_get_architecture_and_stepping(&status, queue(), &found, &stepping);
  EXPECT_EQ(found, TARN_GPU_ARCH_UNKNOWN);
  EXPECT_EQ(stepping, 0U);
  EXPECT_EQ(status, -36);
  status = 0;
  EXPECT_EQ(tarn_serv_gpu_get_device_flags(&status, queue()), 0U);
  EXPECT_EQ(status, -36);
  EXPECT_EQ(tarn_serv_gpu_get_tile_count(queue()), 1);
  EXPECT_EQ(tarn_serv_gpu_get_eu_count(queue()), 0);
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(queue()), 0);
  EXPECT_EQ(c_layer::get_backend(queue()), TARN_GPU_BACKEND_UNKNOWN);
  EXPECT_EQ(c_layer::tables().infos.count, 0);
}

TEST_F(CLayerFailures, TheFirstFailureOfAChainSurvives) {
  opencl_layer::fail_always("clGetCommandQueueInfo", -36);
  int status = -1234;
  cl_context context = nullptr;
  tarn_serv_gpu_get_architecture(&status, queue());
  tarn_serv_gpu_get_architecture_and_stepping(&status, queue(), nullptr, nullptr);
  tarn_serv_gpu_get_device_flags(&status, queue());
  tarn_gpu_get_cl_device_context(&status, queue(), nullptr, &context);
  EXPECT_EQ(status, -1234);
}

TEST_F(CLayerFailures, AFormerFailureDoesNotKeepAResultBack) {
  begin_with_version(ip_versions::word(20, 3, 8));
  int status = -1234;
  EXPECT_EQ(tarn_serv_gpu_get_architecture(&status, queue()), TARN_GPU_ARCH_LARCH);
  EXPECT_EQ(status, -1234);
}

TEST_F(CLayerFailures, WithoutMemoryForARecordTheStatusIsMinus6) {
  const auto without_memory = [this](auto call) {
    // The ring's array and entry come first.
    for (const int after : {2, 3}) {
      c_layer::tables().clear();
      const serv_memory::failure failing(after);
      call();
      EXPECT_TRUE(failing.happened());
      EXPECT_EQ(c_layer::tables().infos.count, 0);
    }
  };
  without_memory([this] {
    int status = 0;
    EXPECT_EQ(tarn_serv_gpu_get_architecture(&status, queue()), TARN_GPU_ARCH_UNKNOWN);
    EXPECT_EQ(status, -6);
  });
  without_memory([this] {
    int status = 0;
    EXPECT_EQ(tarn_serv_gpu_get_device_flags(&status, queue()), 0U);
    EXPECT_EQ(status, -6);
  });
  without_memory([this] {
    int status = -9;
    tarn_gpu_get_cl_device_context(&status, queue(), nullptr, nullptr);
    EXPECT_EQ(status, -9);
  });
  without_memory([this] { EXPECT_EQ(tarn_serv_gpu_get_tile_count(queue()), 1); });
  without_memory([this] {
    tarn_gpu_device_info_t info{};
    EXPECT_EQ(tarn_serv_gpu_get_device_info(queue(), &info), 1);
  });
  EXPECT_GT(tarn_serv_gpu_get_eu_count(queue()), 0);
}

TEST_F(CLayerFailures, WithoutMemoryForTheRingNothingFails) {
  for (const int after : {0, 1}) {
    c_layer::tables().clear();
    const serv_memory::failure failing(after);
    int status = 0;
    EXPECT_EQ(tarn_serv_gpu_get_device_id(&status, queue()), device);
    EXPECT_EQ(status, 0);
    EXPECT_TRUE(failing.happened());
    EXPECT_EQ(c_layer::tables().queues.count, 0);
  }
}

TEST_F(CLayerFailures, WithoutDeviceOrContextBothAreNull) {
  for (const int after : {0, 1}) {
    int status = 0;
    auto found_device = reinterpret_cast<cl_device_id>(this);
    auto found_context = reinterpret_cast<cl_context>(this);
    opencl_layer::fail("clGetCommandQueueInfo", after, -36);
    tarn_gpu_get_cl_device_context(&status, queue(), &found_device, &found_context);
    EXPECT_EQ(status, -36);
    EXPECT_EQ(found_device, nullptr);
    EXPECT_EQ(found_context, nullptr);
  }
}

}  // namespace
