// SPDX-License-Identifier: Apache-2.0
// The self-test of native kernels: its calls, its verdict, its warning, and that all it took is
// given back whatever fails. Code comes from a generator of the test's own.
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "fake_services.hpp"

namespace {

using namespace tarn_test;
using names = std::vector<std::string>;

const std::string warning =
    "TARN Warning: Incompatible OpenCL driver version. GPU performance may be reduced.\n";

const names whole_test = {"get_cl_device_context",
                          "get_binary_kernel",
                          "calloc_temp_buffer 1",
                          "calloc_temp_buffer 2",
                          "write_buffer",
                          "launch_kernel_3D",
                          "host_wait",
                          "is_non_zero",
                          "release_event",
                          "free_buffer 1",
                          "free_buffer 2",
                          "release_kernel"};
const names no_test = {"get_cl_device_context"};

byte_vector offer_body(kernel_interface&) {
  return counting(48, 0x31);
}

byte_vector fail(kernel_interface&) {
  throw std::runtime_error("generator");
}

class ForgeSelfTest : public testing::Test {
 protected:
  void SetUp() override {
    script = {};
    process_formats().prefer_elf = true;  // one call fewer to script: the container is our own
    process_formats().elf_confirmed = true;
  }
  void TearDown() override {
    EXPECT_EQ(services.mistakes, names());
    EXPECT_EQ(services.handed_out, 0);
    EXPECT_EQ(services.lock, 0);
    process_formats().prefer_elf = false;
    process_formats().elf_confirmed = false;
  }

  /// The verdict; what was printed goes to `printed`.
  bool ask(code_source generate = offer_body) {
    testing::internal::CaptureStdout();
    bool verdict = false;
    try {
      verdict = have_binary_kernels(&status, &services.queue_object, services, generate);
    } catch (...) {
      printed = testing::internal::GetCapturedStdout();
      throw;
    }
    printed = testing::internal::GetCapturedStdout();
    return verdict;
  }

  void expect_stored(bool usable) const {
    EXPECT_TRUE(services.checked);
    EXPECT_EQ(services.usable, usable);
    EXPECT_EQ(status, 0);
  }

