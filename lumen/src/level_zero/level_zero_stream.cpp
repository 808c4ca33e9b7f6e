// SPDX-License-Identifier: Apache-2.0
// Streams made of command lists. A list takes the commands up to a mark, with barriers between
// them; the mark is an event that a last barrier signals. Then the list is executed, and the next
// one begins by waiting for that event: Level Zero promises no order between lists. Lists and
// events are used again when their work is done.
#include "level_zero_stream.hpp"

#include <algorithm>
#include <deque>
#include <optional>

#include "../clock.hpp"
#include "level_zero_kernel.hpp"
#include "level_zero_mark.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// A list with the marks whose events are in it, the last of which is its end.
struct batch {
  level_zero_object<ze_command_list_handle_t> list;
  std::vector<std::shared_ptr<level_zero_mark>> marks;
};

class level_zero_stream final : public command_stream {
 public:
  level_zero_stream(const memory_place& place, bool timed,
                    level_zero_object<ze_command_queue_handle_t> queue)
      : device_(place.device),
        context_(std::static_pointer_cast<level_zero_context>(place.context)),
        group_(computing_group(handle_of(device_))),
        queue_(std::move(queue)) {
    if (timed) {
      clock_ = read_clock(handle_of(device_));
    }
  }
  void make_queue() {
    ze_command_queue_desc_t description{};
    description.stype = ZE_STRUCTURE_TYPE_COMMAND_QUEUE_DESC;
    description.ordinal = group_.ordinal;
    description.mode = ZE_COMMAND_QUEUE_MODE_ASYNCHRONOUS;
    check_level_zero(ze().zeCommandQueueCreate(context_->get(), handle_of(device_), &description,
                                               queue_.place()),
                     "zeCommandQueueCreate");
  }
  ~level_zero_stream() override { drain(); }

  void launch(const launch_shape& shape, kernel_command& kernel) override {
    kernel.launch_native({shape, device_.number, queue_.get()});
  }
  void launch(const native_shape& shape, native_kernel& kernel,
              const std::vector<kernel_argument>& arguments) override {
    if (shape.sizes.total() != 0) {
      static_cast<level_zero_kernel&>(kernel).append_to(next_command(), shape, arguments);
    }
  }
  // Either place may be the host's own memory, whose pages drivers hand to the device.
  void copy(void* to, const void* from, std::size_t bytes) override {
    if (bytes != 0) {
      check_level_zero(
          ze().zeCommandListAppendMemoryCopy(next_command(), to, from, bytes, nullptr, 0, nullptr),
          "zeCommandListAppendMemoryCopy");
    }
  }
  void fill(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count) override {
    const std::size_t bytes = pattern_bytes * count;
    if (bytes == 0) {
      return;
    }
    const bool power_of_two = (pattern_bytes & (pattern_bytes - 1)) == 0;
    if (power_of_two && pattern_bytes <= group_.largest_fill_pattern) {
      check_level_zero(ze().zeCommandListAppendMemoryFill(
                           next_command(), to, pattern, pattern_bytes, bytes, nullptr, 0, nullptr),
                       "zeCommandListAppendMemoryFill");
      return;
    }
    // The filled part doubles with every copy.
    auto* const place = static_cast<char*>(to);
    copy(place, pattern, pattern_bytes);
    for (std::size_t done = pattern_bytes; done < bytes; done *= 2) {
      copy(place + done, place, std::min(done, bytes - done));
    }
  }
  // Only shared memory moves; elsewhere there is nothing to hint at.
  void prefetch(void* pointer, std::size_t bytes) override {
    ze_memory_allocation_properties_t where{};
    where.stype = ZE_STRUCTURE_TYPE_MEMORY_ALLOCATION_PROPERTIES;
    check_level_zero(ze().zeMemGetAllocProperties(context_->get(), pointer, &where, nullptr),
                     "zeMemGetAllocProperties");
    if (where.type == ZE_MEMORY_TYPE_SHARED && bytes != 0) {
      check_level_zero(ze().zeCommandListAppendMemoryPrefetch(next_command(), pointer, bytes),
                       "zeCommandListAppendMemoryPrefetch");
    }
  }
  // The standard leaves the advice to the backend; none is defined here but 0, which is the
  // default.
  void advise(void*, std::size_t, int) override {}

  void wait_for(stream_mark& mark) override;
  void drain() noexcept override;
  std::shared_ptr<stream_mark> mark() override;
  void* native_handle() const noexcept override { return queue_.get(); }

 private:
  // Clocks drift, and the device's wraps around: they are read anew after so many nanoseconds.
  static constexpr std::uint64_t clock_renewal = 1'000'000'000;

  ze_command_list_handle_t open_list();
  ze_command_list_handle_t next_command();
  level_zero_object<ze_command_list_handle_t> take_list();
  void append_wait(level_zero_mark& before);
  void collect();
  void forget_open() noexcept;

