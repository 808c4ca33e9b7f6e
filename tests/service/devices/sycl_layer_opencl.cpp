// SPDX-License-Identifier: Apache-2.0
// The layer on SYCL queues, over OpenCL: every function, which references are left, what is thrown.
#include <atomic>
#include <cstring>
#include <thread>
#include <vector>

#include "ip_versions.hpp"
#include "level_zero_binding.hpp"
#include "opencl_gpu.hpp"
#include "serv_memory.hpp"
#include "sycl_queues.hpp"
#include "tarn_sycl_device.hpp"

namespace {

using namespace kestrel::tarn::gpu;
using kestrel::tarn::service::backend_code;
using opencl_layer::object;

constexpr cl_device_info ip_version_query = 0x4250;
constexpr int marker = 77;

class SyclLayerOpenCL : public OpenCLGpu {
 protected:
  void SetUp() override {
    OpenCLGpu::SetUp();
    if (!IsSkipped()) {
      sycl_tables().clear();
      queue.emplace(queue_on(gpu_of(backend_code::opencl).value()));
      get_device_id(&status, &*queue);
      sycl_tables().clear();
      before = living();
    }
  }
  void TearDown() override {
    OpenCLGpu::TearDown();
    queue.reset();
    sycl_tables().clear();
    EXPECT_EQ(status, marker);
  }

  void begin_with_version(cl_uint version) {
    opencl_layer::answer(ip_version_query, version);
    sycl_tables().clear();
  }

  std::optional<sycl::queue> queue;
  int status = marker;  // this layer does not touch it
};

TEST_F(SyclLayerOpenCL, TheDeviceIsTheQueuesAndNoReferenceIsAdded) {
  EXPECT_EQ(get_device_id(&status, &*queue), device);
  EXPECT_EQ(living(), before);
}

TEST_F(SyclLayerOpenCL, AQueueIsFoundAgainAndSoIsItsCopy) {
  get_device_id(&status, &*queue);
  const int asked = opencl_layer::calls("clGetDeviceInfo");
  sycl::queue copy = *queue;
  EXPECT_EQ(get_device_id(&status, &copy), device);
  EXPECT_EQ(get_device_id(&status, &*queue), device);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked);
  EXPECT_EQ(sycl_tables().queues.count, 1);
}

TEST_F(SyclLayerOpenCL, ANewQueueIsNotTakenForADeadOneWhereverItIs) {
  const sycl::device gpu = queue->get_device();
  const sycl::context context(gpu);
  for (int i = 0; i < 20; ++i) {
    sycl::queue fresh(context, gpu);
    const int asked = opencl_layer::calls("clGetDeviceInfo");
    EXPECT_EQ(get_device_id(&status, &fresh), device);
    EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked + 1) << i;  // for a parent
  }
  EXPECT_EQ(sycl_tables().queues.count, 20);
}

TEST_F(SyclLayerOpenCL, With2048QueuesTheRingIsFullAndTheOldestIsOverwritten) {
  const sycl::device gpu = queue->get_device();
  const sycl::context context(gpu);
  get_device_id(&status, &*queue);
  std::vector<sycl::queue> queues;
  for (int i = 0; i < 2047; ++i) {
    queues.emplace_back(context, gpu);
    ASSERT_EQ(get_device_id(&status, &queues.back()), device);
  }
  EXPECT_EQ(sycl_tables().queues.count, 2048);
  int asked = opencl_layer::calls("clGetDeviceInfo");
  get_device_id(&status, &*queue);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked);
  sycl::queue one_more(context, gpu);
  EXPECT_EQ(get_device_id(&status, &one_more), device);
  EXPECT_EQ(sycl_tables().queues.count, 2048);
  EXPECT_EQ(sycl_tables().queues.capacity, 2048);
  asked = opencl_layer::calls("clGetDeviceInfo");
  get_device_id(&status, &one_more);
  get_device_id(&status, &queues[0]);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked);
  get_device_id(&status, &*queue);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked + 1);
}