  fake_services services;
  int status = 0;
  std::string printed = "nothing was asked";
};

TEST_F(ForgeSelfTest, PassesOnceForEachDevice) {
  EXPECT_TRUE(ask());
  EXPECT_EQ(services.calls, whole_test);
  EXPECT_EQ(printed, "");
  expect_stored(true);
  EXPECT_TRUE(ask());
  EXPECT_EQ(services.calls, whole_test) << "the second answer comes from the record";
  EXPECT_EQ(services.asked_for_record, 2);
  EXPECT_EQ(printed, "");
}

TEST_F(ForgeSelfTest, HandsOverWhatWasGenerated) {
  EXPECT_TRUE(ask());
  const opencl_device target{fake_opencl, nullptr, nullptr};
  EXPECT_EQ(services.binary, generate_binary(gpu_arch::ash, target, offer_body, process_formats()));
}

TEST_F(ForgeSelfTest, TargetIsTheQueuesDevice) {
  process_formats().elf_confirmed = false;  // so that the driver is asked, which looks at both
  EXPECT_TRUE(ask());
  EXPECT_EQ(script.mistakes, names());
  EXPECT_EQ(script.calls.size(), 3U);
}

TEST_F(ForgeSelfTest, ArgumentsAreThoseThatTheKernelExpects) {
  EXPECT_TRUE(ask());
  ASSERT_EQ(services.arguments.size(), 8U);
  const std::uint64_t values[] = {0xBEEFCAFE, 0x3141592653589793, 0xBEAD,
                                  0xFACE,     0x0123456789ABCDEF, 0xFEDCBA9876543210};
  const std::uint32_t sizes[] = {4, 8, 2, 2, 8, 8};
  const kernel_interface kernel = binary_test_interface(hw_ash);
  for (std::size_t i = 0; i < 6; ++i) {
    EXPECT_EQ(services.arguments[i].buffer, nullptr) << i;
    EXPECT_EQ(services.arguments[i].value, values[i]) << i;
    EXPECT_EQ(services.arguments[i].size, sizes[i]) << i;
    EXPECT_EQ(kernel.arguments[i].name, "src" + std::to_string(i));
    EXPECT_EQ(size_of(kernel.arguments[i].type), static_cast<std::int32_t>(sizes[i])) << i;
  }
  EXPECT_EQ(kernel.arguments[6].name, "src_ptr");
  EXPECT_EQ(services.arguments[6].buffer, &services.source_object);
  EXPECT_EQ(services.arguments[6].access, buffer_access::read);
  EXPECT_EQ(kernel.arguments[7].name, "ok");
  EXPECT_EQ(services.arguments[7].buffer, &services.ok_object);
  EXPECT_EQ(services.arguments[7].access, buffer_access::read_write);
}

TEST_F(ForgeSelfTest, AKernelThatDisagreesIsAWarningAtFirst) {
  services.test_passes = false;
  EXPECT_FALSE(ask());
  EXPECT_EQ(services.calls, whole_test);
  EXPECT_EQ(printed, warning);
  expect_stored(false);
  services.test_passes = true;
  EXPECT_FALSE(ask()) << "found out once";
  EXPECT_EQ(printed, "");
}

TEST_F(ForgeSelfTest, WithoutCodeThereIsNothingToWarnOf) {
  for (std::int32_t arch = 0; arch <= 7; ++arch) {
    services.arch = static_cast<gpu_arch>(arch);
    services.checked = false;
    services.usable = true;
    services.calls.clear();
    EXPECT_FALSE(ask(generate_code)) << arch;
    EXPECT_EQ(services.calls, no_test);
    EXPECT_EQ(printed, "");
    expect_stored(false);
  }
}

TEST_F(ForgeSelfTest, TheLibrarysOwnGeneratorIsTheDefault) {
  EXPECT_FALSE(have_binary_kernels(&status, &services.queue_object, services));
  EXPECT_EQ(services.calls, no_test);
  expect_stored(false);
}

TEST_F(ForgeSelfTest, OakHasNoGenerator) {
  services.arch = gpu_arch::oak;
  EXPECT_FALSE(ask());
  EXPECT_EQ(services.calls, no_test);
  EXPECT_EQ(printed, "");
  expect_stored(false);
}

TEST_F(ForgeSelfTest, ADriverThatTakesNeitherFormatGetsNoWarning) {
  process_formats().elf_confirmed = false;
  script.failing_call = "clCreateProgramWithBinary";
  script.failure = CL_INVALID_BINARY;
  EXPECT_FALSE(ask());
  EXPECT_EQ(services.calls, no_test);
  EXPECT_EQ(printed, "");
  expect_stored(false);
}

TEST_F(ForgeSelfTest, QueuesBesideOpenClAreNotTested) {
  for (const bool has_device : {false, true}) {
    services.checked = false;
    services.calls.clear();
    services.has_device = has_device;
    services.has_context = !has_device;
    EXPECT_FALSE(ask());
    EXPECT_EQ(services.calls, no_test);
    EXPECT_EQ(printed, "");
    expect_stored(false);
  }
}

TEST_F(ForgeSelfTest, AnyFailureIsAFailedTestAndGivesAllBack) {
  for (const failing how : {failing::by_status, failing::by_throwing}) {
    for (const std::string& call : whole_test) {
      services.failing_call = call;
      services.how = how;
      services.checked = false;
      services.usable = true;
      services.calls.clear();
      EXPECT_FALSE(ask()) << call;
      EXPECT_EQ(printed, warning) << call;
      expect_stored(false);
      EXPECT_EQ(services.handed_out, 0) << call;
      EXPECT_EQ(services.lock, 0) << call;
    }
  }
}

TEST_F(ForgeSelfTest, NothingIsDoneAfterAFailureButGivingBack) {
  services.failing_call = "write_buffer";
  EXPECT_FALSE(ask());
  EXPECT_EQ(services.calls, (names{"get_cl_device_context", "get_binary_kernel",
                                   "calloc_temp_buffer 1", "calloc_temp_buffer 2", "write_buffer",
                                   "free_buffer 1", "free_buffer 2", "release_kernel"}));
}

TEST_F(ForgeSelfTest, OneFailedReleaseKeepsNoOtherFromTakingPlace) {
  for (const failing how : {failing::by_status, failing::by_throwing}) {
    services.failing_call = "release_event";
    services.how = how;
    services.checked = false;
    services.calls.clear();
    EXPECT_FALSE(ask());
    EXPECT_EQ(services.calls, whole_test);
  }
}

TEST_F(ForgeSelfTest, NullsWithoutACodeAreFailures) {
  for (const char* const call :
       {"get_binary_kernel", "calloc_temp_buffer 1", "calloc_temp_buffer 2", "launch_kernel_3D"}) {
    services.failing_call = call;
    services.how = failing::by_null;
    services.checked = false;
    services.calls.clear();
    EXPECT_FALSE(ask()) << call;
    EXPECT_EQ(printed, warning) << call;
    expect_stored(false);
    EXPECT_EQ(services.handed_out, 0) << call;
  }
}

TEST_F(ForgeSelfTest, AGeneratorThatThrowsIsAFailedTest) {
  EXPECT_FALSE(ask(fail));
  EXPECT_EQ(printed, warning);
  expect_stored(false);
}

TEST_F(ForgeSelfTest, ADeviceWithoutARecordHasNoVerdict) {
  services.failing_call = "get_record";
  EXPECT_FALSE(ask());
  EXPECT_EQ(status, -6);
  EXPECT_EQ(printed, "");
  EXPECT_FALSE(services.checked);
  services.how = failing::by_throwing;
  EXPECT_THROW(ask(), std::runtime_error);
  EXPECT_EQ(services.calls, names());
}

TEST_F(ForgeSelfTest, TheCallersStatusIsNoConcernOfTheTest) {
  status = -5;
  EXPECT_TRUE(ask());
  EXPECT_EQ(status, -5);
  services.checked = false;
  services.test_passes = false;
  services.failing_call = "is_non_zero";
  EXPECT_FALSE(ask());
  EXPECT_EQ(status, -5);
}

TEST_F(ForgeSelfTest, AKnownVerdictNeedsNoLock) {
  services.checked = true;
  services.usable = true;
  services.lock = 1;  // somebody else has it
  EXPECT_TRUE(ask());
  services.lock = 0;
  EXPECT_EQ(services.calls, names());
}

TEST_F(ForgeSelfTest, ThreadsShareOneTest) {
  constexpr int count = 8;
  services.callers_to_await = count;  // all have come before the first one has a verdict
  std::vector<int> verdicts(count, -1);
  std::vector<std::thread> threads;
  for (int i = 0; i < count; ++i) {
    threads.emplace_back([this, &verdicts, i] {
      int own_status = 0;
      verdicts[static_cast<std::size_t>(i)] =
          have_binary_kernels(&own_status, &services.queue_object, services, offer_body);
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(verdicts, std::vector<int>(count, 1));
  EXPECT_EQ(services.calls, whole_test);
  EXPECT_EQ(services.asked_for_record, count);
}

}  // namespace
