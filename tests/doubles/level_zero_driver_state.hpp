// SPDX-License-Identifier: Apache-2.0
// The inside of the Level Zero driver of the tests. A handle points to a record. A call that is not
// allowed (an object that is gone, of another context, still in use, an argument never set) gives
// an error, where a real driver may do anything, so that a test sees it.
//
// Commands wait in timelines, one for each queue and each immediate list. Whatever may let commands
// go on (a submission, a signal, the end of a hold) runs all that can run, on the calling thread,
// before it returns. The latest goes first: commands of a list keep their order only where barriers
// and waits part them, and those of several lists only by events, as Level Zero promises no more.
// One lock guards everything.
#pragma once

#include <array>
#include <condition_variable>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <vector>

#include "level_zero_driver.hpp"

namespace level_zero_driver {

// Objects and waiting commands that need an object keep it from being destroyed.
struct counted {
  int uses = 0;
  std::vector<counted*> needs;
};

struct command {
  std::function<void()> run;
  std::vector<ze_event_handle_t> waits;
  ze_event_handle_t signal = nullptr;
  std::vector<counted*> touches;
  bool comes_after = false;   // those of its list before it
  bool comes_before = false;  // those of its list after it
  // Each execution of a list has a number of its own; 0 stands for all before it in the timeline.
  std::uint64_t list = 0;
};

struct timeline {
  ze_device_handle_t device = nullptr;
  bool synchronous = false;
  std::uint32_t ordinal = 0;
  std::deque<command> pending;
};

struct allocation : counted {
  ze_context_handle_t context = nullptr;
  ze_device_handle_t device = nullptr;  // null for the host's
  ze_memory_type_t type = ZE_MEMORY_TYPE_UNKNOWN;
  std::uint64_t id = 0;
  char* start = nullptr;
  std::size_t bytes = 0;
};

struct kernel_entry {
  std::uint32_t arguments = 0;
  kernel_function function = nullptr;
};

}  // namespace level_zero_driver

// The types behind the handles, whose names the header gives.
struct _ze_driver_handle_t {};

struct _ze_device_handle_t {
  level_zero_driver::device_description description;
  ze_device_handle_t parent = nullptr;
  std::uint32_t number = 0;  // among the sub-devices
  std::vector<std::unique_ptr<_ze_device_handle_t>> parts;
  std::uint64_t memory_used = 0;
};

struct _ze_context_handle_t : level_zero_driver::counted {};

struct _ze_command_queue_handle_t : level_zero_driver::counted {
  ze_context_handle_t context = nullptr;
  level_zero_driver::timeline line;
};

struct _ze_command_list_handle_t : level_zero_driver::counted {
  ze_context_handle_t context = nullptr;
  ze_device_handle_t device = nullptr;
  std::uint32_t ordinal = 0;
  bool closed = false;
  std::vector<level_zero_driver::command> commands;
  std::unique_ptr<level_zero_driver::timeline> immediate;
};

struct _ze_event_pool_handle_t : level_zero_driver::counted {
  ze_context_handle_t context = nullptr;
  bool timed = false;
  bool visible = false;  // to the host
  std::vector<bool> taken;
};

struct _ze_event_handle_t : level_zero_driver::counted {
  ze_event_pool_handle_t pool = nullptr;
  std::uint32_t index = 0;
  bool signalled = false;
  ze_device_handle_t device = nullptr;  // of the command that signalled it, and its times in ticks
  std::uint64_t start = 0;
  std::uint64_t end = 0;
};

struct _ze_fence_handle_t : level_zero_driver::counted {
  ze_command_queue_handle_t queue = nullptr;
  bool signalled = false;
};

struct _ze_module_handle_t : level_zero_driver::counted {
  ze_context_handle_t context = nullptr;
  ze_device_handle_t device = nullptr;
  std::vector<std::uint8_t> native;
};

struct _ze_module_build_log_handle_t : level_zero_driver::counted {
  std::string text;
};

struct _ze_kernel_handle_t : level_zero_driver::counted {
  ze_module_handle_t module = nullptr;
  std::string name;
  level_zero_driver::kernel_entry entry;
  struct argument {
    bool set = false;
    bool local = false;  // only its size counts
    std::vector<char> bytes;
  };
  std::vector<argument> arguments;
  std::uint32_t group_size[3] = {0, 0, 0};  // none set
  std::uint32_t offset[3] = {0, 0, 0};
};

namespace level_zero_driver {

struct failure {
  int function;
  int after;
  ze_result_t code;
  bool always;
};

struct driver_state {
  std::mutex mutex;
  std::condition_variable_any changed;