/// Half of the device as a SYCL device, which keeps its reference for good.
std::optional<sycl::device> half_of(cl_device_id device) {
  const cl_device_partition_property by_counts[] = {CL_DEVICE_PARTITION_BY_COUNTS, 1,
                                                    CL_DEVICE_PARTITION_BY_COUNTS_LIST_END, 0};
  cl_device_id part = nullptr;
  if (opencl_loader::get().clCreateSubDevices(device, by_counts, 1, &part, nullptr) != CL_SUCCESS) {
    return std::nullopt;
  }
  const sycl::device made = sycl::make_device<sycl::backend::opencl>(part);
  opencl_loader::get().clReleaseDevice(part);
  return made;
}

TEST_F(SyclLayerOpenCL, APartOfADeviceIsGivenWithoutAReference) {
  const std::optional<sycl::device> part = half_of(device);
  ASSERT_TRUE(part);
  {
    sycl::queue on_part = queue_on(*part);
    const int held = opencl_layer::objects(object::sub_device);
    void* const found = get_device_id(&status, &on_part);
    EXPECT_NE(found, nullptr);
    EXPECT_NE(found, device);
    EXPECT_EQ(opencl_layer::objects(object::sub_device), held);
    cl_device_id parent = nullptr;
    EXPECT_EQ(opencl_loader::get().clGetDeviceInfo(static_cast<cl_device_id>(found),
                                                   CL_DEVICE_PARENT_DEVICE, sizeof parent, &parent,
                                                   nullptr),
              CL_SUCCESS);
    EXPECT_EQ(parent, device);
    EXPECT_EQ(get_eu_count(&on_part), 1);
    EXPECT_EQ(opencl_layer::objects(object::sub_device), held);

    sycl_tables().clear();
    opencl_layer::answer_fails(CL_DEVICE_PARENT_DEVICE, -33);
    expect_error(sycl::errc::runtime, "OpenCL error -33",
                 [&] { get_device_id(&status, &on_part); });
    opencl_layer::reset();
    EXPECT_EQ(opencl_layer::objects(object::sub_device), held);
    EXPECT_EQ(sycl_tables().queues.count, 0);

    opencl_layer::fail("clReleaseDevice", 0, -5);
    expect_error(sycl::errc::runtime, "OpenCL error -5", [&] { get_device_id(&status, &on_part); });
    EXPECT_EQ(opencl_layer::objects(object::sub_device), held + 1);  // as the driver had it
    EXPECT_EQ(get_device_id(&status, &on_part), found);
  }
  before = living();  // SYCL devices live for ever
}

TEST_F(SyclLayerOpenCL, APathOfAnotherBackendIsRefused) {
  expect_error(sycl::errc::backend_mismatch, "Backends mismatch",
               [&] { native_device(*queue, TARN_GPU_BACKEND_LEVEL_ZERO); });
  EXPECT_EQ(native_device(*queue, TARN_GPU_BACKEND_OPENCL), device);
  EXPECT_EQ(native_device(*queue, TARN_GPU_BACKEND_OF_QUEUE), device);
  EXPECT_EQ(native_device(*queue, TARN_GPU_BACKEND_UNKNOWN), nullptr);
}

TEST_F(SyclLayerOpenCL, TheCountsAreTheDrivers) {
  EXPECT_EQ(get_eu_count(&*queue), static_cast<int>(told<cl_uint>(CL_DEVICE_MAX_COMPUTE_UNITS)));
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(&*queue),
            static_cast<int>(told<std::size_t>(CL_DEVICE_MAX_WORK_GROUP_SIZE)));
  EXPECT_EQ(get_tile_count(&*queue),
            std::max(1, static_cast<int>(told<cl_uint>(CL_DEVICE_PARTITION_MAX_SUB_DEVICES))));
  EXPECT_EQ(get_backend(&*queue), TARN_GPU_BACKEND_OPENCL);
}

