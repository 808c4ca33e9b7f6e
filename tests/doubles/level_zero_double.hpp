// SPDX-License-Identifier: Apache-2.0
// What the tests of the Level Zero driver for tests share: the machine's loader, a device and a
// context, and the proof that every object is given back.
#pragma once

#include <cstdint>
#include <vector>

#include <gtest/gtest.h>

#include "level_zero_driver.hpp"
#include "level_zero_loader.hpp"

constexpr ze_result_t ok = ZE_RESULT_SUCCESS;
constexpr std::uint64_t forever = UINT64_MAX;

class LevelZeroDouble : public testing::Test {
 protected:
  void SetUp() override {
    if (level_zero_loader::find() == nullptr) {
      GTEST_SKIP() << "no Level Zero loader";
    }
    level_zero_driver::reset();
    ASSERT_EQ(ze().zeInit(0), ok);
    level_zero_driver::devices({{}});
    before = level_zero_driver::objects();
    const level_zero_loader::first_device first;
    driver = first.driver;
    device = first.device;
    context = make_context();
  }
  void TearDown() override {
    if (context != nullptr) {
      level_zero_driver::reset();
      EXPECT_EQ(ze().zeContextDestroy(context), ok);
      EXPECT_EQ(level_zero_driver::objects(), before);
    }
  }

  static const level_zero_loader::functions& ze() { return level_zero_loader::get(); }

  ze_context_handle_t make_context() const {
    const ze_context_desc_t description{ZE_STRUCTURE_TYPE_CONTEXT_DESC, nullptr, 0};
    ze_context_handle_t made = nullptr;
    EXPECT_EQ(ze().zeContextCreate(driver, &description, &made), ok);
    return made;
  }
  static ze_command_queue_desc_t queue_description(std::uint32_t ordinal = 1) {
    ze_command_queue_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_COMMAND_QUEUE_DESC;
    description.ordinal = ordinal;
    description.mode = ZE_COMMAND_QUEUE_MODE_ASYNCHRONOUS;
    return description;
  }
  ze_command_queue_handle_t make_queue() const {
    const ze_command_queue_desc_t description = queue_description();
    ze_command_queue_handle_t made = nullptr;
    EXPECT_EQ(ze().zeCommandQueueCreate(context, device, &description, &made), ok);
    return made;
  }
  ze_command_list_handle_t make_list(std::uint32_t ordinal = 1) const {
    ze_command_list_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_COMMAND_LIST_DESC;
    description.commandQueueGroupOrdinal = ordinal;
    ze_command_list_handle_t made = nullptr;
    EXPECT_EQ(ze().zeCommandListCreate(context, device, &description, &made), ok);
    return made;
  }
  ze_command_list_handle_t make_immediate(std::uint32_t ordinal = 1) const {
    const ze_command_queue_desc_t description = queue_description(ordinal);
    ze_command_list_handle_t made = nullptr;
    EXPECT_EQ(ze().zeCommandListCreateImmediate(context, device, &description, &made), ok);
    return made;
  }
  ze_event_pool_handle_t make_pool(std::uint32_t events) const {
    const ze_event_pool_desc_t description{
        ZE_STRUCTURE_TYPE_EVENT_POOL_DESC, nullptr,
        ZE_EVENT_POOL_FLAG_HOST_VISIBLE | ZE_EVENT_POOL_FLAG_KERNEL_TIMESTAMP, events};
    ze_event_pool_handle_t made = nullptr;
    EXPECT_EQ(ze().zeEventPoolCreate(context, &description, 0, nullptr, &made), ok);
    return made;
  }
  static ze_result_t make_event(ze_event_pool_handle_t pool, std::uint32_t index,
                                ze_event_handle_t* event) {
    const ze_event_desc_t description{ZE_STRUCTURE_TYPE_EVENT_DESC, nullptr, index, 0, 0};
    return ze().zeEventCreate(pool, &description, event);
  }
  void* take(std::size_t bytes) const {
    ze_device_mem_alloc_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_DEVICE_MEM_ALLOC_DESC;
    void* pointer = nullptr;
    EXPECT_EQ(ze().zeMemAllocDevice(context, &description, bytes, 0, device, &pointer), ok);
    return pointer;
  }
  ze_result_t make_module(const std::vector<std::uint8_t>& bytes, ze_module_format_t format,
                          ze_module_handle_t* module,
                          ze_module_build_log_handle_t* log = nullptr) const {
    ze_module_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_MODULE_DESC;
    description.format = format;
    description.inputSize = bytes.size();
    description.pInputModule = bytes.data();
    return ze().zeModuleCreate(context, device, &description, module, log);
  }
  static ze_result_t make_kernel(ze_module_handle_t module, const char* name,
                                 ze_kernel_handle_t* kernel) {
    const ze_kernel_desc_t description{ZE_STRUCTURE_TYPE_KERNEL_DESC, nullptr, 0, name};
    return ze().zeKernelCreate(module, &description, kernel);
  }
  static ze_result_t append_copy(ze_command_list_handle_t list, void* to, const void* from,
                                 std::size_t bytes, ze_event_handle_t signal = nullptr,
                                 ze_event_handle_t wait = nullptr) {
    return ze().zeCommandListAppendMemoryCopy(list, to, from, bytes, signal, wait ? 1 : 0,
                                              wait ? &wait : nullptr);
  }

  std::vector<int> before;
  ze_driver_handle_t driver = nullptr;
  ze_device_handle_t device = nullptr;
  ze_context_handle_t context = nullptr;
};
