// SPDX-License-Identifier: Apache-2.0
// What a queue and its tasks share: where tasks run, which are unfinished, and the errors that
// nobody has been told of yet.
#pragma once

#include <atomic>
#include <exception>
#include <memory>
#include <mutex>
#include <unistd.h>
#include <vector>

#include "backend.hpp"
#include "context_state.hpp"
#include "sycl/detail/queue.hpp"
#include "task.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class queue_core : public std::enable_shared_from_this<queue_core> {
 public:
  // Over the stream given, or one of its own.
  queue_core(const context& ctx, const device& dev, const async_handler& handler,
             const property_list& properties, std::unique_ptr<command_stream> given = nullptr);

  // Adds a task; in an in-order queue it comes after the one before, in every queue after the last
  // barrier.
  void add(task& added);
  // Adds a task that comes after all tasks of the queue, or only after its own dependencies, and
  // that all later ones come after.
  void add_barrier(task& added, bool after_all);
  void remove(task& finished);
  void wait();

  // A handler that throws here has nobody to throw to: that ends the process.
  void report(std::exception_ptr error) noexcept;
  void throw_asynchronous();
  // The user let the last handle go: what is unreported goes to the handler now, and what
  // fails later at once.
  void abandon();

  const sycl::context ctx;
  const sycl::device dev;
  const device_record& record;
  const property_list properties;
  const bool in_order;
  const bool profiling;
  const std::shared_ptr<const memory_place> place;
  const std::unique_ptr<command_stream> stream;
  // Threads that let go of tasks of a detached device.
  const std::shared_ptr<std::atomic<int>> partings = std::make_shared<std::atomic<int>>(0);
  const pid_t process = getpid();
  // Returns when no thread of the runtime is about to let go of the queue: who has waited for all
  // of its work, and for what comes after that work elsewhere, may then take away what stands
  // behind it.
  void settle() const;
  // Held while a task of a detached device goes into the stream, which is one step for the others.
  std::mutex issue_mutex;

 private:
  void append(task& added);
  void call_handler(std::vector<std::exception_ptr> errors);

  std::mutex mutex_;
  task* first_ = nullptr;
  task* last_ = nullptr;
  task_ref barrier_;
  async_handler handler_;
  std::vector<std::exception_ptr> errors_;
  bool abandoned_ = false;
};

struct queue_handle : std::enable_shared_from_this<queue_handle> {
  std::shared_ptr<queue_core> core;
  explicit queue_handle(std::shared_ptr<queue_core> shared_core) : core(std::move(shared_core)) {}
  queue_handle(const queue_handle&) = delete;
  queue_handle& operator=(const queue_handle&) = delete;
  ~queue_handle();
};

}  // namespace detail
LUMEN_NAMESPACE_END
