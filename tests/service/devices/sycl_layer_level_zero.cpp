// SPDX-License-Identifier: Apache-2.0
// The layer on SYCL queues, over the Level Zero driver for tests, which has a device for each
// version that is asked about.
#include <algorithm>
#include <atomic>
#include <string>
#include <thread>
#include <vector>

#include "../../forge/binaries.hpp"
#include "ip_versions.hpp"
#include "level_zero_driver.hpp"
#include "level_zero_loader.hpp"
#include "serv_memory.hpp"
#include "sycl_queues.hpp"
#include "tarn_sycl_device.hpp"

namespace {

using namespace kestrel::tarn::gpu;
using kestrel::tarn::service::backend_code;

struct version {
  std::uint32_t major;
  std::uint32_t release;
  std::uint32_t stepping;
};

constexpr std::size_t silent = 0;  // does not know its version, and has no parts
constexpr std::size_t in_parts = 1;
constexpr std::size_t release_72 = 2;  // of version 12
constexpr std::size_t first_version = 3;
constexpr int parts = 3;

std::vector<version> versions() {
  std::vector<version> all;
  for (std::uint32_t release = 0; release < 256; ++release) {
    all.push_back({12, release, release % 64});
  }
  for (std::uint32_t major = 0; major < 64; ++major) {
    if (major != 12) {
      all.push_back({major, (major * 37) % 256, (major * 5 + 1) % 64});
    }
  }
  all.push_back({1023, 255, 63});
  return all;
}

std::vector<level_zero_driver::device_description> descriptions() {
  std::vector<level_zero_driver::device_description> all(first_version);
  all[in_parts].sub_devices = parts;
  all[in_parts].ip_version = ip_versions::word(12, 73, 5);
  all[release_72].ip_version = ip_versions::word(12, 72, 5);
  for (const version& each : versions()) {
    level_zero_driver::device_description device;
    device.ip_version = ip_versions::word(each.major, each.release, each.stepping);
    all.push_back(device);
  }
  return all;
}

class SyclLayerLevelZero : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    if (level_zero_loader::find() != nullptr) {
      level_zero_driver::devices(descriptions());  // SYCL looks for devices once
    }
  }
  void SetUp() override {
    if (level_zero_loader::find() == nullptr) {
      GTEST_SKIP() << "no Level Zero loader";
    }
    gpus = sycl::device::get_devices(sycl::info::device_type::gpu);
    const auto is_other = [](const sycl::device& gpu) {
      return kestrel::tarn::service::code_of(gpu.get_backend()) != backend_code::level_zero;
    };
    gpus.erase(std::remove_if(gpus.begin(), gpus.end(), is_other), gpus.end());
    ASSERT_EQ(gpus.size(), descriptions().size());
    level_zero_driver::reset();
    sycl_tables().clear();
  }
  void TearDown() override {
    sycl_tables().clear();
    EXPECT_EQ(status, 77);
  }

  sycl::queue queue(std::size_t device) const { return queue_on(gpus[device]); }
  void* handle(std::size_t device) const { return kestrel::tarn::service::native_of(gpus[device]); }
  static int compilations() { return level_zero_driver::calls("zeModuleCreate"); }

  std::vector<sycl::device> gpus;
  int status = 77;  // this layer does not touch it
};

TEST_F(SyclLayerLevelZero, TheDeviceIsTheQueues) {
  sycl::queue first = queue(silent);
  sycl::queue second = queue(in_parts);
  EXPECT_EQ(get_device_id(&status, &first), handle(silent));
  EXPECT_EQ(get_device_id(&status, &second), handle(in_parts));
  EXPECT_NE(handle(silent), handle(in_parts));
  EXPECT_EQ(get_backend(&first), TARN_GPU_BACKEND_LEVEL_ZERO);
}

