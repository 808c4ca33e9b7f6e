// SPDX-License-Identifier: Apache-2.0
// The layer on OpenCL queues: every function, and what it asks the driver.
#include "c_layer.hpp"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <iterator>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "ip_versions.hpp"
#include "serv_memory.hpp"

extern "C" void device_functions_seen_from_c(void (*seen[12])());

namespace {

using namespace kestrel::tarn::gpu;

using namespace c_layer_test;

class CLayer : public CLayerTest {};

TEST_F(CLayer, TheDeviceIsTheQueues) {
  int status = 0;
  EXPECT_EQ(tarn_serv_gpu_get_device_id(&status, queue()), device);
  EXPECT_EQ(status, 0);
}

TEST_F(CLayer, AQueueIsNotFoundAgainAndTheRingFillsToItsLimit) {
  int status = 0;
  const int asked = opencl_layer::calls("clGetCommandQueueInfo");
  for (int i = 1; i <= 2050; ++i) {
    ASSERT_EQ(tarn_serv_gpu_get_device_id(&status, queue()), device);
    ASSERT_EQ(opencl_layer::calls("clGetCommandQueueInfo"), asked + i);
    ASSERT_EQ(c_layer::tables().queues.count, std::min(i, 2048));
  }
  EXPECT_EQ(c_layer::tables().queues.next_victim, 2);
  EXPECT_EQ(c_layer::tables().infos.count, 0);
}

TEST_F(CLayer, TheCountsAreTheDrivers) {
  EXPECT_EQ(tarn_serv_gpu_get_eu_count(queue()),
            static_cast<int>(told<cl_uint>(CL_DEVICE_MAX_COMPUTE_UNITS)));
  EXPECT_GT(tarn_serv_gpu_get_eu_count(queue()), 0);
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(queue()),
            static_cast<int>(told<std::size_t>(CL_DEVICE_MAX_WORK_GROUP_SIZE)));
  EXPECT_GT(tarn_gpu_get_max_workgroup_size(queue()), 0);
  EXPECT_EQ(tarn_serv_gpu_get_tile_count(queue()),
            std::max(1, static_cast<int>(told<cl_uint>(CL_DEVICE_PARTITION_MAX_SUB_DEVICES))));
}

TEST_F(CLayer, CountsAreReadOnceForADevice) {
  tarn_serv_gpu_get_eu_count(queue());
  const int asked = opencl_layer::calls("clGetDeviceInfo");
  const opencl_queue another(device);
  EXPECT_GT(tarn_serv_gpu_get_eu_count(another.get()), 0);
  EXPECT_GE(tarn_serv_gpu_get_tile_count(queue()), 1);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked);
  EXPECT_EQ(c_layer::tables().infos.count, 1);
}

TEST_F(CLayer, ADeviceWithoutPartsHasOneTile) {
  opencl_layer::answer(CL_DEVICE_PARTITION_MAX_SUB_DEVICES, cl_uint{0});
  EXPECT_EQ(tarn_serv_gpu_get_tile_count(queue()), 1);
}

TEST_F(CLayer, TilesAreThePartsOfTheDevice) {
  opencl_layer::answer(CL_DEVICE_PARTITION_MAX_SUB_DEVICES, cl_uint{4});
  EXPECT_EQ(tarn_serv_gpu_get_tile_count(queue()), 4);
}

TEST_F(CLayer, AGroupSizeBeyond32BitsIsCut) {
  opencl_layer::answer(CL_DEVICE_MAX_WORK_GROUP_SIZE, (std::size_t{3} << 32) + 1024);
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(queue()), 1024);
}