  const device_record& device_;
  const std::shared_ptr<level_zero_context> context_;
  const queue_group group_;
  level_zero_object<ze_command_queue_handle_t> queue_;
  std::optional<device_clock> clock_;  // for streams that keep times
  batch open_;
  bool has_commands_ = false;  // in the open list
  std::deque<batch> executing_;
  std::vector<level_zero_object<ze_command_list_handle_t>> spare_lists_;
  std::shared_ptr<level_zero_mark> last_;
};

// Takes back the lists that the device is done with.
void level_zero_stream::collect() {
  while (!executing_.empty() && executing_.front().marks.back()->passed()) {
    level_zero_object<ze_command_list_handle_t> list = std::move(executing_.front().list);
    executing_.pop_front();
    if (ze().zeCommandListReset(list.get()) == ZE_RESULT_SUCCESS) {
      spare_lists_.push_back(std::move(list));
    }
  }
}

level_zero_object<ze_command_list_handle_t> level_zero_stream::take_list() {
  level_zero_object<ze_command_list_handle_t> list;
  collect();
  if (!spare_lists_.empty()) {
    list = std::move(spare_lists_.back());
    spare_lists_.pop_back();
    return list;
  }
  ze_command_list_desc_t description{};
  description.stype = ZE_STRUCTURE_TYPE_COMMAND_LIST_DESC;
  description.commandQueueGroupOrdinal = group_.ordinal;
  check_level_zero(
      ze().zeCommandListCreate(context_->get(), handle_of(device_), &description, list.place()),
      "zeCommandListCreate");
  return list;
}

// The list of the batch that takes commands, which come after those of the batch before.
ze_command_list_handle_t level_zero_stream::open_list() {
  if (open_.list.get() == nullptr) {
    open_.list = take_list();
    if (last_) {
      append_wait(*last_);
    }
  }
  return open_.list.get();
}

// The list, ready for a command that comes after all those before.
ze_command_list_handle_t level_zero_stream::next_command() {
  const ze_command_list_handle_t list = open_list();
  if (has_commands_) {
    check_level_zero(ze().zeCommandListAppendBarrier(list, nullptr, 0, nullptr),
                     "zeCommandListAppendBarrier");
  }
  has_commands_ = true;
  return list;
}

void level_zero_stream::append_wait(level_zero_mark& before) {
  ze_event_handle_t event = before.event();
  open_.marks.push_back(before.shared_from_this());
  check_level_zero(ze().zeCommandListAppendWaitOnEvents(open_.list.get(), 1, &event),
                   "zeCommandListAppendWaitOnEvents");
}

void level_zero_stream::wait_for(stream_mark& mark) {
  open_list();
  append_wait(static_cast<level_zero_mark&>(mark));
}

std::shared_ptr<stream_mark> level_zero_stream::mark() {
  if (clock_ && now_nanoseconds() - clock_->host > clock_renewal) {
    clock_ = read_clock(handle_of(device_));
  }
  ze_command_list_handle_t list = open_list();
  auto made = std::make_shared<level_zero_mark>(context_, clock_);
  open_.marks.push_back(made);
  check_level_zero(ze().zeCommandListAppendBarrier(list, made->event(), 0, nullptr),
                   "zeCommandListAppendBarrier");
  check_level_zero(ze().zeCommandListClose(list), "zeCommandListClose");
  executing_.push_back(std::move(open_));
  forget_open();
  const ze_result_t result =
      ze().zeCommandQueueExecuteCommandLists(queue_.get(), 1, &list, nullptr);
  if (result != ZE_RESULT_SUCCESS) {
    executing_.pop_back();
    check_level_zero(result, "zeCommandQueueExecuteCommandLists");
  }
  last_ = std::move(made);
  return last_;
}

void level_zero_stream::forget_open() noexcept {
  open_ = batch();
  has_commands_ = false;
}

// What was appended since the last mark has not gone in, and never does. The mark is waited for as
// well, in case that the queue fails to tell.
void level_zero_stream::drain() noexcept {
  forget_open();
  if (queue_.get() != nullptr) {
    static_cast<void>(ze().zeCommandQueueSynchronize(queue_.get(), UINT64_MAX));
  }
  if (last_) {
    static_cast<void>(ze().zeEventHostSynchronize(last_->event(), UINT64_MAX));
  }
}

}  // namespace

std::unique_ptr<command_stream> make_level_zero_stream(const memory_place& place, bool timed) {
  auto made = std::make_unique<level_zero_stream>(place, timed,
                                                  level_zero_object<ze_command_queue_handle_t>());
  made->make_queue();
  return made;
}

std::unique_ptr<command_stream> make_level_zero_stream(
    const memory_place& place, bool timed, level_zero_object<ze_command_queue_handle_t> queue) {
  return std::make_unique<level_zero_stream>(place, timed, std::move(queue));
}

}  // namespace detail
LUMEN_NAMESPACE_END