TEST_F(SyclLayerLevelZero, APathOfAnotherBackendIsRefused) {
  const sycl::queue one = queue(silent);
  expect_error(sycl::errc::backend_mismatch, "Backends mismatch",
               [&] { native_device(one, TARN_GPU_BACKEND_OPENCL); });
  EXPECT_EQ(native_device(one, TARN_GPU_BACKEND_LEVEL_ZERO), handle(silent));
  EXPECT_EQ(native_device(one, TARN_GPU_BACKEND_OF_QUEUE), handle(silent));
}

TEST_F(SyclLayerLevelZero, TilesAreThePartsOfTheDevice) {
  sycl::queue whole = queue(silent);
  sycl::queue divided = queue(in_parts);
  EXPECT_EQ(get_tile_count(&whole), 1);
  EXPECT_EQ(get_tile_count(&divided), parts);
}

TEST_F(SyclLayerLevelZero, ADriverThatDoesNotTellThePartsHasOneTile) {
  sycl::queue divided = queue(in_parts);
  level_zero_driver::fail("zeDeviceGetSubDevices", 0, ZE_RESULT_ERROR_DEVICE_LOST);
  EXPECT_EQ(get_tile_count(&divided), 1);
  EXPECT_EQ(level_zero_driver::failures_left(), 0);
  EXPECT_GT(get_eu_count(&divided), 0);
}

TEST_F(SyclLayerLevelZero, OtherCountsAreThoseOfSycl) {
  sycl::queue one = queue(silent);
  EXPECT_EQ(get_eu_count(&one),
            static_cast<int>(gpus[silent].get_info<sycl::info::device::max_compute_units>()));
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(&one),
            static_cast<int>(gpus[silent].get_info<sycl::info::device::max_work_group_size>()));
  const level_zero_driver::device_description plain;
  EXPECT_EQ(tarn_gpu_get_max_workgroup_size(&one), static_cast<int>(plain.max_group_size));
  EXPECT_GT(get_eu_count(&one), 0);
}

TEST_F(SyclLayerLevelZero, EveryVersion) {
  level_zero_driver::fail_always("zeModuleCreate", ZE_RESULT_ERROR_UNSUPPORTED_FEATURE);
  std::size_t device = first_version;
  int made = 0;
  for (const version& each : versions()) {
    sycl::queue one = queue(device++);
    const ip_versions::answer expected = ip_versions::expected(each.major, each.release);
    tarn_gpu_device_info_t info{};
    EXPECT_EQ(get_device_info_with_arch(&one, &info), 0);
    ASSERT_TRUE(info.arch_ready);
    ASSERT_EQ(info.arch, expected.arch) << each.major << "." << each.release;
    ASSERT_EQ(info.stepping, expected.known ? each.stepping : 0);
    ASSERT_EQ(info.flags, expected.flags) << each.major << "." << each.release;
    made += expected.known ? 0 : 1;
    ASSERT_EQ(compilations(), made) << each.major << "." << each.release;
  }
}

TEST_F(SyclLayerLevelZero, Release72OfVersion12IsReadFromABinary) {
  level_zero_driver::native_binary(tarn_test::newer_binary({{1, 1272}, {3, 0x300}}));
  sycl::queue one = queue(release_72);
  EXPECT_EQ(get_architecture(&status, &one), TARN_GPU_ARCH_YEW);
  EXPECT_EQ(get_device_flags(&status, &one), 1U);  // family 8
  tarn_gpu_arch_t arch = TARN_GPU_ARCH_UNKNOWN;
  std::uint32_t stepping = 0;
  get_architecture_and_stepping(&status, &one, &arch, &stepping);
  EXPECT_EQ(arch, TARN_GPU_ARCH_YEW);
  EXPECT_EQ(stepping, 3U);
  EXPECT_EQ(compilations(), 1);
}

