// SPDX-License-Identifier: Apache-2.0
// Command groups: checks of launches, memory commands, and the step from group to task.
#include "sycl/detail/handler.hpp"

#include <algorithm>
#include <climits>
#include <cstring>
#include <string>

#include "access_record.hpp"
#include "backend.hpp"
#include "event_access.hpp"
#include "handler_access.hpp"
#include "native_access.hpp"
#include "queue_core.hpp"
#include "sycl/detail/reduction.hpp"
#include "task.hpp"

LUMEN_NAMESPACE_BEGIN

namespace {

constexpr std::size_t id_limit = INT_MAX;

// Kernels may compute ids in 32-bit integers.
void check_id_limit(const detail::launch_shape& shape) {
  std::size_t product = 1;
  bool fits = true;
  bool empty = false;
  for (int d = 0; d < shape.dimensions; ++d) {
    const std::size_t size = shape.global_range[d];
    empty = empty || size == 0;
    fits = fits && size <= id_limit && shape.offset[d] <= id_limit &&
           size + shape.offset[d] <= id_limit;
    fits = fits && (size == 0 || product <= id_limit / size);
    product *= size == 0 ? 1 : size;
  }
  if (!fits && !(empty && shape.total() == 0 && shape.offset[0] <= id_limit &&
                 shape.offset[1] <= id_limit && shape.offset[2] <= id_limit)) {
    throw exception(make_error_code(errc::runtime),
                    "Provided range is out of integer limits. Pass "
                    "`-fno-sycl-id-queries-fit-in-int' to disable range check.");
  }
}

void check_groups(const detail::launch_shape& shape, std::size_t largest_group) {
  const auto refuse = [](const std::string& text) {
    throw exception(make_error_code(errc::nd_range), text);
  };
  std::size_t items = 1;
  for (int d = 0; d < shape.dimensions; ++d) {
    const std::size_t local = shape.local_range[d];
    const std::string where = " in dimension " + std::to_string(d);
    if (local == 0) {
      refuse("the local range is zero" + where);
    }
    if (shape.global_range[d] % local != 0) {
      refuse("the global range " + std::to_string(shape.global_range[d]) +
             " is not a multiple of the local range " + std::to_string(local) + where);
    }
    if (local > largest_group / items) {
      refuse("the work-group has more items than the device's max_work_group_size, " +
             std::to_string(largest_group));
    }
    items *= local;
  }
}

// A command on memory: a function object that is given the stream.
template <typename Function>
class memory_command final : public detail::device_command {
 public:
  explicit memory_command(Function function) : function_(std::move(function)) {}
  void enqueue(detail::command_stream& stream, const detail::launch_shape&) override {
    function_(stream);
  }

 private:
  Function function_;
};
template <typename Function>
std::unique_ptr<detail::device_command> memory_work(Function function) {
  return std::make_unique<memory_command<Function>>(std::move(function));
}

// What would serve a device that the program has no code for.
std::string way_out(backend kind) {
  return kind == backend::cuda
             ? "compile the unit that launches it with nvcc (Tarn's own kernels: the CMake preset "
               "cuda), or choose another device"
             : "lumen compiles kernels for the host and for CUDA devices only. Build Tarn with "
               "another SYCL (-DTARN_SYCL=AdaptiveCpp), or, for an NVIDIA GPU, with the CMake "
               "preset "
               "cuda, and take the device of its CUDA backend; or choose another device";
}

void check_placeholders(const detail::command_group& group) {
  const detail::device_record& device = group.queue->record;
  const auto on_host = [](const detail::access_request& access) { return access.place == nullptr; };
  if (device.detached && std::any_of(group.accesses.begin(), group.accesses.end(), on_host)) {
    throw exception(make_error_code(errc::feature_not_supported),
                    "a placeholder accessor was made before it was known where it is used, which "
                    "is too late for a device with memory of its own: make it from the handler");
  }
}

void check_code(const detail::kernel_command& kernel, const detail::command_group& group) {
  const detail::device_record& device = group.queue->record;
  if (!kernel.serves(device.platform->kind)) {
    throw exception(make_error_code(errc::kernel_not_supported),
                    "the program holds no code of this kernel for " + device.properties.name +
                        ": " + way_out(device.platform->kind));
  }
  check_placeholders(group);
}

class native_launch_command final : public detail::device_command {
 public:
  native_launch_command(std::shared_ptr<detail::native_kernel> kernel, bool grouped,
                        std::vector<detail::kernel_argument> arguments)
      : kernel_(std::move(kernel)), grouped_(grouped), arguments_(std::move(arguments)) {}
  void enqueue(detail::command_stream& stream, const detail::launch_shape& shape) override {
    stream.launch({shape, grouped_}, *kernel_, arguments_);
  }

