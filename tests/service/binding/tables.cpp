// SPDX-License-Identifier: Apache-2.0
// The table that all bindings share, with a library that lacks any one of the names.
#include <algorithm>
#include <array>
#include <atomic>
#include <cstddef>
#include <dlfcn.h>
#include <iterator>
#include <tarn_level_zero.h>

#include <gtest/gtest.h>

#include "detection_calls.hpp"
#include "late_binding.hpp"
#include "level_zero_binding.hpp"
#include "native_library.hpp"
#include "opencl_binding.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;

constexpr const char* all_names[] = {
#define TARN_NAME(name) #name,
#include "opencl_names.def"
};
constexpr std::size_t size = std::size(all_names);
constexpr char library[] = "libOpenCL.so.1";

/// A table of names that are those of a whole library, but for one.
struct table {
  std::array<const char*, size> names;
  std::array<std::atomic<void*>, size> functions{};
  gpu::binding_record record{library, names.data(), functions.data(), size};

  explicit table(std::size_t missing = size) {
    std::copy(std::begin(all_names), std::end(all_names), names.begin());
    if (missing < size) {
      names[missing] = "clNoSuchFunction";
    }
  }
};

class LateBinding : public testing::Test {
 protected:
  LateBinding() { gpu::set_native_folders(TARN_STUBS "/whole/", TARN_STUBS "/whole/"); }
  void* const whole = dlopen(TARN_STUBS "/whole/libOpenCL.so.1", RTLD_NOW);
};

TEST_F(LateBinding, StopsAtTheFirstMissingNameWhicheverItIs) {
  ASSERT_NE(whole, nullptr);
  for (std::size_t missing = 0; missing < size; ++missing) {
    table tested(missing);
    EXPECT_EQ(gpu::bind_under_lock(tested.record), -1);
    EXPECT_EQ(tested.record.state.load(), gpu::binding_state::failed);
    for (std::size_t i = 0; i < size; ++i) {
      EXPECT_EQ(tested.functions[i].load(), i < missing ? dlsym(whole, all_names[i]) : nullptr)
          << i << " of " << missing;
    }
  }
}

TEST_F(LateBinding, FailureIsRememberedThoughTheNameComesLater) {
  table tested(1);
  EXPECT_EQ(gpu::bind_under_lock(tested.record), -1);
  tested.names[1] = all_names[1];
  EXPECT_EQ(gpu::bind_under_lock(tested.record), -1);
  EXPECT_EQ(tested.functions[1].load(), nullptr);
}

TEST_F(LateBinding, SuccessIsRememberedThoughTheLibraryGoes) {
  table tested;
  EXPECT_EQ(gpu::bind_under_lock(tested.record), 0);
  EXPECT_EQ(tested.record.state.load(), gpu::binding_state::bound);
  tested.record.library = "libtarn_no_such_library.so";
  EXPECT_EQ(gpu::bind_under_lock(tested.record), 0);
  EXPECT_EQ(tested.functions[size - 1].load(), dlsym(whole, all_names[size - 1]));
}

TEST_F(LateBinding, AMissingLibraryHasNoNames) {
  table tested;
  tested.record.library = "libtarn_no_such_library.so";
  EXPECT_EQ(gpu::bind_under_lock(tested.record), -1);
  EXPECT_EQ(tested.functions[0].load(), nullptr);
  EXPECT_EQ(gpu::look_up(tested.record, nullptr, 3, size), 3U);
}

TEST(DetectionCalls, AreTheBoundFunctionsAndBindNothing) {
  const auto& calls = gpu::bound_detection_calls();
  EXPECT_EQ(calls.opencl.clGetDeviceInfo, gpu::cl::clGetDeviceInfo);
  EXPECT_EQ(calls.opencl.clCreateProgramWithSource, gpu::cl::clCreateProgramWithSource);
  EXPECT_EQ(calls.opencl.clCreateProgramWithBinary, gpu::cl::clCreateProgramWithBinary);
  EXPECT_EQ(calls.opencl.clBuildProgram, gpu::cl::clBuildProgram);
  EXPECT_EQ(calls.opencl.clGetProgramInfo, gpu::cl::clGetProgramInfo);
  EXPECT_EQ(calls.opencl.clReleaseProgram, gpu::cl::clReleaseProgram);
  EXPECT_EQ(calls.level_zero.zeDeviceGetProperties, tarn_zeDeviceGetProperties);
  EXPECT_EQ(calls.level_zero.zeModuleCreate, tarn_zeModuleCreate);
  EXPECT_EQ(calls.level_zero.zeModuleGetNativeBinary, tarn_zeModuleGetNativeBinary);
  EXPECT_EQ(calls.level_zero.zeModuleDestroy, tarn_zeModuleDestroy);
  EXPECT_EQ(gpu::opencl_runtime::record.state.load(), gpu::binding_state::not_tried);
  EXPECT_EQ(gpu::level_zero_runtime::record.state.load(), gpu::binding_state::not_tried);
}

}  // namespace
