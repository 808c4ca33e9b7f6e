// SPDX-License-Identifier: Apache-2.0
// OpenCL counterparts of Level Zero devices: how they are found, shared, and given back.
#include "cl_device_context.hpp"

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <thread>
#include <vector>

#include "clean_up.hpp"
#include "level_zero_driver.hpp"
#include "level_zero_loader.hpp"
#include "opencl_gpu.hpp"
#include "serv_memory.hpp"
#include "sycl_queues.hpp"
#include "tarn_gpu.h"
#include "tarn_sycl_device.hpp"

namespace {

using namespace kestrel::tarn::gpu;
using kestrel::tarn::service::backend_code;
using opencl_layer::object;

constexpr std::size_t alike = 33;  // devices with the numbers of the OpenCL devices
constexpr std::size_t other_vendor = alike;
constexpr std::size_t other_clock = alike + 1;
constexpr std::size_t no_gpu = alike + 2;
constexpr std::size_t all_devices = alike + 3;

std::vector<level_zero_driver::device_description> descriptions() {
  std::vector<level_zero_driver::device_description> all(all_devices);
  ++all[other_vendor].vendor_id;
  ++all[other_clock].core_clock_rate;
  all[no_gpu].type = ZE_DEVICE_TYPE_FPGA;
  return all;
}

class ClDeviceContext : public OpenCLGpu {
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
    OpenCLGpu::SetUp();
    if (IsSkipped()) {
      return;
    }
    for (const sycl::device& each : sycl::device::get_devices()) {
      if (kestrel::tarn::service::code_of(each.get_backend()) == backend_code::level_zero) {
        devices.push_back(each);
      }
    }
    ASSERT_EQ(devices.size(), all_devices);
    const level_zero_driver::device_description plain;
    opencl_layer::answer(CL_DEVICE_VENDOR_ID, cl_uint{plain.vendor_id});
    opencl_layer::answer(CL_DEVICE_MAX_CLOCK_FREQUENCY, cl_uint{plain.core_clock_rate});
    level_zero_driver::reset();
    tarn_sycl_destructor();
    before = living();
  }
  void TearDown() override {
    tarn_sycl_destructor();
    sycl_tables().clear();
    OpenCLGpu::TearDown();
    EXPECT_EQ(status, 77);
  }

  opencl_counterpart counterpart(std::size_t index) {
    sycl::queue queue = queue_on(devices[index]);
    opencl_counterpart found{};
    tarn_gpu_get_cl_device_context(&status, &queue, &found.device, &found.context);
    return found;
  }
  void expect_none(std::size_t index, const std::string& text = "OpenCL error -1") {
    const std::vector<int> living_before = living();
    expect_error(sycl::errc::runtime, text, [&] { counterpart(index); });
    EXPECT_EQ(living(), living_before);
  }
  /// Contexts that the table holds.
  int contexts() const {
    return opencl_layer::objects(object::context) -
           before[static_cast<std::size_t>(object::context)];
  }
  static std::vector<cl_device_id> opencl_gpus() {
    cl_platform_id platform = nullptr;
    opencl_loader::get().clGetPlatformIDs(1, &platform, nullptr);
    cl_uint count = 0;
    opencl_loader::get().clGetDeviceIDs(platform, CL_DEVICE_TYPE_GPU, 0, nullptr, &count);
    std::vector<cl_device_id> all(count);
    opencl_loader::get().clGetDeviceIDs(platform, CL_DEVICE_TYPE_GPU, count, all.data(), nullptr);
    return all;
  }

  std::vector<sycl::device> devices;
  int status = 77;  // this layer does not touch it
};

cl_device_id device_of(cl_context context) {
  cl_device_id found = nullptr;
  EXPECT_EQ(opencl_loader::get().clGetContextInfo(context, CL_CONTEXT_DEVICES, sizeof found, &found,
                                                  nullptr),
            CL_SUCCESS);
  return found;
}

TEST_F(ClDeviceContext, IsTheFirstDeviceWithBothNumbersAndAContextOverIt) {
  const opencl_counterpart found = counterpart(0);
  EXPECT_EQ(found.device, opencl_gpus().at(0));
  ASSERT_NE(found.context, nullptr);
  EXPECT_EQ(device_of(found.context), found.device);
  EXPECT_EQ(contexts(), 1);
}