  _ze_driver_handle_t handle;
  bool devices_are_set = false;
  std::vector<std::unique_ptr<_ze_device_handle_t>> devices;
  std::vector<std::unique_ptr<_ze_device_handle_t>> former_devices;
  std::int64_t clock_zero = -123456789;  // of the devices, on the host's clock

  std::array<std::set<const void*>, object_kinds> living;
  std::map<const char*, allocation*> memory;  // by start
  std::uint64_t allocations_made = 0;
  std::set<timeline*> timelines;
  std::uint64_t lists_executed = 0;
  bool held = false;

  std::map<std::string, kernel_entry> kernels;
  std::vector<std::uint8_t> native_binary;
  std::vector<failure> failures;
  std::vector<int> calls;
};

// Never destroyed: threads of the program under test may call at its end.
driver_state& driver();
void set_devices(const device_description* devices, std::size_t count);

template <typename Handle>
struct kind_of;
#define LEVEL_ZERO_KIND(handle, name)             \
  template <>                                     \
  struct kind_of<handle> {                        \
    static constexpr object value = object::name; \
  };
LEVEL_ZERO_KIND(ze_context_handle_t, context)
LEVEL_ZERO_KIND(ze_command_queue_handle_t, queue)
LEVEL_ZERO_KIND(ze_command_list_handle_t, list)
LEVEL_ZERO_KIND(ze_event_pool_handle_t, event_pool)
LEVEL_ZERO_KIND(ze_event_handle_t, event)
LEVEL_ZERO_KIND(ze_fence_handle_t, fence)
LEVEL_ZERO_KIND(ze_module_handle_t, module)
LEVEL_ZERO_KIND(ze_kernel_handle_t, kernel)
LEVEL_ZERO_KIND(ze_module_build_log_handle_t, build_log)
LEVEL_ZERO_KIND(allocation*, memory)
#undef LEVEL_ZERO_KIND

template <typename Handle>
std::set<const void*>& living_of() {
  return driver().living[static_cast<std::size_t>(kind_of<Handle>::value)];
}

// What is wrong with a handle, if anything.
template <typename Handle>
ze_result_t check(Handle handle) {
  if (handle == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_HANDLE;
  }
  return living_of<Handle>().count(handle) == 1 ? ZE_RESULT_SUCCESS
                                                : ZE_RESULT_ERROR_INVALID_ARGUMENT;
}
ze_result_t check(ze_device_handle_t device);
ze_result_t check(ze_driver_handle_t handle);
ze_result_t check(const ze_command_queue_desc_t* description);
template <typename First, typename Second, typename... Others>
ze_result_t check(First first, Second second, Others... others) {
  const ze_result_t wrong = check(first);
  return wrong != ZE_RESULT_SUCCESS ? wrong : check(second, others...);
}

// A new object that needs others.
template <typename Handle>
Handle make(const std::vector<counted*>& needs) {
  auto made = std::make_unique<std::remove_pointer_t<Handle>>();
  made->needs = needs;
  living_of<Handle>().insert(made.get());
  for (counted* needed : needs) {
    ++needed->uses;
  }
  return made.release();
}
template <typename Handle>
ze_result_t destroy(Handle handle) {
  if (const ze_result_t wrong = check(handle)) {
    return wrong;
  }
  if (handle->uses != 0) {
    return ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE;
  }
  for (counted* needed : handle->needs) {
    --needed->uses;
  }
  living_of<Handle>().erase(handle);
  delete handle;
  return ZE_RESULT_SUCCESS;
}

// The allocation that a pointer lies in, or null.
allocation* find_allocation(const void* pointer);

// Group 0 of a device's queues only copies, group 1 runs kernels too.
constexpr std::uint32_t computing_ordinal = 1;
constexpr std::uint32_t queues_of_group = 4;
constexpr std::size_t largest_fill_pattern = 16;

// The host's clock in nanoseconds, and the device's in ticks.
std::int64_t now();
std::uint64_t device_time(const _ze_device_handle_t& device);

// A timeline for a device, as the description wants it.
void set_line(timeline& line, ze_device_handle_t device,
              const ze_command_queue_desc_t& description);
// Puts commands into a timeline, runs what can run, and waits if the timeline is synchronous.
void submit(timeline& line, std::vector<command> commands);
// Runs what can run.
void advance();

// Waits until `ready` or for so many nanoseconds; the lock is open meanwhile.
ze_result_t wait_until(std::uint64_t nanoseconds, const std::function<bool()>& ready);

// The driver's functions have the names and types of the interface.
#define LEVEL_ZERO_FUNCTION(table, entry, name) decltype(::name) name;
#include "level_zero_driver_functions.def"
#undef LEVEL_ZERO_FUNCTION

}  // namespace level_zero_driver
