// SPDX-License-Identifier: Apache-2.0
// The backend of the host CPU and of the virtual devices that share its memory and threads.
#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <mutex>

#include "../backend.hpp"
#include "../executor.hpp"
#include "group_runner.hpp"
#include "host_devices.hpp"
#include "host_work.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// A kernel under way: the first error stops the chunks that have not begun.
struct launch_state {
  const kernel_command& kernel;
  const launch_shape& shape;
  shared_loop* loop;
  std::mutex mutex;
  std::exception_ptr error;

  void fail() {
    const std::lock_guard<std::mutex> lock(mutex);
    if (!error) {
      error = std::current_exception();
    }
    loop->next.store(loop->total, std::memory_order_relaxed);
  }
};

void run_items(void* context, std::size_t begin, std::size_t end) {
  auto& state = *static_cast<launch_state*>(context);
  try {
    state.kernel.run_items(begin, end);
  } catch (...) {
    state.fail();
  }
}

void run_groups(void* context, std::size_t begin, std::size_t end) {
  auto& state = *static_cast<launch_state*>(context);
  try {
    group_runner::of_this_thread().run(state.kernel, state.shape, begin, end);
  } catch (...) {
    state.fail();
  }
}

// Commands run on the calling thread and, where they have many parts, on the workers.
class host_stream final : public command_stream {
 public:
  explicit host_stream(const device_record& device) : device_(device) {}

  void launch(const launch_shape& shape, kernel_command& kernel) override {
    run_kernel(device_, shape, kernel);
  }
  void copy(void* to, const void* from, std::size_t bytes) override { copy_bytes(to, from, bytes); }
  void fill(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count) override {
    fill_pattern(to, pattern, pattern_bytes, count);
  }
  // All memory is the host's own: there is nothing to move or to advise.
  void prefetch(void*, std::size_t) override {}
  void advise(void*, std::size_t, int) override {}
  void wait_for(stream_mark&) override {}
  void drain() noexcept override {}
  std::shared_ptr<stream_mark> mark() override { return nullptr; }

 private:
  const device_record& device_;
};

class host_driver final : public host_memory_driver {
 public:
  std::vector<std::unique_ptr<device_record>> enumerate() override { return host_devices(); }
  std::unique_ptr<command_stream> make_stream(const memory_place& place, bool) override {
    return std::make_unique<host_stream>(place.device);
  }
};

}  // namespace

void* host_memory_driver::allocate(const memory_place&, usm::alloc, std::size_t alignment,
                                   std::size_t bytes) {
  void* pointer = nullptr;
  return posix_memalign(&pointer, alignment, bytes) == 0 ? pointer : nullptr;
}
void host_memory_driver::release(const memory_place&, usm::alloc, void* pointer) noexcept {
  std::free(pointer);
}
void host_memory_driver::copy(const memory_place&, void* to, const void* from, std::size_t bytes) {
  copy_bytes(to, from, bytes);
}

void copy_bytes(void* to, const void* from, std::size_t bytes) {
  if (bytes != 0) {
    std::memmove(to, from, bytes);
  }
}

void fill_pattern(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count) {
  if (count == 0) {
    return;
  }
  if (pattern_bytes == 1) {
    std::memset(to, *static_cast<const unsigned char*>(pattern), count);
    return;
  }
  // The filled part doubles with every copy.
  const std::size_t bytes = pattern_bytes * count;
  auto* first = static_cast<char*>(to);
  std::memcpy(first, pattern, pattern_bytes);
  for (std::size_t done = pattern_bytes; done < bytes; done *= 2) {
    std::memcpy(first + done, first, done < bytes - done ? done : bytes - done);
  }
}

void run_kernel(const device_record& device, const launch_shape& shape, kernel_command& kernel) {
  if (shape.total() == 0) {
    return;
  }
  executor& threads = executor::instance();
  const bool groups = kernel.needs_groups();
  const std::size_t units = groups ? shape.total() / shape.group_size() : shape.total();
  // A virtual device has no more threads than compute units.
  const unsigned used = std::min(threads.thread_count(), device.properties.max_compute_units);
  // Enough chunks to balance uneven ones, few enough that taking one costs nothing.
  const std::size_t grain = units / (used * std::size_t{16}) + 1;
  launch_state state{kernel, shape, nullptr, {}, nullptr};
  shared_loop loop(groups ? &run_groups : &run_items, &state, units, grain, used);
  state.loop = &loop;
  threads.run(loop);
  if (state.error) {
    std::rethrow_exception(state.error);
  }
}

std::unique_ptr<backend_driver> make_host_driver() {
  return std::make_unique<host_driver>();
}

}  // namespace detail
LUMEN_NAMESPACE_END