TEST_F(SyclLayerOpenCL, LevelZeroIsNotNeeded) {
  EXPECT_GE(get_tile_count(&*queue), 1);
  get_architecture(&status, &*queue);
  tarn_gpu_get_cl_device_context(&status, &*queue, nullptr, nullptr);
  EXPECT_EQ(level_zero_runtime::record.state, binding_state::not_tried);
}

TEST_F(SyclLayerOpenCL, CountsAtTheirLimits) {
  opencl_layer::answer(CL_DEVICE_PARTITION_MAX_SUB_DEVICES, cl_uint{0});
  opencl_layer::answer(CL_DEVICE_MAX_WORK_GROUP_SIZE, (std::size_t{3} << 32) + 1024);
  EXPECT_EQ(get_tile_count(&*queue), 1);
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(&*queue), 1024);
  opencl_layer::answer_fails(CL_DEVICE_PARTITION_MAX_SUB_DEVICES, -30);
  opencl_layer::answer_fails(CL_DEVICE_MAX_COMPUTE_UNITS, -30);
  opencl_layer::answer_fails(CL_DEVICE_MAX_WORK_GROUP_SIZE, -30);
  sycl_tables().clear();
  EXPECT_EQ(get_tile_count(&*queue), 1);
  EXPECT_EQ(get_eu_count(&*queue), 0);
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(&*queue), 0);
}

TEST_F(SyclLayerOpenCL, InfoIsCopiedBeforeAndAfterTheArchitectureIsDecided) {
  begin_with_version(ip_versions::word(12, 61, 9));
  tarn_gpu_device_info_t info;
  std::memset(&info, marker, sizeof info);
  EXPECT_EQ(get_device_info(&*queue, &info), 0);
  EXPECT_EQ(info.device_id, device);
  EXPECT_EQ(info.lock, 0);
  EXPECT_FALSE(info.arch_ready);
  EXPECT_EQ(info.arch, TARN_GPU_ARCH_UNKNOWN);
  EXPECT_EQ(info.tile_count, get_tile_count(&*queue));
  EXPECT_EQ(info.eu_count, get_eu_count(&*queue));
  EXPECT_EQ(info.max_workgroup_size, tarn_gpu_get_max_workgroup_size(&*queue));
  EXPECT_EQ(info.backend, TARN_GPU_BACKEND_OPENCL);
  EXPECT_EQ(get_device_info_with_arch(&*queue, &info), 0);
  EXPECT_TRUE(info.arch_ready);
  EXPECT_EQ(info.arch, TARN_GPU_ARCH_PINE);
  EXPECT_EQ(info.stepping, 9U);
  EXPECT_EQ(info.flags, 1U);
  EXPECT_EQ(living(), before);
}

TEST_F(SyclLayerOpenCL, EveryReleaseOfTheMajorVersionsThatAreKnown) {
  opencl_layer::fail_always("clCreateProgramWithSource", -6);
  for (const cl_uint major : {9U, 10U, 11U, 12U, 13U, 20U}) {
    for (cl_uint release = 0; release < 256; ++release) {
      begin_with_version(ip_versions::word(major, release, release % 64));
      const ip_versions::answer expected = ip_versions::expected(major, release);
      tarn_gpu_arch_t arch =
          expected.arch == TARN_GPU_ARCH_ELM ? TARN_GPU_ARCH_OAK : TARN_GPU_ARCH_ELM;
      std::uint32_t stepping = marker;
      get_architecture_and_stepping(&status, &*queue, &arch, &stepping);
      ASSERT_EQ(arch, expected.arch) << major << "." << release;
      ASSERT_EQ(stepping, expected.known ? release % 64 : 0) << major << "." << release;
      ASSERT_EQ(get_device_flags(&status, &*queue), expected.flags) << major << "." << release;
      ASSERT_EQ(get_architecture(&status, &*queue), expected.arch) << major << "." << release;
    }
  }
}

