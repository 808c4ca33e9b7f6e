// SPDX-License-Identifier: Apache-2.0
// OpenCL bound late: the names and their order, calls, and what a machine without it sees.
#include <dlfcn.h>

#include <gtest/gtest.h>

#include "opencl_binding.hpp"
#include "opencl_gpu_layer.hpp"
#include "opencl_loader.hpp"
#include "support.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;
using namespace binding_test;

const texts names = {
#define TARN_NAME(name) #name,
#include "opencl_names.def"
};

/// What the child prints for a call of each function, by `result` of its place.
template <class Line>
std::string for_each_name(const Line& line) {
  std::string text;
  for (std::size_t i = 0; i < names.size(); ++i) {
    text += line(names[i], i);
  }
  return text;
}

bool gives_nothing(const std::string& name) {
  return name == "clSVMFree";
}

TEST(OpenclBinding, NinetyEightNamesInTheirOrder) {
  ASSERT_EQ(names.size(), 98U);
  ASSERT_EQ(gpu::opencl_runtime::record.size, names.size());
  for (std::size_t i = 0; i < names.size(); ++i) {
    EXPECT_EQ(gpu::opencl_runtime::record.names[i], names[i]) << i;
  }
  EXPECT_STREQ(gpu::opencl_runtime::record.library, "libOpenCL.so.1");
}

TEST(OpenclBinding, EachFunctionPassesItsArgumentsAndItsResultOn) {
  std::size_t i = 0;
#define TARN_NAME(name) expect_passed_on(#name, gpu::opencl_runtime::functions[i++], gpu::cl::name);
#include "opencl_names.def"
  EXPECT_EQ(i, 98U);
}

TEST(OpenclBinding, AWholeLibraryIsBoundByTheFirstCall) {
  const core_test::outcome outcome = run("opencl", "call_all_and_count", "whole");
  EXPECT_EQ(outcome.exit_code, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out, for_each_name([](const std::string& name, std::size_t i) {
                           return name + " " +
                                  (gives_nothing(name) ? "nothing" : std::to_string(i)) + "\n";
                         }) + for_each_name([](const std::string& name, std::size_t) {
                           return name + " called 1 with 0\n";
                         }));
  EXPECT_EQ(run("opencl", "bind", "whole").out, bind_lines(0, 98, 98));
}

