// SPDX-License-Identifier: Apache-2.0
// What a queue and its tasks share: where tasks run, which are unfinished, and the errors that
// nobody has been told of yet.
#pragma once

#include <exception>
#include <memory>
#include <mutex>
#include <vector>

#include "backend.hpp"
#include "context_state.hpp"
#include "sycl/detail/queue.hpp"
#include "task.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class queue_core : public std::enable_shared_from_this<queue_core> {
 public:
  queue_core(const context& ctx, const device& dev, const async_handler& handler,
             const property_list& properties);

  // Adds a task; in an in-order queue it comes after the one before.
  void add(task& added);
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
  const std::unique_ptr<command_stream> stream;
  // Held while a task of a detached device goes into the stream, which is one step for the others.
  std::mutex issue_mutex;

 private:
  void call_handler(std::vector<std::exception_ptr> errors);

  std::mutex mutex_;
  task* first_ = nullptr;
  task* last_ = nullptr;
  async_handler handler_;
  std::vector<std::exception_ptr> errors_;
  bool abandoned_ = false;
};

struct queue_handle {
  std::shared_ptr<queue_core> core;
  explicit queue_handle(std::shared_ptr<queue_core> shared_core) : core(std::move(shared_core)) {}
  queue_handle(const queue_handle&) = delete;
  queue_handle& operator=(const queue_handle&) = delete;
  ~queue_handle() { core->abandon(); }
};

}  // namespace detail
LUMEN_NAMESPACE_END