TEST_F(CLayer, InfoIsCopiedBeforeAndAfterTheArchitectureIsDecided) {
  begin_with_version(ip_versions::word(12, 65, 9));
  tarn_gpu_device_info_t info;
  std::memset(&info, marker, sizeof info);
  ASSERT_EQ(tarn_serv_gpu_get_device_info(queue(), &info), 0);
  EXPECT_EQ(info.device_id, device);
  EXPECT_EQ(info.lock, 0);
  EXPECT_FALSE(info.arch_ready);
  EXPECT_EQ(info.arch, 0);
  EXPECT_EQ(info.stepping, 0U);
  EXPECT_FALSE(info.binary_checked);
  EXPECT_FALSE(info.binary_usable);
  EXPECT_EQ(info.tile_count, tarn_serv_gpu_get_tile_count(queue()));
  EXPECT_EQ(info.eu_count, tarn_serv_gpu_get_eu_count(queue()));
  EXPECT_EQ(info.max_workgroup_size, tarn_gpu_get_max_workgroup_size(queue()));
  EXPECT_EQ(info.flags, 0U);
  EXPECT_EQ(info.backend, TARN_GPU_BACKEND_OPENCL);

  std::memset(&info, marker, sizeof info);
  ASSERT_EQ(tarn_serv_gpu_get_device_info_with_arch(queue(), &info), 0);
  EXPECT_TRUE(info.arch_ready);
  EXPECT_EQ(info.arch, TARN_GPU_ARCH_PINE);
  EXPECT_EQ(info.stepping, 9U);
  EXPECT_EQ(info.flags, 3U);
  EXPECT_EQ(info.lock, 0);

  std::memset(&info, marker, sizeof info);
  ASSERT_EQ(tarn_serv_gpu_get_device_info(queue(), &info), 0);
  EXPECT_TRUE(info.arch_ready);
  EXPECT_EQ(info.arch, TARN_GPU_ARCH_PINE);
}

TEST_F(CLayer, EveryReleaseOfEveryMajorVersion) {
  // No answer means a compilation, which is made to fail here and so leaves the device unknown.
  opencl_layer::fail_always("clCreateProgramWithSource", -6);
  int made = compilations();
  for (cl_uint major = 0; major < 1024; ++major) {
    for (cl_uint release = 0; release < 256; release += major < 64 ? 1 : 15) {
      const cl_uint stepping = (major + 7 * release) % 64;
      const cl_uint unused = (release % 2) * 0x3FC0;  // bits that mean nothing
      begin_with_version(ip_versions::word(major, release, stepping) | unused);
      const ip_versions::answer expected = ip_versions::expected(major, release);
      int status = 0;
      tarn_gpu_arch_t found = another_arch(expected.arch);
      std::uint32_t found_stepping = marker;
      tarn_serv_gpu_get_architecture_and_stepping(&status, queue(), &found, &found_stepping);
      ASSERT_EQ(status, 0);
      ASSERT_EQ(found, expected.arch) << major << "." << release;
      ASSERT_EQ(found_stepping, expected.known ? stepping : 0) << major << "." << release;
      ASSERT_EQ(tarn_serv_gpu_get_device_flags(&status, queue()), expected.flags)
          << major << "." << release;
      made += expected.known ? 0 : 1;
      ASSERT_EQ(compilations(), made) << major << "." << release;
    }
  }
}

TEST_F(CLayer, Release72OfVersion12IsLeftToACompiledKernel) {
  begin_with_version(ip_versions::word(12, 72, 4));
  const int made = compilations();
  const int read = opencl_layer::calls("clGetProgramInfo");
  EXPECT_EQ(arch(), TARN_GPU_ARCH_UNKNOWN);  // the driver for CPUs makes no device binaries
  EXPECT_EQ(compilations(), made + 1);
  EXPECT_EQ(opencl_layer::calls("clGetProgramInfo"), read + 4);
}

TEST_F(CLayer, ADriverWithoutTheQueryIsLeftToACompiledKernel) {
  opencl_layer::answer_fails(ip_version_query, -30);
  const int made = compilations();
  EXPECT_EQ(arch(), TARN_GPU_ARCH_UNKNOWN);
  EXPECT_EQ(compilations(), made + 1);
}

TEST_F(CLayer, TheArchitectureIsDecidedOnce) {
  begin_with_version(ip_versions::word(9, 0, 1));
  EXPECT_EQ(arch(), TARN_GPU_ARCH_FIR);
  opencl_layer::answer(ip_version_query, ip_versions::word(20, 0, 1));
  const int asked = opencl_layer::calls("clGetDeviceInfo");
  EXPECT_EQ(arch(), TARN_GPU_ARCH_FIR);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked);
}

