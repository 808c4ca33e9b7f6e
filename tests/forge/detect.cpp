// SPDX-License-Identifier: Apache-2.0
// detect_hw against scripted drivers: which calls it makes, in which order, and what each failure
// becomes. Programs and modules are given back on every road.
#include <cstdint>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "detect_hw.hpp"
#include "exceptions.hpp"
#include "fake_drivers.hpp"

namespace {

using namespace tarn_test;
using namespace kestrel::tarn::forge;
using names = std::vector<std::string>;

constexpr native_backend both_backends[] = {native_backend::opencl, native_backend::level_zero};

const names asking_opencl = {"clGetDeviceInfo"};
const names compiling_opencl = {"clGetDeviceInfo",  "clCreateProgramWithSource", "clBuildProgram",
                                "clGetProgramInfo", "clGetProgramInfo",          "clGetProgramInfo",
                                "clGetProgramInfo", "clReleaseProgram"};
const names asking_level_zero = {"zeDeviceGetProperties"};
const names compiling_level_zero = {"zeDeviceGetProperties", "zeModuleCreate",
                                    "zeModuleGetNativeBinary", "zeModuleGetNativeBinary",
                                    "zeModuleDestroy"};

std::uint32_t ip_word(std::uint32_t major, std::uint32_t release, std::uint32_t stepping) {
  return major << 22 | release << 14 | stepping;
}

class DetectHw : public testing::Test {
 protected:
  void SetUp() override {
    script = {};
    script.binary = tarn_test::newer_binary({{2, 3080}, {3, 0x300}});
  }
  void TearDown() override {
    EXPECT_EQ(script.mistakes, names());
    EXPECT_EQ(script.programs, 0);
  }

  static detected_hw detect(native_backend backend) {
    return detect_hw({&device_object, &context_object}, backend, {fake_opencl, fake_level_zero});
  }
  static void expect_found(const detected_hw& found, int hw, int family, std::uint32_t stepping) {
    EXPECT_EQ(found.hw, hw);
    EXPECT_EQ(found.family, family);
    EXPECT_EQ(found.stepping, stepping);
  }
};

TEST_F(DetectHw, TheDriversWordIsEnough) {
  script.knows_ip_version = true;
  script.ip_version = ip_word(12, 55, 4);
  expect_found(detect(native_backend::opencl), 6, 7, 4);
  EXPECT_EQ(script.calls, asking_opencl);
  script.calls.clear();
  expect_found(detect(native_backend::level_zero), 6, 7, 4);
  EXPECT_EQ(script.calls, asking_level_zero);
}

TEST_F(DetectHw, ABinaryTellsWhenTheDriverDoesNotKnow) {
  expect_found(detect(native_backend::opencl), 7, 10, 3);
  EXPECT_EQ(script.calls, compiling_opencl);
  EXPECT_EQ(script.source, "kernel void _forge_hw_detect(){}");
  EXPECT_EQ(script.options, "");
  script.calls.clear();
  expect_found(detect(native_backend::level_zero), 7, 10, 3);
  EXPECT_EQ(script.calls, compiling_level_zero);
  EXPECT_EQ(script.module.size(), 196U);
}

TEST_F(DetectHw, ABinaryTellsWhenTheWordIsNotKnown) {
  script.knows_ip_version = true;
  script.ip_version = ip_word(12, 72, 9);
  for (const native_backend backend : both_backends) {
    expect_found(detect(backend), 7, 10, 3);
  }
}

TEST_F(DetectHw, AQueryThatFailsIsNoAnswer) {
  script.knows_ip_version = true;
  script.ip_version = ip_word(20, 1, 1);
  script.failure = 0x78000001;
  for (const native_backend backend : both_backends) {
    script.calls.clear();
    script.failing_call =
        backend == native_backend::opencl ? "clGetDeviceInfo" : "zeDeviceGetProperties";
    expect_found(detect(backend), 7, 10, 3);
  }
}

TEST_F(DetectHw, ABinaryOfTheOlderFormat) {
  script.binary = older_binary({});
  for (const native_backend backend : both_backends) {
    expect_found(detect(backend), 4, 4, 6);
  }
}

TEST_F(DetectHw, AnUnknownBackendIsNotAsked) {
  expect_found(detect(native_backend::unknown), 0, 0, 0);
  EXPECT_EQ(script.calls, names());
}

TEST_F(DetectHw, TheBinaryOfTheQueuesDeviceIsTaken) {
  script.devices_before = 3;
  expect_found(detect(native_backend::opencl), 7, 10, 3);
}

TEST_F(DetectHw, AProgramThatDoesNotListTheDevice) {
  script.lists_device = false;
  for (const std::size_t others : {0, 2}) {
    script.devices_before = others;
    try {
      detect(native_backend::opencl);
      ADD_FAILURE() << others;
    } catch (const opencl_error& error) {
      EXPECT_EQ(error.status, -30);
    }
  }
}

TEST_F(DetectHw, EveryFailureOfOpenCLIsRaisedWithItsCode) {
  for (std::size_t i = 1; i < compiling_opencl.size(); ++i) {
    script.calls.clear();
    script.failing_call = compiling_opencl[i];
    script.failing_occurrence = i >= 3 && i <= 6 ? static_cast<int>(i) - 2 : 1;
    script.failure = -1000 - static_cast<std::int32_t>(i);
    try {
      detect(native_backend::opencl);
      ADD_FAILURE() << compiling_opencl[i];
    } catch (const opencl_error& error) {
      EXPECT_EQ(error.status, script.failure);
      EXPECT_EQ(error.what(), "An OpenCL error occurred: " + std::to_string(script.failure));
    }
    EXPECT_EQ(script.programs, 0) << compiling_opencl[i];
    // The program is released once, unless there was none.
    EXPECT_EQ(script.calls.back() == "clReleaseProgram", i > 1) << compiling_opencl[i];
  }
}

TEST_F(DetectHw, EveryFailureOfLevelZeroIsRaisedWithItsCode) {
  for (std::size_t i = 1; i < compiling_level_zero.size(); ++i) {
    script.calls.clear();
    script.failing_call = compiling_level_zero[i];
    script.failing_occurrence = i == 3 ? 2 : 1;
    script.failure = 0x70000001 + static_cast<std::int32_t>(i);
    try {
      detect(native_backend::level_zero);
      ADD_FAILURE() << compiling_level_zero[i];
    } catch (const level_zero_error& error) {
      EXPECT_EQ(error.status, static_cast<std::uint32_t>(script.failure));
      EXPECT_STREQ(error.what(), "A Level Zero error occurred.");
    }
    EXPECT_EQ(script.programs, 0) << compiling_level_zero[i];
    EXPECT_EQ(script.calls.back() == "zeModuleDestroy", i > 1) << compiling_level_zero[i];
  }
}

TEST_F(DetectHw, WhatABinaryRaisesPassesOut) {
  for (const native_backend backend : both_backends) {
    script.binary = {1, 2, 3};
    EXPECT_THROW(detect(backend), crate::bad_elf);
    script.binary.clear();
    EXPECT_THROW(detect(backend), crate::bad_elf);
    script.binary = elf_file({});
    EXPECT_THROW(detect(backend), crate::no_binary_section);
  }
}

}  // namespace
