// SPDX-License-Identifier: Apache-2.0
// Command lists and what goes into them. Arguments are taken when a command is appended, as they
// may change afterwards; what a pointer stands for is looked at then, too.
#include <algorithm>

#include "level_zero_driver_state.hpp"

namespace level_zero_driver {

namespace {

// A list that commands can be appended to, and the events of a command.
ze_result_t check_append(ze_command_list_handle_t list, ze_event_handle_t signal,
                         std::uint32_t count, const ze_event_handle_t* waits) {
  if (const ze_result_t wrong = check(list)) {
    return wrong;
  }
  if (list->closed) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  if ((count == 0) != (waits == nullptr)) {
    return ZE_RESULT_ERROR_INVALID_SIZE;
  }
  std::vector<ze_event_handle_t> events(waits, waits + count);
  if (signal != nullptr) {
    events.push_back(signal);
  }
  for (const ze_event_handle_t event : events) {
    if (const ze_result_t wrong = check(event)) {
      return wrong;
    }
    if (event->pool->context != list->context) {
      return ZE_RESULT_ERROR_INVALID_SYNCHRONIZATION_OBJECT;
    }
  }
  return ZE_RESULT_SUCCESS;
}

// A place of the host's, or in an allocation of the list's context that is large enough, which the
// command then touches.
ze_result_t check_place(ze_command_list_handle_t list, const void* pointer, std::size_t bytes,
                        command& added) {
  if (pointer == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  allocation* const found = find_allocation(pointer);
  if (found == nullptr) {
    return ZE_RESULT_SUCCESS;
  }
  if (found->context != list->context) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  if (bytes >
      static_cast<std::size_t>(found->start + found->bytes - static_cast<const char*>(pointer))) {
    return ZE_RESULT_ERROR_INVALID_SIZE;
  }
  added.touches.push_back(found);
  return ZE_RESULT_SUCCESS;
}

void append(ze_command_list_handle_t list, command added, ze_event_handle_t signal,
            std::uint32_t count, const ze_event_handle_t* waits) {
  added.signal = signal;
  added.waits.assign(waits, waits + count);
  if (list->immediate) {
    submit(*list->immediate, {std::move(added)});
  } else {
    list->commands.push_back(std::move(added));
  }
}

// A kernel with its arguments as they are now.
struct prepared_launch {
  kernel_function function;
  std::vector<_ze_kernel_handle_t::argument> arguments;
  kernel_launch launch;

  void operator()() const {
    std::vector<const void*> values;
    std::vector<std::size_t> sizes;
    for (const auto& argument : arguments) {
      values.push_back(argument.bytes.data());
      sizes.push_back(argument.bytes.size());
    }
    kernel_launch ready = launch;
    ready.arguments = values.data();
    ready.argument_bytes = sizes.data();
    ready.argument_count = static_cast<std::uint32_t>(values.size());
    function(ready);
  }
};

ze_result_t check_launch(ze_command_list_handle_t list, ze_kernel_handle_t kernel,
                         const ze_group_count_t* groups) {
  if (const ze_result_t wrong = check(kernel)) {
    return wrong;
  }
  if (groups == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (list->ordinal != computing_ordinal) {
    return ZE_RESULT_ERROR_INVALID_COMMAND_LIST_TYPE;
  }
  if (kernel->module->context != list->context || kernel->module->device != list->device) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  if (kernel->group_size[0] == 0) {
    return ZE_RESULT_ERROR_INVALID_GROUP_SIZE_DIMENSION;
  }
  const bool all_set = std::all_of(kernel->arguments.begin(), kernel->arguments.end(),
                                   [](const auto& argument) { return argument.set; });
  return all_set ? ZE_RESULT_SUCCESS : ZE_RESULT_ERROR_INVALID_ARGUMENT;
}

// Arguments of the size of a pointer may be one; the kernel then touches what it points to.
void touch_arguments(const _ze_kernel_handle_t& kernel, command& added) {
  for (const auto& argument : kernel.arguments) {
    void* pointer = nullptr;
    if (!argument.local && argument.bytes.size() == sizeof pointer) {
      std::memcpy(&pointer, argument.bytes.data(), sizeof pointer);
      if (allocation* const found = find_allocation(pointer)) {
        added.touches.push_back(found);
      }
    }
  }
}

}  // namespace

ze_result_t zeCommandListCreate(ze_context_handle_t context, ze_device_handle_t device,
                                const ze_command_list_desc_t* description,
                                ze_command_list_handle_t* list) {
  if (const ze_result_t wrong = check(context, device)) {
    return wrong;
  }
  if (description == nullptr || list == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (description->commandQueueGroupOrdinal > computing_ordinal) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  auto* const made = make<ze_command_list_handle_t>({context});
  made->context = context;
  made->device = device;
  made->ordinal = description->commandQueueGroupOrdinal;
  *list = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListCreateImmediate(ze_context_handle_t context, ze_device_handle_t device,
                                         const ze_command_queue_desc_t* description,
                                         ze_command_list_handle_t* list) {
  if (const ze_result_t wrong = check(context, device, description)) {
    return wrong;
  }
  if (list == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  auto* const made = make<ze_command_list_handle_t>({context});
  made->context = context;
  made->device = device;
  made->ordinal = description->ordinal;
  made->immediate = std::make_unique<timeline>();
  set_line(*made->immediate, device, *description);
  *list = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListDestroy(ze_command_list_handle_t list) {
  if (const ze_result_t wrong = check(list)) {
    return wrong;
  }
  if (list->uses != 0 || (list->immediate && !list->immediate->pending.empty())) {
    return ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE;
  }
  driver().timelines.erase(list->immediate.get());
  return destroy(list);
}

ze_result_t zeCommandListClose(ze_command_list_handle_t list) {
  if (const ze_result_t wrong = check(list)) {
    return wrong;
  }
  if (list->immediate || list->closed) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  list->closed = true;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListReset(ze_command_list_handle_t list) {
  if (const ze_result_t wrong = check(list)) {
    return wrong;
  }
  if (list->immediate) {
    return ZE_RESULT_ERROR_INVALID_ARGUMENT;
  }
  if (list->uses != 0) {
    return ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE;
  }
  list->commands.clear();
  list->closed = false;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendBarrier(ze_command_list_handle_t list, ze_event_handle_t signal,
                                       std::uint32_t count, ze_event_handle_t* waits) {
  if (const ze_result_t wrong = check_append(list, signal, count, waits)) {
    return wrong;
  }
  command added;
  added.comes_after = true;
  added.comes_before = true;
  append(list, std::move(added), signal, count, waits);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendMemoryCopy(ze_command_list_handle_t list, void* to, const void* from,
                                          std::size_t bytes, ze_event_handle_t signal,
                                          std::uint32_t count, ze_event_handle_t* waits) {
  if (const ze_result_t wrong = check_append(list, signal, count, waits)) {
    return wrong;
  }
  command added;
  if (const ze_result_t wrong = check_place(list, to, bytes, added)) {
    return wrong;
  }
  if (const ze_result_t wrong = check_place(list, from, bytes, added)) {
    return wrong;
  }
  added.run = [=] { std::memmove(to, from, bytes); };
  append(list, std::move(added), signal, count, waits);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendMemoryFill(ze_command_list_handle_t list, void* to,
                                          const void* pattern, std::size_t pattern_bytes,
                                          std::size_t bytes, ze_event_handle_t signal,
                                          std::uint32_t count, ze_event_handle_t* waits) {
  if (const ze_result_t wrong = check_append(list, signal, count, waits)) {
    return wrong;
  }
  if (pattern == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  if (pattern_bytes == 0 || (pattern_bytes & (pattern_bytes - 1)) != 0 ||
      pattern_bytes > largest_fill_pattern || bytes % pattern_bytes != 0) {
    return ZE_RESULT_ERROR_INVALID_SIZE;
  }
  command added;
  if (const ze_result_t wrong = check_place(list, to, bytes, added)) {
    return wrong;
  }
  const auto* const first = static_cast<const char*>(pattern);
  added.run = [to, bytes, values = std::vector<char>(first, first + pattern_bytes)] {
    for (std::size_t i = 0; i < bytes; i += values.size()) {
      std::memcpy(static_cast<char*>(to) + i, values.data(), values.size());
    }
  };
  append(list, std::move(added), signal, count, waits);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendMemoryPrefetch(ze_command_list_handle_t list, const void* pointer,
                                              std::size_t bytes) {
  if (const ze_result_t wrong = check_append(list, nullptr, 0, nullptr)) {
    return wrong;
  }
  command added;
  if (const ze_result_t wrong = check_place(list, pointer, bytes, added)) {
    return wrong;
  }
  append(list, std::move(added), nullptr, 0, nullptr);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendMemAdvise(ze_command_list_handle_t list, ze_device_handle_t device,
                                         const void* pointer, std::size_t bytes,
                                         ze_memory_advice_t) {
  if (const ze_result_t wrong = check(device)) {
    return wrong;
  }
  return level_zero_driver::zeCommandListAppendMemoryPrefetch(list, pointer, bytes);
}

ze_result_t zeCommandListAppendSignalEvent(ze_command_list_handle_t list, ze_event_handle_t event) {
  if (const ze_result_t wrong = check_append(list, event, 0, nullptr)) {
    return wrong;
  }
  if (event == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_HANDLE;
  }
  append(list, {}, event, 0, nullptr);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendWaitOnEvents(ze_command_list_handle_t list, std::uint32_t count,
                                            ze_event_handle_t* events) {
  if (const ze_result_t wrong = check_append(list, nullptr, count, events)) {
    return wrong;
  }
  command added;
  added.comes_before = true;
  append(list, std::move(added), nullptr, count, events);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendEventReset(ze_command_list_handle_t list, ze_event_handle_t event) {
  if (const ze_result_t wrong = check_append(list, event, 0, nullptr)) {
    return wrong;
  }
  if (event == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_HANDLE;
  }
  command added;
  added.comes_after = true;
  added.comes_before = true;
  added.touches.push_back(event);
  added.run = [event] {
    event->signalled = false;
    event->device = nullptr;
  };
  append(list, std::move(added), nullptr, 0, nullptr);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendWriteGlobalTimestamp(ze_command_list_handle_t list,
                                                    std::uint64_t* to, ze_event_handle_t signal,
                                                    std::uint32_t count, ze_event_handle_t* waits) {
  if (const ze_result_t wrong = check_append(list, signal, count, waits)) {
    return wrong;
  }
  command added;
  if (const ze_result_t wrong = check_place(list, to, sizeof *to, added)) {
    return wrong;
  }
  added.run = [to, device = list->device] { *to = device_time(*device); };
  append(list, std::move(added), signal, count, waits);
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandListAppendLaunchKernel(ze_command_list_handle_t list,
                                            ze_kernel_handle_t kernel,
                                            const ze_group_count_t* groups,
                                            ze_event_handle_t signal, std::uint32_t count,
                                            ze_event_handle_t* waits) {
  if (const ze_result_t wrong = check_append(list, signal, count, waits)) {
    return wrong;
  }
  if (const ze_result_t wrong = check_launch(list, kernel, groups)) {
    return wrong;
  }
  prepared_launch prepared{kernel->entry.function, kernel->arguments, {}};
  std::copy_n(kernel->group_size, 3, prepared.launch.group_size);
  std::copy_n(kernel->offset, 3, prepared.launch.offset);
  prepared.launch.group_count[0] = groups->groupCountX;
  prepared.launch.group_count[1] = groups->groupCountY;
  prepared.launch.group_count[2] = groups->groupCountZ;
  command added;
  added.touches.push_back(kernel);
  touch_arguments(*kernel, added);
  added.run = std::move(prepared);
  append(list, std::move(added), signal, count, waits);
  return ZE_RESULT_SUCCESS;
}

}  // namespace level_zero_driver