TEST_F(CLayer, EitherPlaceForArchitectureAndSteppingMayBeMissing) {
  begin_with_version(ip_versions::word(20, 3, 8));
  int status = 0;
  tarn_gpu_arch_t found = another_arch(TARN_GPU_ARCH_LARCH);
  std::uint32_t stepping = marker;
  tarn_serv_gpu_get_architecture_and_stepping(&status, queue(), nullptr, nullptr);
  tarn_serv_gpu_get_architecture_and_stepping(&status, queue(), &found, nullptr);
  tarn_serv_gpu_get_architecture_and_stepping(&status, queue(), nullptr, &stepping);
  EXPECT_EQ(found, TARN_GPU_ARCH_LARCH);
  EXPECT_EQ(stepping, 8U);
  EXPECT_EQ(status, 0);
}

TEST_F(CLayer, DeviceAndContextAreTheQueuesAndNoReferenceIsAdded) {
  int status = 0;
  cl_device_id found_device = nullptr;
  cl_context found_context = nullptr;
  tarn_gpu_get_cl_device_context(&status, queue(), &found_device, &found_context);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(found_device, device);
  cl_context context = nullptr;
  opencl_loader::get().clGetCommandQueueInfo(queue(), CL_QUEUE_CONTEXT, sizeof context, &context,
                                             nullptr);
  EXPECT_EQ(found_context, context);
  EXPECT_NE(found_context, nullptr);
  EXPECT_EQ(living(), before);
}

TEST_F(CLayer, EitherPlaceForDeviceAndContextMayBeMissing) {
  int status = 0;
  cl_device_id found_device = nullptr;
  cl_context found_context = nullptr;
  tarn_gpu_get_cl_device_context(&status, queue(), nullptr, nullptr);
  tarn_gpu_get_cl_device_context(&status, queue(), &found_device, nullptr);
  tarn_gpu_get_cl_device_context(&status, queue(), nullptr, &found_context);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(found_device, device);
  EXPECT_NE(found_context, nullptr);
}

TEST_F(CLayer, TheBackendIsOpenCL) {
  EXPECT_EQ(c_layer::get_backend(queue()), TARN_GPU_BACKEND_OPENCL);
}

TEST_F(CLayer, ClearedTablesAreFilledAnew) {
  begin_with_version(ip_versions::word(9, 0, 1));
  EXPECT_EQ(arch(), TARN_GPU_ARCH_FIR);
  const std::int64_t blocks = serv_memory::live_blocks();
  c_layer::tables().clear();
  EXPECT_EQ(serv_memory::live_blocks(), blocks - 4);  // two arrays, an entry, a record
  EXPECT_EQ(c_layer::tables().queues.last, -1);
  opencl_layer::answer(ip_version_query, ip_versions::word(11, 0, 1));
  EXPECT_EQ(arch(), TARN_GPU_ARCH_ELM);
}

TEST_F(CLayer, ThreadsThatComeFirstAtOnceGetTheSame) {
  begin_with_version(ip_versions::word(12, 74, 3));
  const int asked = opencl_layer::calls("clGetDeviceInfo");
  std::atomic<bool> go{false};
  std::atomic<int> wrong{0};
  std::vector<std::thread> threads;
  for (int t = 0; t < 16; ++t) {
    threads.emplace_back([&, t] {
      while (!go) {
      }
      int status = 0;
      tarn_gpu_device_info_t info{};
      wrong += tarn_serv_gpu_get_device_id(&status, queue()) != device;
      wrong += t % 2 == 0 && tarn_serv_gpu_get_device_info(queue(), &info) != 0;
      wrong += tarn_serv_gpu_get_architecture(&status, queue()) != TARN_GPU_ARCH_YEW;
      wrong += tarn_serv_gpu_get_device_flags(&status, queue()) != 3;
      wrong += tarn_serv_gpu_get_tile_count(queue()) < 1;
      wrong += status;
    });
  }
  go = true;
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(c_layer::tables().infos.count, 1);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked + 4);  // three counts and the version
}

TEST(CLayerInC, EveryFunctionIsTheSameInC) {
  void (*seen[12])() = {};
  device_functions_seen_from_c(seen);
  EXPECT_EQ(seen[0], reinterpret_cast<void (*)()>(tarn_serv_gpu_get_device_id));
  EXPECT_EQ(seen[9], reinterpret_cast<void (*)()>(tarn_gpu_get_cl_device_context));
  for (std::size_t i = 0; i < std::size(seen); ++i) {
    EXPECT_NE(seen[i], nullptr) << i;
    EXPECT_EQ(std::count(std::begin(seen), std::end(seen), seen[i]), 1) << i;
  }
}

}  // namespace
