// SPDX-License-Identifier: Apache-2.0
// Modules and kernels of the Level Zero driver of the tests, and failures on demand.
#include <algorithm>
#include <numeric>
#include <vector>

#include "level_zero_double.hpp"

namespace {

using level_zero_driver::kernel_launch;

// to[i + offset] = value + i, over all items; the third argument is local memory.
void store(const kernel_launch& launch) {
  auto* const to = launch.argument<std::int32_t*>(0);
  const auto value = launch.argument<std::int32_t>(1);
  ASSERT_EQ(launch.argument_bytes[2], 64U);
  for (std::size_t i = 0; i < launch.items(); ++i) {
    to[i + launch.offset[0]] = value + static_cast<std::int32_t>(i);
  }
}

TEST_F(LevelZeroDouble, KernelsRunWithTheArgumentsThatWereSet) {
  level_zero_driver::kernel("store", 3, store);
  ze_module_handle_t module = nullptr;
  ASSERT_EQ(make_module({1, 2, 3}, ZE_MODULE_FORMAT_NATIVE, &module), ok);
  ze_kernel_handle_t kernel = nullptr;
  EXPECT_EQ(make_kernel(module, "another", &kernel), ZE_RESULT_ERROR_INVALID_KERNEL_NAME);
  ASSERT_EQ(make_kernel(module, "store", &kernel), ok);
  const ze_command_list_handle_t list = make_immediate();
  const ze_group_count_t groups{3, 1, 1};
  const auto launch = [&](ze_command_list_handle_t to) {
    return ze().zeCommandListAppendLaunchKernel(to, kernel, &groups, nullptr, 0, nullptr);
  };
  EXPECT_EQ(launch(list), ZE_RESULT_ERROR_INVALID_GROUP_SIZE_DIMENSION);
  EXPECT_EQ(ze().zeKernelSetGroupSize(kernel, 1024, 1, 1),
            ZE_RESULT_ERROR_INVALID_GROUP_SIZE_DIMENSION);
  EXPECT_EQ(ze().zeKernelSetGroupSize(kernel, 4, 1, 1), ok);
  EXPECT_EQ(launch(list), ZE_RESULT_ERROR_INVALID_ARGUMENT) << "no argument is set";

  auto* const to = static_cast<std::int32_t*>(take(64));
  std::fill_n(to, 16, -1);
  const std::int32_t value = 100;
  EXPECT_EQ(ze().zeKernelSetArgumentValue(kernel, 0, sizeof to, &to), ok);
  EXPECT_EQ(ze().zeKernelSetArgumentValue(kernel, 1, sizeof value, &value), ok);
  EXPECT_EQ(ze().zeKernelSetArgumentValue(kernel, 2, 64, nullptr), ok);
  EXPECT_EQ(ze().zeKernelSetArgumentValue(kernel, 3, 64, nullptr),
            ZE_RESULT_ERROR_INVALID_KERNEL_ARGUMENT_INDEX);
  EXPECT_EQ(ze().zeKernelSetGlobalOffsetExp(kernel, 2, 0, 0), ok);
  level_zero_driver::hold();
  EXPECT_EQ(launch(list), ok);
  EXPECT_EQ(ze().zeMemFree(context, to), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  EXPECT_EQ(ze().zeKernelDestroy(kernel), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  const std::int32_t later = 500;
  EXPECT_EQ(ze().zeKernelSetArgumentValue(kernel, 1, sizeof later, &later), ok);
  level_zero_driver::release();
  std::vector<std::int32_t> expected(16, -1);
  std::iota(expected.begin() + 2, expected.begin() + 14, 100);
  EXPECT_EQ(std::vector<std::int32_t>(to, to + 16), expected);

  const ze_command_list_handle_t copying = make_immediate(0);
  EXPECT_EQ(launch(copying), ZE_RESULT_ERROR_INVALID_COMMAND_LIST_TYPE);
  std::uint32_t x = 0;
  std::uint32_t y = 0;
  std::uint32_t z = 0;
  EXPECT_EQ(ze().zeKernelSuggestGroupSize(kernel, 24, 5, 1, &x, &y, &z), ok);
  EXPECT_EQ(x, 8U);
  EXPECT_EQ(y, 1U);
  EXPECT_EQ(ze().zeModuleDestroy(module), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  EXPECT_EQ(ze().zeKernelDestroy(kernel), ok);
  EXPECT_EQ(ze().zeModuleDestroy(module), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(list), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(copying), ok);
  EXPECT_EQ(ze().zeMemFree(context, to), ok);
}

TEST_F(LevelZeroDouble, ModulesGiveTheirBinaryOrTheOneThatIsSet) {
  const auto binary = [&](ze_module_handle_t module) {
    std::size_t size = 0;
    EXPECT_EQ(ze().zeModuleGetNativeBinary(module, &size, nullptr), ok);
    std::vector<std::uint8_t> bytes(size);
    EXPECT_EQ(ze().zeModuleGetNativeBinary(module, &size, bytes.data()), ok);
    EXPECT_EQ(ze().zeModuleDestroy(module), ok);
    return bytes;
  };
  const std::vector<std::uint8_t> spirv = {3, 2, 35, 7, 0, 0, 1, 0};
  ze_module_handle_t module = nullptr;
  ASSERT_EQ(make_module(spirv, ZE_MODULE_FORMAT_IL_SPIRV, &module), ok);
  EXPECT_EQ(binary(module), spirv);
  level_zero_driver::native_binary({9, 8, 7});
  ASSERT_EQ(make_module(spirv, ZE_MODULE_FORMAT_IL_SPIRV, &module), ok);
  EXPECT_EQ(binary(module), (std::vector<std::uint8_t>{9, 8, 7}));

  ze_module_build_log_handle_t log = nullptr;
  ASSERT_EQ(make_module({1, 2, 3, 4}, ZE_MODULE_FORMAT_IL_SPIRV, &module, &log),
            ZE_RESULT_ERROR_MODULE_BUILD_FAILURE);
  char text[32] = {};
  std::size_t size = sizeof text;
  EXPECT_EQ(ze().zeModuleBuildLogGetString(log, &size, text), ok);
  EXPECT_STREQ(text, "no SPIR-V module");
  EXPECT_EQ(ze().zeModuleBuildLogDestroy(log), ok);
}

TEST_F(LevelZeroDouble, CallsFailOnDemand) {
  const int calls = level_zero_driver::calls("zeContextCreate");
  level_zero_driver::fail("zeContextCreate", 1, ZE_RESULT_ERROR_OUT_OF_HOST_MEMORY);
  EXPECT_EQ(level_zero_driver::failures_left(), 1);
  const ze_context_handle_t made = make_context();
  const ze_context_desc_t description{ZE_STRUCTURE_TYPE_CONTEXT_DESC, nullptr, 0};
  ze_context_handle_t none = nullptr;
  EXPECT_EQ(ze().zeContextCreate(driver, &description, &none), ZE_RESULT_ERROR_OUT_OF_HOST_MEMORY);
  EXPECT_EQ(none, nullptr);
  EXPECT_EQ(level_zero_driver::failures_left(), 0);
  EXPECT_EQ(level_zero_driver::calls("zeContextCreate"), calls + 2);
  EXPECT_EQ(ze().zeContextDestroy(made), ok);

  level_zero_driver::fail_always("zeContextCreate", ZE_RESULT_ERROR_DEVICE_LOST);
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(ze().zeContextCreate(driver, &description, &none), ZE_RESULT_ERROR_DEVICE_LOST);
  }
  level_zero_driver::reset();
  EXPECT_EQ(level_zero_driver::calls("zeContextCreate"), 0);
  EXPECT_THROW(level_zero_driver::fail("zeNothing", 0, ok), std::invalid_argument);
  EXPECT_THROW(level_zero_driver::calls("zeNothing"), std::invalid_argument);
  EXPECT_EQ(level_zero_driver::functions().front(), "zeInit");
}

}  // namespace