 private:
  std::shared_ptr<detail::native_kernel> kernel_;
  bool grouped_;
  std::vector<detail::kernel_argument> arguments_;
};

void check_pointer(const void* pointer, std::size_t bytes, const char* text) {
  if (pointer == nullptr && bytes != 0) {
    detail::throw_invalid(text);
  }
}

}  // namespace

handler::handler(detail::queue_core& core) {
  group_.queue = &core;
}
handler::~handler() = default;

void handler::depends_on(const event& dependency) {
  if (const detail::task_ref& task = detail::event_access::task_of(dependency)) {
    group_.dependencies.push_back(task);
  }
}
void handler::depends_on(const std::vector<event>& dependencies) {
  for (const event& dependency : dependencies) {
    depends_on(dependency);
  }
}

void handler::launch(const detail::launch_shape& shape,
                     std::unique_ptr<detail::kernel_command> work) {
  const detail::device_properties& limits = group_.queue->record.properties;
  check_id_limit(shape);
  if (work->needs_groups()) {
    check_groups(shape, limits.max_work_group_size);
  }
  if (group_.local_bytes != 0 && !work->needs_groups()) {
    throw exception(make_error_code(errc::kernel_argument),
                    "a local accessor needs a kernel over an nd_range");
  }
  if (group_.local_bytes > limits.local_mem_size) {
    throw exception(make_error_code(errc::memory_allocation),
                    "the local accessors need " + std::to_string(group_.local_bytes) +
                        " bytes; the device has " + std::to_string(limits.local_mem_size));
  }
  check_code(*work, group_);
  group_.shape = shape;
  group_.shape.local_bytes = group_.local_bytes;
  run_on_device(std::move(work));
}

void handler::launch_native(const detail::launch_shape& shape, bool grouped, const kernel& native) {
  const auto& made = detail::native_access::kernel_of(native);
  const detail::queue_core& core = *group_.queue;
  if (core.place->context == nullptr || core.place->context->handle() != made->context().handle()) {
    detail::throw_invalid("the kernel is not of the queue's context");
  }
  if (grouped) {
    check_groups(shape, core.record.properties.max_work_group_size);
  }
  check_placeholders(group_);
  group_.shape = shape;
  run_on_device(
      std::make_unique<native_launch_command>(made, grouped, std::move(group_.arguments)));
}

namespace {
void set_argument(std::vector<detail::kernel_argument>& arguments, detail::kernel_argument set) {
  if (set.index < 0) {
    throw exception(make_error_code(errc::kernel_argument),
                    "the position of a kernel's argument is negative");
  }
  const auto before = std::find_if(arguments.begin(), arguments.end(),
                                   [&set](const auto& each) { return each.index == set.index; });
  if (before == arguments.end()) {
    arguments.push_back(std::move(set));
  } else {
    *before = std::move(set);
  }
}
}  // namespace

void handler::set_value(int index, const void* value, std::size_t bytes) {
  const auto* const first = static_cast<const unsigned char*>(value);
  set_argument(group_.arguments,
               {index, detail::argument_kind::value, {first, first + bytes}, nullptr, 0});
}
void handler::set_pointer(int index, const void* pointer) {
  set_argument(group_.arguments,
               {index, detail::argument_kind::pointer, {}, const_cast<void*>(pointer), 0});
}
void handler::set_local(int index, std::size_t bytes) {
  set_argument(group_.arguments, {index, detail::argument_kind::local_memory, {}, nullptr, bytes});
}

void handler::ext_kestrel_barrier() {
  group_.fence = detail::fence_kind::after_all;
  run_on_device(nullptr);
}
void handler::ext_kestrel_barrier(const std::vector<event>& events) {
  depends_on(events);
  group_.fence = detail::fence_kind::after_dependencies;
  run_on_device(nullptr);
}

