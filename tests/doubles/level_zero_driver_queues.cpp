// SPDX-License-Identifier: Apache-2.0
// Queues and fences, and how commands run.
#include <algorithm>
#include <chrono>

#include "level_zero_driver_state.hpp"

namespace level_zero_driver {

namespace {

void count_uses(const command& waiting, int change) {
  for (ze_event_handle_t event : waiting.waits) {
    event->uses += change;
  }
  if (waiting.signal != nullptr) {
    waiting.signal->uses += change;
  }
  for (counted* touched : waiting.touches) {
    touched->uses += change;
  }
}

bool can_run(const timeline& line, std::size_t place) {
  const command& wanted = line.pending[place];
  const auto begin = line.pending.begin();
  return std::all_of(wanted.waits.begin(), wanted.waits.end(),
                     [](ze_event_handle_t event) { return event->signalled; }) &&
         std::none_of(begin, begin + static_cast<std::ptrdiff_t>(place), [&](const command& each) {
           return (each.list == wanted.list || wanted.list == 0) &&
                  (wanted.comes_after || each.comes_before);
         });
}

void run(const command& next, const timeline& line) {
  const std::uint64_t start = device_time(*line.device);
  if (next.run) {
    next.run();
  }
  if (next.signal != nullptr) {
    next.signal->device = line.device;
    next.signal->start = start;
    next.signal->end = device_time(*line.device);
    next.signal->signalled = true;
  }
  count_uses(next, -1);
}

// The latest command that can run; returns whether there is one.
bool run_one(timeline& line) {
  for (std::size_t place = line.pending.size(); place-- > 0;) {
    if (can_run(line, place)) {
      const command next = std::move(line.pending[place]);
      line.pending.erase(line.pending.begin() + static_cast<std::ptrdiff_t>(place));
      run(next, line);
      return true;
    }
  }
  return false;
}

// What is wrong with lists that are to be executed.
ze_result_t check_lists(ze_command_queue_handle_t queue, std::uint32_t count,
                        const ze_command_list_handle_t* lists) {
  if (count == 0) {
    return ZE_RESULT_ERROR_INVALID_SIZE;
  }
  if (lists == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  for (std::uint32_t i = 0; i < count; ++i) {
    if (const ze_result_t wrong = check(lists[i])) {
      return wrong;
    }
    if (lists[i]->immediate || lists[i]->ordinal != queue->line.ordinal) {
      return ZE_RESULT_ERROR_INVALID_COMMAND_LIST_TYPE;
    }
    if (!lists[i]->closed || lists[i]->context != queue->context ||
        lists[i]->device != queue->line.device) {
      return ZE_RESULT_ERROR_INVALID_ARGUMENT;
    }
  }
  return ZE_RESULT_SUCCESS;
}

}  // namespace

ze_result_t check(const ze_command_queue_desc_t* description) {
  if (description == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  return description->ordinal > computing_ordinal || description->index >= queues_of_group
             ? ZE_RESULT_ERROR_INVALID_ARGUMENT
             : ZE_RESULT_SUCCESS;
}

void set_line(timeline& line, ze_device_handle_t device,
              const ze_command_queue_desc_t& description) {
  line.device = device;
  line.ordinal = description.ordinal;
  line.synchronous = description.mode == ZE_COMMAND_QUEUE_MODE_SYNCHRONOUS;
  driver().timelines.insert(&line);
}

void advance() {
  for (bool moved = !driver().held; moved;) {
    moved = false;
    for (timeline* line : driver().timelines) {
      while (run_one(*line)) {
        moved = true;
      }
    }
  }
  driver().changed.notify_all();
}

void submit(timeline& line, std::vector<command> commands) {
  for (command& each : commands) {
    count_uses(each, 1);
    line.pending.push_back(std::move(each));
  }
  advance();
  if (line.synchronous) {
    static_cast<void>(wait_until(UINT64_MAX, [&line] { return line.pending.empty(); }));
  }
}

ze_result_t wait_until(std::uint64_t nanoseconds, const std::function<bool()>& ready) {
  // What is far away is never: clocks overflow.
  constexpr std::uint64_t never = 1'000'000'000'000'000;
  std::mutex& mutex = driver().mutex;
  std::condition_variable_any& changed = driver().changed;
  if (nanoseconds >= never) {
    changed.wait(mutex, ready);
    return ZE_RESULT_SUCCESS;
  }
  return changed.wait_for(mutex, std::chrono::nanoseconds(nanoseconds), ready)
             ? ZE_RESULT_SUCCESS
             : ZE_RESULT_NOT_READY;
}

ze_result_t zeCommandQueueCreate(ze_context_handle_t context, ze_device_handle_t device,
                                 const ze_command_queue_desc_t* description,
                                 ze_command_queue_handle_t* queue) {
  if (const ze_result_t wrong = check(context, device, description)) {
    return wrong;
  }
  if (queue == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  auto* const made = make<ze_command_queue_handle_t>({context});
  made->context = context;
  set_line(made->line, device, *description);
  *queue = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandQueueDestroy(ze_command_queue_handle_t queue) {
  if (const ze_result_t wrong = check(queue)) {
    return wrong;
  }
  if (!queue->line.pending.empty() || queue->uses != 0) {
    return ZE_RESULT_ERROR_HANDLE_OBJECT_IN_USE;
  }
  driver().timelines.erase(&queue->line);
  return destroy(queue);
}

ze_result_t zeCommandQueueExecuteCommandLists(ze_command_queue_handle_t queue, std::uint32_t count,
                                              ze_command_list_handle_t* lists,
                                              ze_fence_handle_t fence) {
  if (const ze_result_t wrong = check(queue)) {
    return wrong;
  }
  if (const ze_result_t wrong = check_lists(queue, count, lists)) {
    return wrong;
  }
  std::vector<command> commands;
  for (std::uint32_t i = 0; i < count; ++i) {
    ++driver().lists_executed;
    for (command each : lists[i]->commands) {
      each.list = driver().lists_executed;
      each.touches.push_back(lists[i]);
      commands.push_back(std::move(each));
    }
  }
  if (fence != nullptr) {
    if (const ze_result_t wrong = check(fence)) {
      return wrong;
    }
    if (fence->queue != queue) {
      return ZE_RESULT_ERROR_INVALID_SYNCHRONIZATION_OBJECT;
    }
    command end;
    end.run = [fence] { fence->signalled = true; };
    end.touches.push_back(fence);
    end.comes_after = true;
    commands.push_back(std::move(end));
  }
  submit(queue->line, std::move(commands));
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeCommandQueueSynchronize(ze_command_queue_handle_t queue, std::uint64_t timeout) {
  if (const ze_result_t wrong = check(queue)) {
    return wrong;
  }
  return wait_until(timeout, [queue] { return queue->line.pending.empty(); });
}

ze_result_t zeFenceCreate(ze_command_queue_handle_t queue, const ze_fence_desc_t* description,
                          ze_fence_handle_t* fence) {
  if (const ze_result_t wrong = check(queue)) {
    return wrong;
  }
  if (description == nullptr || fence == nullptr) {
    return ZE_RESULT_ERROR_INVALID_NULL_POINTER;
  }
  auto* const made = make<ze_fence_handle_t>({queue});
  made->queue = queue;
  made->signalled = (description->flags & ZE_FENCE_FLAG_SIGNALED) != 0;
  *fence = made;
  return ZE_RESULT_SUCCESS;
}

ze_result_t zeFenceDestroy(ze_fence_handle_t fence) {
  return destroy(fence);
}

ze_result_t zeFenceHostSynchronize(ze_fence_handle_t fence, std::uint64_t timeout) {
  if (const ze_result_t wrong = check(fence)) {
    return wrong;
  }
  return wait_until(timeout, [fence] { return fence->signalled; });
}

ze_result_t zeFenceQueryStatus(ze_fence_handle_t fence) {
  if (const ze_result_t wrong = check(fence)) {
    return wrong;
  }
  return fence->signalled ? ZE_RESULT_SUCCESS : ZE_RESULT_NOT_READY;
}

ze_result_t zeFenceReset(ze_fence_handle_t fence) {
  if (const ze_result_t wrong = check(fence)) {
    return wrong;
  }
  fence->signalled = false;
  return ZE_RESULT_SUCCESS;
}

}  // namespace level_zero_driver