TEST_F(SyclLayerOpenCL, EitherPlaceForArchitectureAndSteppingMayBeMissing) {
  begin_with_version(ip_versions::word(20, 3, 8));
  tarn_gpu_arch_t arch = TARN_GPU_ARCH_UNKNOWN;
  std::uint32_t stepping = 0;
  get_architecture_and_stepping(&status, &*queue, nullptr, nullptr);
  get_architecture_and_stepping(&status, &*queue, &arch, nullptr);
  get_architecture_and_stepping(&status, &*queue, nullptr, &stepping);
  EXPECT_EQ(arch, TARN_GPU_ARCH_LARCH);
  EXPECT_EQ(stepping, 8U);
}

TEST_F(SyclLayerOpenCL, WhateverFailsInDetectionTheArchitectureIsUnknownForGood) {
  struct step {
    const char* function;
    int after;
  };
  constexpr step steps[] = {{"clRetainContext", 0},  {"clCreateProgramWithSource", 0},
                            {"clBuildProgram", 0},   {"clGetProgramInfo", 0},
                            {"clGetProgramInfo", 1}, {"clGetProgramInfo", 2},
                            {"clGetProgramInfo", 3}, {"clGetDeviceInfo", 0}};
  for (const step& failing : steps) {
    sycl_tables().clear();
    opencl_layer::answer_fails(ip_version_query, -30);
    get_eu_count(&*queue);  // what comes next is the detection
    const int called = opencl_layer::calls(failing.function);
    opencl_layer::fail(failing.function, failing.after, -5);
    EXPECT_EQ(get_architecture(&status, &*queue), TARN_GPU_ARCH_UNKNOWN) << failing.function;
    EXPECT_GT(opencl_layer::calls(failing.function), called + failing.after) << failing.function;
    opencl_layer::reset();
    opencl_layer::answer(ip_version_query, ip_versions::word(9, 1, 1));
    EXPECT_EQ(get_architecture(&status, &*queue), TARN_GPU_ARCH_UNKNOWN) << failing.function;
    EXPECT_EQ(living(), before) << failing.function;
  }
}

TEST_F(SyclLayerOpenCL, WithoutMemoryForARecordMinus6IsThrown) {
  const auto without_memory = [this](auto call) {
    for (const int after : {2, 3}) {  // the ring's array and entry come first
      sycl_tables().clear();
      const serv_memory::failure failing(after);
      expect_error(sycl::errc::runtime, "OpenCL error -6", call);
      EXPECT_TRUE(failing.happened());
      EXPECT_EQ(sycl_tables().infos.count, 0);
      EXPECT_EQ(sycl_tables().infos.lock, 0);
    }
  };
  tarn_gpu_device_info_t info{};
  without_memory([&] { get_device_info(&*queue, &info); });
  without_memory([&] { get_device_info_with_arch(&*queue, &info); });
  without_memory([&] { get_architecture(&status, &*queue); });
  without_memory([&] { get_architecture_and_stepping(&status, &*queue, nullptr, nullptr); });
  without_memory([&] { get_device_flags(&status, &*queue); });
  without_memory([&] { get_tile_count(&*queue); });
  without_memory([&] { get_eu_count(&*queue); });
  without_memory([&] { tarn_gpu_get_max_workgroup_size(&*queue); });
  without_memory([&] { tarn_gpu_get_cl_device_context(&status, &*queue, nullptr, nullptr); });
  without_memory([&] { get_backend(&*queue); });
  EXPECT_GT(get_eu_count(&*queue), 0);
}

TEST_F(SyclLayerOpenCL, WithoutMemoryForTheRingNothingFails) {
  for (const int after : {0, 1}) {
    sycl_tables().clear();
    const serv_memory::failure failing(after);
    EXPECT_EQ(get_device_id(&status, &*queue), device);
    EXPECT_TRUE(failing.happened());
    EXPECT_EQ(sycl_tables().queues.count, 0);
  }
}

