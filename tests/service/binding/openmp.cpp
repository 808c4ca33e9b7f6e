// SPDX-License-Identifier: Apache-2.0
// The OpenMP offload runtime bound late.
#include <gtest/gtest.h>

#include "omptarget.hpp"
#include "openmp_binding.hpp"
#include "support.hpp"

namespace {

namespace gpu = kestrel::tarn::gpu;
using namespace binding_test;

const texts names = {
#define TARN_NAME(name) #name,
#include "openmp_names.def"
};

TEST(OpenmpBinding, FourNamesInTheirOrder) {
  ASSERT_EQ(names.size(), 4U);
  ASSERT_EQ(gpu::openmp_runtime::record.size, names.size());
  for (std::size_t i = 0; i < names.size(); ++i) {
    EXPECT_EQ(gpu::openmp_runtime::record.names[i], names[i]) << i;
  }
  EXPECT_STREQ(gpu::openmp_runtime::record.library, "libomptarget.so");
}

TEST(OpenmpBinding, EachFunctionPassesItsArgumentsAndItsResultOn) {
  std::size_t i = 0;
#define TARN_NAME(name) \
  expect_passed_on(#name, gpu::openmp_runtime::functions[i++], gpu::omp_interop::name);
#include "openmp_names.def"
  EXPECT_EQ(i, 4U);
}

TEST(OpenmpBinding, AWholeLibraryIsBoundByTheFirstCall) {
  const core_test::outcome outcome = run("openmp", "call_all", "whole");
  EXPECT_EQ(outcome.exit_code, 0);
  EXPECT_EQ(outcome.err, "");
  EXPECT_EQ(outcome.out,
            "__tgt_get_interop_property 0\nomp_get_interop_int 1\nomp_get_interop_ptr 2\n"
            "omp_get_interop_str 3\n");
  EXPECT_EQ(run("openmp", "bind", "whole").out, bind_lines(0, 4, 4));
}

TEST(OpenmpBinding, BindingStopsSilentlyAtTheFirstMissingName) {
  for (std::size_t lacking = 0; lacking < names.size(); ++lacking) {
    const core_test::outcome outcome = run("openmp", "bind", "openmp_lacks_" + names[lacking]);
    EXPECT_EQ(outcome.exit_code, 0);
    EXPECT_EQ(outcome.err, "");
    EXPECT_EQ(outcome.out, bind_lines(-1, lacking, 4)) << names[lacking];
  }
}

TEST(OpenmpBinding, WithoutTheLibraryACallTellsItsNameAndEndsTheProcess) {
  EXPECT_EQ(run_without_libraries("openmp", "bind").out, bind_lines(-1, 0, 4));
  const core_test::outcome outcome = run_without_libraries("openmp", "call_first");
  EXPECT_EQ(outcome.exit_code, 2);
  EXPECT_EQ(outcome.out, missing_line("__tgt_get_interop_property"));
  EXPECT_EQ(outcome.err, "");
}

TEST(OpenmpBinding, EveryCallTellsItsNameIfAnExitHookKeepsTheProcessAlive) {
  std::string expected;
  for (const std::string& name : names) {
    expected += missing_line(name) + "kept alive, not ended with 2\n" + name + " 2\n";
  }
  const core_test::outcome outcome = run_without_libraries("openmp", "call_all");
  EXPECT_EQ(outcome.out, expected);
  EXPECT_EQ(outcome.err, "");
}

TEST(OpenmpBinding, ThreadsThatCallFirstAtTheSameTimeFindTheSame) {
  const core_test::outcome outcome = run("openmp", "call_from_threads", "whole");
  EXPECT_EQ(outcome.exit_code, 0) << outcome.err;
  EXPECT_EQ(outcome.out, "16 threads: 0 1 2 3\n");
}

TEST(OpenmpBinding, ADoubleOfTheRuntimeAnswersThroughTheBoundFunctions) {
  omptarget::interop object;
  int queue = 0;
  object.set_native(7, &queue);
  object.set_int(-1, 3);
  object.set_ptr(-7, &object);
  object.set_str(-2, "opencl");
  namespace omp = gpu::omp_interop;
  void* value = nullptr;
  EXPECT_EQ(omp::__tgt_get_interop_property(object.handle(), 7, &value), 0);
  EXPECT_EQ(value, &queue);
  int status = 77;
  EXPECT_EQ(omp::omp_get_interop_int(object.handle(), -1, &status), 3);
  EXPECT_EQ(status, 0);
  EXPECT_EQ(omp::omp_get_interop_ptr(object.handle(), -7, &status), &object);
  EXPECT_EQ(status, 0);
  EXPECT_STREQ(omp::omp_get_interop_str(object.handle(), -2, &status), "opencl");
  EXPECT_EQ(status, 0);
  EXPECT_EQ(gpu::bind_openmp(), 0);
}

}  // namespace
