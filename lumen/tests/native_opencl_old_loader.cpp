// SPDX-License-Identifier: Apache-2.0
// Where the OpenCL loader lacks a function, its backend is not there, and all others are.
#include <dlfcn.h>

#include "every_device.hpp"

namespace {

constexpr auto opencl = sycl::backend::opencl;

class opencl_old_loader : public testing::Test {
 protected:
  // The loader that lumen would open is the one of this test.
  void SetUp() override {
    void* const library = dlopen("libOpenCL.so.1", RTLD_NOW);
    ASSERT_NE(library, nullptr);
    ASSERT_NE(dlsym(library, "clGetPlatformIDs"), nullptr);
    ASSERT_EQ(dlsym(library, "clSVMAlloc"), nullptr);
  }
};

TEST_F(opencl_old_loader, has_no_devices) {
  const std::vector<sycl::device> devices = sycl::device::get_devices();
  EXPECT_EQ(devices.size(), 2U);
  for (const sycl::device& each : devices) {
    EXPECT_EQ(each.get_backend(), sycl::backend::host);
  }
}

TEST_F(opencl_old_loader, handles_are_refused) {
  int object = 0;
  EXPECT_EQ(code_of([&] { sycl::make_device<opencl>(reinterpret_cast<_cl_device_id*>(&object)); }),
            sycl::errc::platform);
}

TEST_F(opencl_old_loader, other_devices_work) {
  sycl::queue queue(sycl::gpu_selector_v);
  const shared_array<int> values(10, queue, 77);
  queue.fill(values.data(), 5, 10).wait_and_throw();
  EXPECT_EQ(values.values(), std::vector<int>(10, 5));
}

}  // namespace