TEST_F(SyclLayerOpenCL, DeviceAndContextAreTheQueuesAndNoReferenceIsAdded) {
  cl_device_id found_device = nullptr;
  cl_context found_context = nullptr;
  tarn_gpu_get_cl_device_context(&status, &*queue, &found_device, &found_context);
  EXPECT_EQ(living(), before);
  EXPECT_EQ(found_device, device);
  cl_context context = sycl::get_native<sycl::backend::opencl>(queue->get_context());
  EXPECT_EQ(found_context, context);
  EXPECT_NE(context, nullptr);
  opencl_loader::get().clReleaseContext(context);
  found_device = nullptr;
  found_context = nullptr;
  tarn_gpu_get_cl_device_context(&status, &*queue, nullptr, nullptr);
  tarn_gpu_get_cl_device_context(&status, &*queue, &found_device, nullptr);
  tarn_gpu_get_cl_device_context(&status, &*queue, nullptr, &found_context);
  EXPECT_EQ(found_device, device);
  EXPECT_EQ(found_context, context);
  EXPECT_EQ(living(), before);
}

TEST_F(SyclLayerOpenCL, AContextThatCannotBeReleasedIsThrown) {
  const int held = opencl_layer::objects(object::context);
  opencl_layer::fail("clReleaseContext", 0, -34);
  expect_error(sycl::errc::runtime, "OpenCL error -34",
               [&] { tarn_gpu_get_cl_device_context(&status, &*queue, nullptr, nullptr); });
  EXPECT_EQ(opencl_layer::objects(object::context), held + 1);  // as the driver had it
  cl_context context = nullptr;
  tarn_gpu_get_cl_device_context(&status, &*queue, nullptr, &context);
  EXPECT_EQ(opencl_loader::get().clReleaseContext(context), CL_SUCCESS);
}

TEST_F(SyclLayerOpenCL, ClearedTablesAreFilledAnew) {
  begin_with_version(ip_versions::word(9, 0, 1));
  EXPECT_EQ(get_architecture(&status, &*queue), TARN_GPU_ARCH_FIR);
  const std::int64_t blocks = serv_memory::live_blocks();
  sycl_tables().clear();
  EXPECT_EQ(serv_memory::live_blocks(), blocks - 4);  // two arrays, an entry, a record
  EXPECT_EQ(sycl_tables().queues.last, -1);
  opencl_layer::answer(ip_version_query, ip_versions::word(11, 0, 1));
  EXPECT_EQ(get_architecture(&status, &*queue), TARN_GPU_ARCH_ELM);
}

TEST_F(SyclLayerOpenCL, ThreadsThatComeFirstAtOnceGetTheSame) {
  begin_with_version(ip_versions::word(12, 70, 3));
  const int asked = opencl_layer::calls("clGetDeviceInfo");
  std::atomic<bool> go{false};
  std::atomic<int> wrong{0};
  std::vector<std::thread> threads;
  for (int t = 0; t < 16; ++t) {
    threads.emplace_back([&, t] {
      sycl::queue mine = *queue;
      int unused = 0;
      tarn_gpu_device_info_t info{};
      cl_context context = nullptr;
      while (!go) {
      }
      wrong += get_device_id(&unused, &mine) != device;
      wrong += t % 2 == 0 && get_device_info(&mine, &info) != 0;
      wrong += get_architecture(&unused, &mine) != TARN_GPU_ARCH_YEW;
      wrong += get_device_flags(&unused, &mine) != 1;
      wrong += get_tile_count(&mine) < 1;
      tarn_gpu_get_cl_device_context(&unused, &mine, nullptr, &context);
      wrong += context == nullptr;
    });
  }
  go = true;
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(sycl_tables().infos.count, 1);
  // A parent, three counts and the version.
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), asked + 5);
}

}  // namespace