TEST_F(ClDeviceContext, IsTheSameForEveryCall) {
  const opencl_counterpart found = counterpart(0);
  const int platforms = opencl_layer::calls("clGetPlatformIDs");
  const opencl_counterpart again = counterpart(0);
  EXPECT_EQ(again.device, found.device);
  EXPECT_EQ(again.context, found.context);
  EXPECT_EQ(opencl_layer::calls("clGetPlatformIDs"), platforms);
  EXPECT_EQ(contexts(), 1);
}

TEST_F(ClDeviceContext, OfTwoLikeDevicesIsOneDeviceWithAContextForEach) {
  const opencl_counterpart first = counterpart(0);
  const opencl_counterpart second = counterpart(1);
  EXPECT_EQ(first.device, second.device);
  EXPECT_NE(first.context, second.context);
  EXPECT_EQ(contexts(), 2);
}

TEST_F(ClDeviceContext, EitherPlaceMayBeMissing) {
  sycl::queue queue = queue_on(devices[0]);
  tarn_gpu_get_cl_device_context(&status, &queue, nullptr, nullptr);
  opencl_counterpart found{};
  tarn_gpu_get_cl_device_context(&status, &queue, &found.device, nullptr);
  tarn_gpu_get_cl_device_context(&status, &queue, nullptr, &found.context);
  EXPECT_EQ(found.device, counterpart(0).device);
  EXPECT_EQ(found.context, counterpart(0).context);
}

TEST_F(ClDeviceContext, BothNumbersHaveToBeEqual) {
  expect_none(other_vendor);
  expect_none(other_clock);
  opencl_layer::answer(CL_DEVICE_VENDOR_ID, descriptions()[other_vendor].vendor_id);
  EXPECT_NE(counterpart(other_vendor).device, nullptr);
  expect_none(0);
}

TEST_F(ClDeviceContext, OnlyAGpuHasACounterpart) {
  expect_none(no_gpu);
}

TEST_F(ClDeviceContext, ADeviceThatDoesNotTellItsNumbersHasNone) {
  {
    sycl::queue queue = queue_on(devices[0]);
    get_device_id(&status, &queue);
    level_zero_driver::fail("zeDeviceGetProperties", 0, ZE_RESULT_ERROR_DEVICE_LOST);
    expect_error(sycl::errc::runtime, "OpenCL error -1",
                 [&] { tarn_gpu_get_cl_device_context(&status, &queue, nullptr, nullptr); });
    EXPECT_EQ(level_zero_driver::failures_left(), 0);
  }
  EXPECT_NE(counterpart(0).device, nullptr);  // a failure is not remembered
}

TEST_F(ClDeviceContext, ADeviceThatGetsNoContextIsPassedOver) {
  ASSERT_GE(opencl_gpus().size(), 2U);
  opencl_layer::fail("clCreateContext", 0, CL_OUT_OF_HOST_MEMORY);
  const opencl_counterpart found = counterpart(0);
  EXPECT_EQ(found.device, opencl_gpus()[1]);
  EXPECT_EQ(device_of(found.context), opencl_gpus()[1]);
  EXPECT_EQ(contexts(), 1);
}

TEST_F(ClDeviceContext, ADeviceThatFailsAQueryIsPassedOver) {
  for (const int after : {0, 1}) {  // the vendor, the clock
    opencl_layer::fail("clGetDeviceInfo", after, -30);
    EXPECT_EQ(counterpart(static_cast<std::size_t>(after)).device, opencl_gpus().at(1));
  }
}

TEST_F(ClDeviceContext, WithoutPlatformsDevicesOrContextsThereIsNone) {
  for (const char* const function : {"clGetPlatformIDs", "clGetDeviceIDs", "clCreateContext"}) {
    const int called = opencl_layer::calls(function);
    opencl_layer::fail_always(function, -6);
    expect_none(0);
    EXPECT_GT(opencl_layer::calls(function), called);
    opencl_layer::reset();
    const level_zero_driver::device_description plain;
    opencl_layer::answer(CL_DEVICE_VENDOR_ID, cl_uint{plain.vendor_id});
    opencl_layer::answer(CL_DEVICE_MAX_CLOCK_FREQUENCY, cl_uint{plain.core_clock_rate});
  }
  EXPECT_NE(counterpart(0).device, nullptr);
}