TEST_F(SyclLayerLevelZero, AFailingQueryForTheVersionIsAnsweredByABinary) {
  level_zero_driver::native_binary(tarn_test::newer_binary({{2, 3080}, {3, 0x300}}));
  sycl::queue one = queue(in_parts);
  get_eu_count(&one);  // what comes next is the detection
  level_zero_driver::fail("zeDeviceGetProperties", 0, ZE_RESULT_ERROR_DEVICE_LOST);
  EXPECT_EQ(get_architecture(&status, &one), TARN_GPU_ARCH_PINE);
  EXPECT_EQ(get_device_flags(&status, &one), 3U);
  EXPECT_EQ(level_zero_driver::failures_left(), 0);
}

TEST_F(SyclLayerLevelZero, ABinaryOfNoDeviceIsUnknown) {
  sycl::queue one = queue(silent);  // its binary is the module itself
  EXPECT_EQ(get_architecture(&status, &one), TARN_GPU_ARCH_UNKNOWN);
  EXPECT_EQ(get_device_flags(&status, &one), 0U);
  EXPECT_EQ(compilations(), 1);
}

TEST_F(SyclLayerLevelZero, WhateverFailsInDetectionTheArchitectureIsUnknownForGood) {
  struct step {
    const char* function;
    int after;
  };
  constexpr step steps[] = {{"zeModuleCreate", 0},
                            {"zeModuleGetNativeBinary", 0},
                            {"zeModuleGetNativeBinary", 1},
                            {"zeModuleDestroy", 0}};
  for (const step& failing : steps) {
    sycl::queue one = queue(silent);
    sycl_tables().clear();
    level_zero_driver::native_binary(tarn_test::newer_binary({{2, 3080}}));
    const std::vector<int> before = level_zero_driver::objects();
    level_zero_driver::fail(failing.function, failing.after, ZE_RESULT_ERROR_UNKNOWN);
    EXPECT_EQ(get_architecture(&status, &one), TARN_GPU_ARCH_UNKNOWN) << failing.function;
    EXPECT_EQ(level_zero_driver::failures_left(), 0) << failing.function;
    EXPECT_EQ(get_architecture(&status, &one), TARN_GPU_ARCH_UNKNOWN) << failing.function;
    std::vector<int> expected = before;
    if (std::string(failing.function) == "zeModuleDestroy") {  // as the driver had it
      ++expected[static_cast<std::size_t>(level_zero_driver::object::module)];
    }
    EXPECT_EQ(level_zero_driver::objects(), expected) << failing.function;
  }
}

TEST_F(SyclLayerLevelZero, WithoutMemoryForARecordMinus6IsThrown) {
  sycl::queue one = queue(in_parts);
  for (const int after : {2, 3}) {
    sycl_tables().clear();
    const serv_memory::failure failing(after);
    expect_error(sycl::errc::runtime, "OpenCL error -6", [&] { get_tile_count(&one); });
    EXPECT_TRUE(failing.happened());
  }
  EXPECT_EQ(get_tile_count(&one), parts);
}

TEST_F(SyclLayerLevelZero, ThreadsThatComeFirstAtOnceGetTheSame) {
  sycl::queue shared = queue(in_parts);
  const int asked = level_zero_driver::calls("zeDeviceGetProperties");
  std::atomic<bool> go{false};
  std::atomic<int> wrong{0};
  std::vector<std::thread> threads;
  for (int t = 0; t < 16; ++t) {
    threads.emplace_back([&] {
      sycl::queue mine = shared;
      int unused = 0;
      while (!go) {
      }
      wrong += get_device_id(&unused, &mine) != handle(in_parts);
      wrong += get_tile_count(&mine) != parts;
      wrong += get_architecture(&unused, &mine) != TARN_GPU_ARCH_YEW;
      wrong += get_device_flags(&unused, &mine) != 3;
    });
  }
  go = true;
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(level_zero_driver::calls("zeDeviceGetProperties"), asked + 1);
  EXPECT_EQ(sycl_tables().infos.count, 1);
}

}  // namespace
