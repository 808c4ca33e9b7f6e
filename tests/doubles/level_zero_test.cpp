// SPDX-License-Identifier: Apache-2.0
// The Level Zero driver of the tests through the real loader: its devices and memory, and that
// commands do their work when they may.
#include <chrono>
#include <cstring>
#include <thread>
#include <vector>

#include "level_zero_double.hpp"

namespace {

using level_zero_driver::object;

TEST_F(LevelZeroDouble, DevicesAnswerAsDescribed) {
  level_zero_driver::device_description large;
  std::strcpy(large.name, "large");
  large.vendor_id = 77;
  large.core_clock_rate = 1234;
  large.ip_version = 12u << 22 | 60u << 14 | 5;
  large.sub_devices = 3;
  level_zero_driver::device_description small;
  small.type = ZE_DEVICE_TYPE_CPU;
  level_zero_driver::devices({large, small});

  std::uint32_t count = 0;
  ASSERT_EQ(ze().zeDeviceGet(driver, &count, nullptr), ok);
  ASSERT_EQ(count, 2U);
  ze_device_handle_t found[2] = {};
  ASSERT_EQ(ze().zeDeviceGet(driver, &count, found), ok);

  struct {
    std::uint32_t stype = 0x1000f;
    void* next = nullptr;
    std::uint32_t word = 99;
  } version;
  ze_device_properties_t properties{};
  properties.stype = ZE_STRUCTURE_TYPE_DEVICE_PROPERTIES;
  properties.pNext = &version;
  ASSERT_EQ(ze().zeDeviceGetProperties(found[0], &properties), ok);
  EXPECT_EQ(properties.type, ZE_DEVICE_TYPE_GPU);
  EXPECT_STREQ(properties.name, "large");
  EXPECT_EQ(properties.vendorId, 77U);
  EXPECT_EQ(properties.coreClockRate, 1234U);
  EXPECT_EQ(version.word, large.ip_version);

  version.word = 99;
  ASSERT_EQ(ze().zeDeviceGetProperties(found[1], &properties), ok);
  EXPECT_EQ(properties.type, ZE_DEVICE_TYPE_CPU);
  EXPECT_EQ(version.word, 99U) << "a driver that does not know the query leaves it alone";

  ze_device_handle_t parts[4] = {};
  count = 4;
  ASSERT_EQ(ze().zeDeviceGetSubDevices(found[0], &count, parts), ok);
  EXPECT_EQ(count, 3U);
  ASSERT_EQ(ze().zeDeviceGetProperties(parts[2], &properties), ok);
  EXPECT_EQ(properties.flags, ZE_DEVICE_PROPERTY_FLAG_SUBDEVICE);
  EXPECT_EQ(properties.subdeviceId, 2U);
  EXPECT_EQ(ze().zeDeviceGetProperties(device, &properties), ZE_RESULT_ERROR_INVALID_ARGUMENT)
      << "a device of before";
}

TEST_F(LevelZeroDouble, MemoryKnowsItsKindAndItsEnd) {
  void* const pointer = take(100);
  ze_memory_allocation_properties_t properties{};
  properties.stype = ZE_STRUCTURE_TYPE_MEMORY_ALLOCATION_PROPERTIES;
  ze_device_handle_t owner = nullptr;
  EXPECT_EQ(
      ze().zeMemGetAllocProperties(context, static_cast<char*>(pointer) + 99, &properties, &owner),
      ok);
  EXPECT_EQ(properties.type, ZE_MEMORY_TYPE_DEVICE);
  EXPECT_EQ(owner, device);
  const ze_context_handle_t other = make_context();
  EXPECT_EQ(ze().zeMemGetAllocProperties(other, pointer, &properties, &owner), ok);
  EXPECT_EQ(properties.type, ZE_MEMORY_TYPE_UNKNOWN);
  EXPECT_EQ(ze().zeMemFree(other, pointer), ZE_RESULT_ERROR_INVALID_ARGUMENT);
  EXPECT_EQ(ze().zeContextDestroy(other), ok);
  EXPECT_EQ(level_zero_driver::objects(object::memory), 1);
  EXPECT_EQ(ze().zeContextDestroy(context), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  EXPECT_EQ(ze().zeMemFree(context, pointer), ok);
  EXPECT_EQ(ze().zeMemFree(context, pointer), ZE_RESULT_ERROR_INVALID_ARGUMENT);

  ze_device_mem_alloc_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_DEVICE_MEM_ALLOC_DESC;
  void* refused = nullptr;
  const auto allocate = [&](std::size_t bytes, std::size_t alignment) {
    return ze().zeMemAllocDevice(context, &description, bytes, alignment, device, &refused);
  };
  EXPECT_EQ(allocate(std::size_t{2} << 30, 0), ZE_RESULT_ERROR_UNSUPPORTED_SIZE);
  EXPECT_EQ(allocate(64, 3), ZE_RESULT_ERROR_UNSUPPORTED_ALIGNMENT);
  void* const most = take(std::size_t{1} << 30);
  EXPECT_EQ(allocate(1, 0), ZE_RESULT_ERROR_OUT_OF_DEVICE_MEMORY);
  EXPECT_EQ(refused, nullptr);
  EXPECT_EQ(ze().zeMemFree(context, most), ok);
}

TEST_F(LevelZeroDouble, ListsRunWhenTheyAreExecuted) {
  const ze_command_queue_handle_t queue = make_queue();
  ze_command_list_handle_t list = make_list();
  std::vector<std::int32_t> seen(8, -1);
  void* const pointer = take(32);
  const std::int16_t pattern = 0x0102;
  EXPECT_EQ(ze().zeCommandListAppendMemoryFill(list, pointer, &pattern, 2, 32, nullptr, 0, nullptr),
            ok);
  EXPECT_EQ(ze().zeCommandListAppendBarrier(list, nullptr, 0, nullptr), ok);
  EXPECT_EQ(append_copy(list, seen.data(), pointer, 32), ok);
  EXPECT_EQ(ze().zeCommandQueueExecuteCommandLists(queue, 1, &list, nullptr),
            ZE_RESULT_ERROR_INVALID_ARGUMENT)
      << "not closed";
  EXPECT_EQ(ze().zeCommandListClose(list), ok);
  EXPECT_EQ(append_copy(list, seen.data(), pointer, 32), ZE_RESULT_ERROR_INVALID_ARGUMENT);
  EXPECT_EQ(seen[0], -1);

  const ze_fence_desc_t description{ZE_STRUCTURE_TYPE_FENCE_DESC, nullptr, 0};
  ze_fence_handle_t fence = nullptr;
  EXPECT_EQ(ze().zeFenceCreate(queue, &description, &fence), ok);
  EXPECT_EQ(ze().zeFenceQueryStatus(fence), ZE_RESULT_NOT_READY);
  level_zero_driver::hold();
  EXPECT_EQ(ze().zeCommandQueueExecuteCommandLists(queue, 1, &list, fence), ok);
  EXPECT_EQ(seen[0], -1);
  EXPECT_EQ(ze().zeCommandQueueSynchronize(queue, 0), ZE_RESULT_NOT_READY);
  EXPECT_EQ(ze().zeMemFree(context, pointer), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  EXPECT_EQ(ze().zeCommandListReset(list), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  EXPECT_EQ(ze().zeCommandQueueDestroy(queue), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  std::thread later([] {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    level_zero_driver::release();
  });
  EXPECT_EQ(ze().zeFenceHostSynchronize(fence, forever), ok);
  later.join();
  EXPECT_EQ(seen, std::vector<std::int32_t>(8, 0x01020102));
  EXPECT_EQ(ze().zeCommandQueueSynchronize(queue, forever), ok);

  EXPECT_EQ(ze().zeCommandListReset(list), ok);
  EXPECT_EQ(ze().zeMemFree(context, pointer), ok);
  EXPECT_EQ(ze().zeFenceDestroy(fence), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(list), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(list), ZE_RESULT_ERROR_INVALID_ARGUMENT);
  EXPECT_EQ(ze().zeCommandQueueDestroy(queue), ok);
}

TEST_F(LevelZeroDouble, OnlyBarriersAndEventsKeepCommandsInOrder) {
  const ze_command_queue_handle_t queue = make_queue();
  const std::int32_t values[] = {1, 2, 3};
  std::int32_t last = 0;
  const auto executed = [&](const std::vector<ze_command_list_handle_t>& lists) {
    level_zero_driver::hold();
    for (ze_command_list_handle_t list : lists) {
      EXPECT_EQ(ze().zeCommandListClose(list), ok);
      EXPECT_EQ(ze().zeCommandQueueExecuteCommandLists(queue, 1, &list, nullptr), ok);
    }
    level_zero_driver::release();
    EXPECT_EQ(ze().zeCommandQueueSynchronize(queue, forever), ok);
    for (const ze_command_list_handle_t list : lists) {
      EXPECT_EQ(ze().zeCommandListReset(list), ok);
    }
    return last;
  };
  const ze_command_list_handle_t list = make_list();
  const ze_command_list_handle_t other = make_list();
  append_copy(list, &last, &values[0], 4);
  append_copy(list, &last, &values[1], 4);
  EXPECT_EQ(executed({list}), 1);
  append_copy(list, &last, &values[0], 4);
  EXPECT_EQ(ze().zeCommandListAppendBarrier(list, nullptr, 0, nullptr), ok);
  append_copy(list, &last, &values[1], 4);
  EXPECT_EQ(executed({list}), 2);
  append_copy(list, &last, &values[0], 4);
  append_copy(other, &last, &values[2], 4);
  EXPECT_EQ(executed({list, other}), 1);

  const ze_event_pool_handle_t pool = make_pool(1);
  ze_event_handle_t event = nullptr;
  ASSERT_EQ(make_event(pool, 0, &event), ok);
  append_copy(list, &last, &values[0], 4, event);
  EXPECT_EQ(ze().zeCommandListAppendWaitOnEvents(other, 1, &event), ok);
  append_copy(other, &last, &values[2], 4);
  EXPECT_EQ(executed({list, other}), 3);
  EXPECT_EQ(ze().zeEventDestroy(event), ok);
  EXPECT_EQ(ze().zeEventPoolDestroy(pool), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(list), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(other), ok);
  EXPECT_EQ(ze().zeCommandQueueDestroy(queue), ok);
}

TEST_F(LevelZeroDouble, EventsHoldCommandsBackAndTellTheirTimes) {
  const ze_command_list_handle_t first = make_immediate();
  const ze_command_list_handle_t second = make_immediate(0);
  const ze_event_pool_handle_t pool = make_pool(2);
  ze_event_handle_t start = nullptr;
  ze_event_handle_t end = nullptr;
  ASSERT_EQ(make_event(pool, 0, &start), ok);
  ASSERT_EQ(make_event(pool, 1, &end), ok);
  ze_event_handle_t third = nullptr;
  EXPECT_EQ(make_event(pool, 1, &third), ZE_RESULT_ERROR_INVALID_ARGUMENT);
  EXPECT_EQ(make_event(pool, 2, &third), ZE_RESULT_ERROR_INVALID_ARGUMENT);

  std::int32_t value = 1;
  const std::int32_t two = 2;
  const std::int32_t three = 3;
  EXPECT_EQ(append_copy(second, &value, &three, 4, nullptr, end), ok);
  EXPECT_EQ(append_copy(first, &value, &two, 4, end, start), ok);
  EXPECT_EQ(value, 1);
  EXPECT_EQ(ze().zeEventQueryStatus(end), ZE_RESULT_NOT_READY);
  EXPECT_EQ(ze().zeEventDestroy(start), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  std::uint64_t now = 0;
  std::uint64_t before_signal = 0;
  EXPECT_EQ(ze().zeDeviceGetGlobalTimestamps(device, &now, &before_signal), ok);
  EXPECT_EQ(ze().zeEventHostSignal(start), ok);
  EXPECT_EQ(value, 3) << "the second list follows the first";
  EXPECT_EQ(ze().zeEventHostSynchronize(end, forever), ok);

  ze_kernel_timestamp_result_t times{};
  EXPECT_EQ(ze().zeEventQueryKernelTimestamp(start, &times), ZE_RESULT_NOT_READY)
      << "the host signalled it";
  ASSERT_EQ(ze().zeEventQueryKernelTimestamp(end, &times), ok);
  std::uint64_t after = 0;
  EXPECT_EQ(ze().zeDeviceGetGlobalTimestamps(device, &now, &after), ok);
  EXPECT_LT(times.global.kernelEnd, std::uint64_t{1} << 32);
  // Differences of 32-bit times, as the clock may wrap around meanwhile.
  const auto passed = [&](std::uint64_t time) {
    return static_cast<std::uint32_t>(time - before_signal);
  };
  EXPECT_LE(passed(times.global.kernelStart), passed(times.global.kernelEnd));
  EXPECT_LE(passed(times.global.kernelEnd), passed(after));

  EXPECT_EQ(ze().zeEventHostReset(end), ok);
  EXPECT_EQ(ze().zeEventQueryStatus(end), ZE_RESULT_NOT_READY);
  EXPECT_EQ(ze().zeEventHostSynchronize(end, 1000), ZE_RESULT_NOT_READY);
  EXPECT_EQ(ze().zeEventPoolDestroy(pool), ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE);
  EXPECT_EQ(ze().zeEventDestroy(start), ok);
  EXPECT_EQ(ze().zeEventDestroy(end), ok);
  EXPECT_EQ(ze().zeEventPoolDestroy(pool), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(first), ok);
  EXPECT_EQ(ze().zeCommandListDestroy(second), ok);
}

}  // namespace