void handler::run_on_device(std::unique_ptr<detail::device_command> work) {
  if (group_.kind != detail::work_kind::none) {
    detail::throw_invalid("a command group has more than one command");
  }
  group_.kind = detail::work_kind::device;
  group_.work = std::move(work);
}

void handler::run_on_host(std::unique_ptr<detail::host_command> work) {
  if (group_.kind != detail::work_kind::none) {
    detail::throw_invalid("a command group has more than one command");
  }
  group_.kind = detail::work_kind::host;
  group_.work = std::move(work);
}

void handler::memcpy(void* to, const void* from, std::size_t bytes) {
  check_pointer(to, bytes, "memcpy: the destination is null");
  check_pointer(from, bytes, "memcpy: the source is null");
  run_on_device(memory_work(
      [to, from, bytes](detail::command_stream& stream) { stream.copy(to, from, bytes); }));
}
void handler::memset(void* pointer, int value, std::size_t bytes) {
  const auto pattern = static_cast<unsigned char>(value);
  fill_bytes(pointer, &pattern, 1, bytes);
}
void handler::fill_bytes(void* pointer, const void* pattern, std::size_t pattern_bytes,
                         std::size_t count) {
  check_pointer(pointer, count, "fill: the destination is null");
  const auto* first = static_cast<const unsigned char*>(pattern);
  std::vector<unsigned char> kept(first, first + pattern_bytes);
  run_on_device(
      memory_work([pointer, kept = std::move(kept), count](detail::command_stream& stream) {
        stream.fill(pointer, kept.data(), kept.size(), count);
      }));
}
void handler::prefetch(void* pointer, std::size_t bytes) {
  run_on_device(memory_work(
      [pointer, bytes](detail::command_stream& stream) { stream.prefetch(pointer, bytes); }));
}
void handler::mem_advise(void* pointer, std::size_t bytes, int advice) {
  run_on_device(memory_work([pointer, bytes, advice](detail::command_stream& stream) {
    stream.advise(pointer, bytes, advice);
  }));
}

namespace {
// Makes the task known to all that it has to wait for, to its buffers and to its queue.
void link_task(detail::task& task, const std::vector<detail::task_ref>& dependencies,
               detail::queue_core& core, detail::fence_kind fence) {
  for (const detail::task_ref& dependency : dependencies) {
    task.depend_on(*dependency.get());
  }
  const auto add = [&] {
    if (fence == detail::fence_kind::none) {
      core.add(task);
    } else {
      core.add_barrier(task, fence == detail::fence_kind::after_all);
    }
  };
  if (task.accesses().empty()) {
    add();
  } else {
    const std::lock_guard<std::mutex> lock(detail::access_record::order_mutex());
    for (const detail::access_request& access : task.accesses()) {
      access.core->record().add(task, access.writes);
    }
    add();
  }
}
}  // namespace

event handler::finish() {
  detail::queue_core& core = *group_.queue;
  const std::vector<detail::task_ref> dependencies = std::move(group_.dependencies);
  const detail::fence_kind fence = group_.fence;
  auto* task = new detail::task(core.shared_from_this(), std::move(group_));
  event result = detail::event_access::make(detail::share(*task));
  try {
    link_task(*task, dependencies, core, fence);
  } catch (...) {  // out of memory
    task->abandon();
    throw;
  }
  task->finish_linking();
  return result;
}

namespace detail {

void reduction_launcher::launch(handler& group, const launch_shape& shape,
                                std::unique_ptr<kernel_command> work) {
  handler_access::launch(group, shape, std::move(work));
}

std::size_t reserve_local(handler& group, std::size_t bytes, std::size_t alignment) {
  std::size_t& used = handler_access::group(group).local_bytes;
  const std::size_t place = (used + alignment - 1) / alignment * alignment;
  // More than any device has, and no sum of the two wraps around: the launch refuses it.
  constexpr std::size_t too_much = static_cast<std::size_t>(-1) / 4;
  used = std::min(place, too_much) + std::min(bytes, too_much);
  return place;
}
}  // namespace detail

LUMEN_NAMESPACE_END