TEST(OpenclBinding, BindingStopsSilentlyAtTheFirstMissingName) {
  const core_test::outcome outcome = run("opencl", "bind", "opencl_lacks_clFinish");
  EXPECT_EQ(outcome.exit_code, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(names[40], "clFinish");
  EXPECT_EQ(outcome.out, bind_lines(-1, 40, 98));
}

TEST(OpenclBinding, WhatWasFoundBeforeTheMissingNameCanBeCalled) {
  const core_test::outcome outcome = run("opencl", "call_all", "opencl_lacks_clFinish");
  EXPECT_EQ(outcome.out, for_each_name([](const std::string& name, std::size_t i) {
              if (i < 40) {
                return name + " " + std::to_string(i) + "\n";
              }
              return missing_line(name) + "kept alive, not ended with 2\n" + name +
                     (gives_nothing(name) ? " nothing\n" : " 2\n");
            }));
}

TEST(OpenclBinding, WithoutTheLibraryACallTellsItsNameAndEndsTheProcess) {
  EXPECT_EQ(run_without_libraries("opencl", "bind").out, bind_lines(-1, 0, 98));
  const core_test::outcome outcome = run_without_libraries("opencl", "call_first");
  EXPECT_EQ(outcome.exit_code, 2);
  EXPECT_EQ(outcome.out, missing_line("clGetSupportedImageFormats"));
  EXPECT_EQ(outcome.err, "");
}

TEST(OpenclBinding, EveryCallTellsItsNameIfAnExitHookKeepsTheProcessAlive) {
  const core_test::outcome outcome = run_without_libraries("opencl", "call_all");
  EXPECT_EQ(outcome.exit_code, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out, for_each_name([](const std::string& name, std::size_t) {
              return missing_line(name) + "kept alive, not ended with 2\n" + name +
                     (gives_nothing(name) ? " nothing\n" : " 2\n");
            }));
}

TEST(OpenclBinding, ThreadsThatCallFirstAtTheSameTimeFindTheSame) {
  const core_test::outcome outcome = run("opencl", "call_from_threads", "whole");
  EXPECT_EQ(outcome.exit_code, 0) << outcome.err;
  EXPECT_EQ(outcome.out, "16 threads:" + for_each_name([](const std::string& name, std::size_t i) {
                           return gives_nothing(name) ? " nothing" : " " + std::to_string(i);
                         }) + "\n");
}

TEST(OpenclBinding, ThreadsThatFindNothingAllSaySo) {
  const core_test::outcome outcome = run_without_libraries("opencl", "call_from_threads");
  EXPECT_EQ(outcome.exit_code, 0) << outcome.err;
  EXPECT_EQ(core_test::lines_with(outcome.out, "has the function 'clFinish'"), 16);
  EXPECT_EQ(core_test::lines_with(outcome.out, "16 threads: 2 2 2"), 1);
}

TEST(OpenclBinding, TheMachinesOwnLibraryHasAllNames) {
  const core_test::outcome outcome = run("opencl", "bind", "");
  if (dlopen("libOpenCL.so.1", RTLD_NOW) == nullptr) {
    EXPECT_EQ(outcome.out, bind_lines(-1, 0, 98));
    GTEST_SKIP() << "no OpenCL loader";
  }
  EXPECT_EQ(outcome.out, bind_lines(0, 98, 98));
  EXPECT_EQ(outcome.err, "");
}

TEST(OpenclBinding, TheMachinesDeviceAnswersThroughTheBoundFunctions) {
  const cl_device_id device = opencl_loader::first_gpu();
  if (device == nullptr) {
    GTEST_SKIP() << "no PoCL";
  }
  namespace cl = gpu::cl;
  cl_uint units = 0;
  cl_uint same_units = 1;
  EXPECT_EQ(opencl_loader::get().clGetDeviceInfo(device, CL_DEVICE_MAX_COMPUTE_UNITS, sizeof units,
                                                 &units, nullptr),
            CL_SUCCESS);
  const int calls = opencl_layer::calls("clGetDeviceInfo");
  EXPECT_EQ(cl::clGetDeviceInfo(device, CL_DEVICE_MAX_COMPUTE_UNITS, sizeof same_units, &same_units,
                                nullptr),
            CL_SUCCESS);
  EXPECT_EQ(same_units, units);
  EXPECT_EQ(opencl_layer::calls("clGetDeviceInfo"), calls + 1);

  cl_int status = 77;
  const cl_context context = cl::clCreateContext(nullptr, 1, &device, nullptr, nullptr, &status);
  ASSERT_EQ(status, CL_SUCCESS);
  EXPECT_EQ(opencl_layer::objects(opencl_layer::object::context), 1);
  EXPECT_EQ(cl::clReleaseContext(context), CL_SUCCESS);
  EXPECT_EQ(opencl_layer::objects(opencl_layer::object::context), 0);
}

TEST(OpenclBinding, OpenclAndTheOffloadRuntimeAreBoundTogether) {
  EXPECT_EQ(run("opencl", "bind_both", "whole").out, "0\n");
  EXPECT_EQ(run_without_libraries("opencl", "bind_both").out, "-1\n");
  EXPECT_EQ(run("opencl", "bind_both", "opencl_lacks_clFinish").out, "-1\n");
  EXPECT_EQ(run("opencl", "bind_both", "openmp_lacks_omp_get_interop_str:" TARN_STUBS "/whole").out,
            "-2\n");
}

}  // namespace
