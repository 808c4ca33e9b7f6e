// SPDX-License-Identifier: Apache-2.0
// Level Zero bound late: the names and their order, the messages, calls, and the failures of
// zeInit.
#include <tarn_level_zero.h>

#include <gtest/gtest.h>

#include "level_zero_binding.hpp"
#include "level_zero_driver.hpp"
#include "level_zero_loader.hpp"
#include "support.hpp"

using any_function = void (*)();
extern "C" void level_zero_seen_from_c(any_function seen[6]);

namespace {

namespace gpu = kestrel::tarn::gpu;
using namespace binding_test;

const texts names = {
#define TARN_NAME(name) #name,
#include "level_zero_names.def"
};

const std::string library_missing = "Could not load library 'libze_loader.so.1'\n";
const std::string init_failed = "Failed zeInit with libze_loader.so.1\n";

std::string name_missing(const std::string& name) {
  return "Could not find '" + name + "' in 'libze_loader.so.1'\n";
}

/// What the child prints for a call of each exported function when none is bound.
std::string all_missing_lines() {
  std::string text;
  for (std::size_t i = 1; i < names.size(); ++i) {
    text += missing_line(names[i]) + "kept alive, not ended with 2\n" + names[i] + " " +
            std::to_string(0x70010001) + "\n";
  }
  return text;
}

TEST(LevelZeroBinding, SevenNamesInTheirOrder) {
  ASSERT_EQ(names.size(), 7U);
  ASSERT_EQ(gpu::level_zero_runtime::record.size, names.size());
  for (std::size_t i = 0; i < names.size(); ++i) {
    EXPECT_EQ(gpu::level_zero_runtime::record.names[i], names[i]) << i;
  }
  EXPECT_STREQ(gpu::level_zero_runtime::record.library, "libze_loader.so.1");
}

TEST(LevelZeroBinding, EachFunctionPassesItsArgumentsAndItsResultOn) {
  std::atomic<void*>* const slots = gpu::level_zero_runtime::functions;
  expect_passed_on("zeInit", slots[0], gpu::ze::zeInit);
  expect_passed_on("zeDeviceGetProperties", slots[1], tarn_zeDeviceGetProperties);
  expect_passed_on("zeDeviceGetSubDevices", slots[2], tarn_zeDeviceGetSubDevices);
  expect_passed_on("zeModuleCreate", slots[3], gpu::ze::zeModuleCreate);
  expect_passed_on("zeKernelCreate", slots[4], tarn_zeKernelCreate);
  expect_passed_on("zeModuleDestroy", slots[5], tarn_zeModuleDestroy);
  expect_passed_on("zeModuleGetNativeBinary", slots[6], tarn_zeModuleGetNativeBinary);
}

TEST(LevelZeroBinding, AProgramInCSeesTheSameFunctions) {
  any_function seen[6] = {};
  level_zero_seen_from_c(seen);
  EXPECT_EQ(seen[0], reinterpret_cast<any_function>(tarn_zeDeviceGetProperties));
  EXPECT_EQ(seen[1], reinterpret_cast<any_function>(tarn_zeDeviceGetSubDevices));
  EXPECT_EQ(seen[2], reinterpret_cast<any_function>(tarn_zeModuleCreate));
  EXPECT_EQ(seen[3], reinterpret_cast<any_function>(tarn_zeKernelCreate));
  EXPECT_EQ(seen[4], reinterpret_cast<any_function>(tarn_zeModuleDestroy));
  EXPECT_EQ(seen[5], reinterpret_cast<any_function>(tarn_zeModuleGetNativeBinary));
}

TEST(LevelZeroBinding, NoBuildLogIsAskedFor) {
  using double_of =
      recorder<ze_result_t, ze_context_handle_t, ze_device_handle_t, const ze_module_desc_t*,
               ze_module_handle_t*, ze_module_build_log_handle_t*>;
  std::atomic<void*>& slot = gpu::level_zero_runtime::functions[3];
  slot = reinterpret_cast<void*>(&double_of::record);
  const auto module = value_at<ze_module_handle_t*>(3);
  int log = 0;
  EXPECT_EQ(tarn_zeModuleCreate(value_at<ze_context_handle_t>(0), value_at<ze_device_handle_t>(1),
                                value_at<const ze_module_desc_t*>(2), module,
                                reinterpret_cast<ze_module_build_log_handle_t*>(&log)),
            value_at<ze_result_t>(place_of_result));
  EXPECT_EQ(double_of::seen,
            std::make_tuple(value_at<ze_context_handle_t>(0), value_at<ze_device_handle_t>(1),
                            value_at<const ze_module_desc_t*>(2), module, nullptr));
  slot = nullptr;
}

TEST(LevelZeroBinding, AWholeLibraryIsInitialisedOnceAndBoundByTheFirstCall) {
  const core_test::outcome outcome = run("level_zero", "call_all_and_count", "whole");
  EXPECT_EQ(outcome.exit_code, 0);
  EXPECT_EQ(outcome.err, "");
  std::string expected;
  for (std::size_t i = 1; i < names.size(); ++i) {
    expected += names[i] + " " + std::to_string(i) + "\n";
  }
  for (const std::string& name : names) {
    expected += name + " called 1 with 0\n";
  }
  EXPECT_EQ(outcome.out, expected);
  EXPECT_EQ(run("level_zero", "bind", "whole").out, bind_lines(0, 7, 7));
}

TEST(LevelZeroBinding, TheFirstMissingNameIsToldOnceAndEndsTheBinding) {
  for (std::size_t lacking = 0; lacking < names.size(); ++lacking) {
    const core_test::outcome outcome =
        run("level_zero", "bind", "level_zero_lacks_" + names[lacking]);
    EXPECT_EQ(outcome.exit_code, 0);
    EXPECT_EQ(outcome.err, name_missing(names[lacking]));
    EXPECT_EQ(outcome.out, bind_lines(-1, lacking, 7)) << names[lacking];
  }
}

TEST(LevelZeroBinding, AMissingLibraryIsToldOnce) {
  const core_test::outcome outcome = run_without_libraries("level_zero", "bind");
  EXPECT_EQ(outcome.err, library_missing);
  EXPECT_EQ(outcome.out, bind_lines(-1, 0, 7));
}

TEST(LevelZeroBinding, AFailureOfInitLeavesTheOthersUnboundAndACallEndsTheProcess) {
  const core_test::outcome bound = run("level_zero", "bind", "level_zero_init_fails");
  EXPECT_EQ(bound.err, init_failed);
  EXPECT_EQ(bound.out, bind_lines(-1, 1, 7));
  const core_test::outcome called = run("level_zero", "call_first", "level_zero_init_fails");
  EXPECT_EQ(called.exit_code, 2);
  EXPECT_EQ(called.err, init_failed);
  EXPECT_EQ(called.out, missing_line("zeDeviceGetProperties"));
}

TEST(LevelZeroBinding, WithoutTheLibraryACallTellsItsNameAndEndsTheProcess) {
  const core_test::outcome outcome = run_without_libraries("level_zero", "call_first");
  EXPECT_EQ(outcome.exit_code, 2);
  EXPECT_EQ(outcome.err, library_missing);
  EXPECT_EQ(outcome.out, missing_line("zeDeviceGetProperties"));
}

TEST(LevelZeroBinding, EveryCallTellsItsNameIfAnExitHookKeepsTheProcessAlive) {
  const core_test::outcome outcome = run_without_libraries("level_zero", "call_all");
  EXPECT_EQ(outcome.exit_code, 0);
  EXPECT_EQ(outcome.err, library_missing);
  EXPECT_EQ(outcome.out, all_missing_lines());
}

TEST(LevelZeroBinding, ThreadsThatCallFirstAtTheSameTimeFindTheSame) {
  const core_test::outcome outcome = run("level_zero", "call_from_threads", "whole");
  EXPECT_EQ(outcome.exit_code, 0) << outcome.err;
  EXPECT_EQ(outcome.out, "16 threads: 1 2 3 4 5 6\n");
}

// There is no lock, so each of the threads may be told why, but nothing else is said.
TEST(LevelZeroBinding, ThreadsThatFindNothingMayEachBeToldWhy) {
  const core_test::outcome outcome = run_without_libraries("level_zero", "call_from_threads");
  EXPECT_EQ(outcome.exit_code, 0);
  const int told = core_test::lines_with(outcome.err, "Could not load library");
  EXPECT_GE(told, 1);
  EXPECT_LE(told, 16);
  EXPECT_EQ(core_test::lines_with(outcome.err, ""), told) << outcome.err;
  EXPECT_EQ(core_test::lines_with(outcome.out, "has the function 'zeModuleDestroy'"), 16);
}

TEST(LevelZeroBinding, TheMachinesLoaderWithoutADriverFailsToInitialise) {
  const core_test::outcome outcome =
      run("level_zero", "bind", "", {"ZE_ENABLE_ALT_DRIVERS=" TARN_STUBS "/no_such_driver.so"});
  if (level_zero_loader::find() == nullptr) {
    EXPECT_EQ(outcome.err, library_missing);
    GTEST_SKIP() << "no Level Zero loader";
  }
  EXPECT_EQ(outcome.err, init_failed);
  EXPECT_EQ(outcome.out, bind_lines(-1, 1, 7));
}

TEST(LevelZeroBinding, TheMachinesLoaderAndADriverAnswerThroughTheBoundFunctions) {
  if (level_zero_loader::find() == nullptr) {
    GTEST_SKIP() << "no Level Zero loader";
  }
  ASSERT_EQ(gpu::bind_level_zero(), 0);
  level_zero_driver::device_description three_parts;
  three_parts.sub_devices = 3;
  level_zero_driver::devices({three_parts});
  const level_zero_loader::functions& loader = level_zero_loader::get();
  const level_zero_loader::first_device first;
  const ze_context_desc_t plain = {ZE_STRUCTURE_TYPE_CONTEXT_DESC, nullptr, 0};
  ze_context_handle_t context = nullptr;
  ASSERT_EQ(loader.zeContextCreate(first.driver, &plain, &context), 0);

  ze_device_properties_t properties = {};
  properties.stype = ZE_STRUCTURE_TYPE_DEVICE_PROPERTIES;
  EXPECT_EQ(tarn_zeDeviceGetProperties(first.device, &properties), 0);
  EXPECT_EQ(properties.vendorId, three_parts.vendor_id);
  std::uint32_t parts = 0;
  EXPECT_EQ(tarn_zeDeviceGetSubDevices(first.device, &parts, nullptr), 0);
  EXPECT_EQ(parts, 3U);

  level_zero_driver::kernel("twice", 1, [](const level_zero_driver::kernel_launch&) {});
  const std::uint8_t code[] = {3, 1, 4, 1, 5};
  ze_module_desc_t description = {};
  description.stype = ZE_STRUCTURE_TYPE_MODULE_DESC;
  description.format = ZE_MODULE_FORMAT_NATIVE;
  description.inputSize = sizeof code;
  description.pInputModule = code;
  ze_module_handle_t module = nullptr;
  ASSERT_EQ(tarn_zeModuleCreate(context, first.device, &description, &module, nullptr), 0);
  std::size_t size = 0;
  EXPECT_EQ(tarn_zeModuleGetNativeBinary(module, &size, nullptr), 0);
  EXPECT_EQ(size, sizeof code);
  const ze_kernel_desc_t kernel_description = {ZE_STRUCTURE_TYPE_KERNEL_DESC, nullptr, 0, "twice"};
  ze_kernel_handle_t kernel = nullptr;
  EXPECT_EQ(tarn_zeKernelCreate(module, &kernel_description, &kernel), 0);
  EXPECT_EQ(loader.zeKernelDestroy(kernel), 0);
  EXPECT_EQ(level_zero_driver::objects(level_zero_driver::object::module), 1);
  EXPECT_EQ(tarn_zeModuleDestroy(module), 0);
  EXPECT_EQ(level_zero_driver::objects(level_zero_driver::object::module), 0);
  EXPECT_EQ(loader.zeContextDestroy(context), 0);
}

}  // namespace