TEST_F(ClDeviceContext, TheTableBeginsWith16AndDoubles) {
  std::vector<opencl_counterpart> found;
  std::vector<std::size_t> bytes;
  for (std::size_t i = 0; i < alike; ++i) {
    sycl::queue queue = queue_on(devices[i]);
    get_backend(&queue);  // the device's own tables first
    found.emplace_back();
    tarn_gpu_get_cl_device_context(&status, &queue, &found[i].device, &found[i].context);
    if (i == 0 || i == 16 || i == 32) {
      bytes.push_back(serv_memory::last_realloc().size);
    }
  }
  constexpr std::size_t entry = 3 * sizeof(void*);
  EXPECT_EQ(bytes, (std::vector<std::size_t>{16 * entry, 32 * entry, 64 * entry}));
  EXPECT_EQ(contexts(), static_cast<int>(alike));
  for (std::size_t i = 0; i < alike; ++i) {
    EXPECT_EQ(counterpart(i).context, found[i].context);
  }
}

TEST_F(ClDeviceContext, WithoutMemoryMinus6IsThrown) {
  sycl::queue queue = queue_on(devices[0]);
  get_backend(&queue);
  for (const int after : {0, 1}) {  // the list of callbacks, the table
    tarn_sycl_destructor();
    const serv_memory::failure failing(after);
    expect_error(sycl::errc::runtime, "OpenCL error -6",
                 [&] { tarn_gpu_get_cl_device_context(&status, &queue, nullptr, nullptr); });
    EXPECT_TRUE(failing.happened());
    EXPECT_EQ(contexts(), 0);
  }
  EXPECT_NE(counterpart(0).context, nullptr);
}

TEST_F(ClDeviceContext, ACleanUpReleasesAllContextsAndNewOnesCanBeMade) {
  for (int round = 0; round < 3; ++round) {
    const std::int64_t blocks = serv_memory::live_blocks();
    int unused = 0;
    for (std::size_t i = 0; i < 3; ++i) {
      const auto handle =
          static_cast<ze_device_handle_t>(kestrel::tarn::service::native_of(devices[i]));
      EXPECT_NE(counterpart_of(&unused, handle).context, nullptr);
    }
    EXPECT_EQ(unused, 0);
    EXPECT_EQ(contexts(), 3);
    EXPECT_EQ(serv_memory::live_blocks(), blocks + 2);  // the table, the list of callbacks
    tarn_sycl_destructor();
    EXPECT_EQ(contexts(), 0);
    EXPECT_EQ(serv_memory::live_blocks(), blocks);
  }
}

TEST_F(ClDeviceContext, ThreadsThatComeFirstAtOnceGetTheSame) {
  std::atomic<bool> go{false};
  std::vector<opencl_counterpart> found(16);
  std::vector<std::thread> threads;
  for (std::size_t t = 0; t < found.size(); ++t) {
    threads.emplace_back([&, t] {
      sycl::queue queue = queue_on(devices[t % 2]);
      int unused = 0;
      while (!go) {
      }
      tarn_gpu_get_cl_device_context(&unused, &queue, &found[t].device, &found[t].context);
    });
  }
  go = true;
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(contexts(), 2);
  for (std::size_t t = 0; t < found.size(); ++t) {
    EXPECT_EQ(found[t].context, found[t % 2].context);
    EXPECT_NE(found[t].context, nullptr);
  }
}

void tell_contexts(void*) {
  std::fprintf(stderr, "contexts: %d\n", opencl_layer::objects(object::context));
}

/// A driver is loaded after a callback was registered, and has its own to do at the end.
void end_with_a_context() {
  register_sycl_destructor(tell_contexts);  // is called after the table's own
  std::atexit([] { std::fputs("the driver goes\n", stderr); });
  level_zero_driver::devices(std::vector<level_zero_driver::device_description>(1));
  opencl_loader::first_gpu();
  int status = 0;
  opencl_layer::answer(CL_DEVICE_VENDOR_ID, level_zero_driver::device_description().vendor_id);
  opencl_layer::answer(CL_DEVICE_MAX_CLOCK_FREQUENCY,
                       level_zero_driver::device_description().core_clock_rate);
  counterpart_of(&status, level_zero_loader::first_device().device);
  tell_contexts(nullptr);
  std::exit(status);
}

TEST(ClDeviceContextAtExit, IsReleasedBeforeTheDriverGoes) {
  testing::GTEST_FLAG(death_test_style) = "threadsafe";  // the child is a new process
  if (!testing::internal::InDeathTestChild() &&
      (level_zero_loader::find() == nullptr || opencl_loader::first_gpu() == nullptr)) {
    GTEST_SKIP() << "no Level Zero loader, no OpenCL loader or no PoCL";
  }
  EXPECT_EXIT(end_with_a_context(), testing::ExitedWithCode(0),
              "contexts: 1\ncontexts: 0\nthe driver goes\n$");
}

}  // namespace
