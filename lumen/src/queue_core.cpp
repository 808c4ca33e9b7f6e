// SPDX-License-Identifier: Apache-2.0
// The queue's list of unfinished tasks and its way of telling asynchronous errors.
#include "queue_core.hpp"

#include <cstdio>
#include <thread>
#include <unistd.h>

#include "clock.hpp"
#include "completer.hpp"
#include "device_record.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {
// What the standard asks of a program without a handler: a word on the error stream, the end.
[[noreturn]] void default_handler(const exception_list& errors) {
  for (const std::exception_ptr& error : errors) {
    try {
      std::rethrow_exception(error);
    } catch (const std::exception& known) {
      std::fprintf(stderr, "lumen: unhandled asynchronous error: %s\n", known.what());
    } catch (...) {
      std::fprintf(stderr, "lumen: unhandled asynchronous error of unknown type\n");
    }
  }
  std::terminate();
}
}  // namespace

queue_core::queue_core(const context& owner, const device& where, const async_handler& handler,
                       const property_list& wanted, std::unique_ptr<command_stream> given)
    : ctx(owner),
      dev(where),
      record(device_record::of(where)),
      properties(wanted),
      in_order(detail::property_access::has<property::queue::in_order>(wanted)),
      profiling(detail::property_access::has<property::queue::enable_profiling>(wanted)),
      place(context_state::of(owner).place_of(where)),
      stream(given != nullptr ? std::move(given) : record.driver->make_stream(*place, profiling)),
      handler_(handler ? handler : context_state::of(owner).handler) {}

void queue_core::add(task& added) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (in_order && last_ != nullptr) {
    added.depend_on(*last_);
  }
  if (barrier_) {
    added.depend_on(*barrier_.get());
  }
  append(added);
}

void queue_core::add_barrier(task& added, bool after_all) {
  const std::lock_guard<std::mutex> lock(mutex_);
  for (task* before = after_all || in_order ? first_ : nullptr; before != nullptr;
       before = before->queue_next) {
    added.depend_on(*before);
  }
  if (barrier_) {
    added.depend_on(*barrier_.get());
  }
  barrier_ = share(added);
  append(added);
}

void queue_core::append(task& added) {
  if (profiling) {
    added.submit_time.store(now_nanoseconds(), std::memory_order_relaxed);
  }
  added.in_queue = true;
  added.queue_previous = last_;
  (last_ != nullptr ? last_->queue_next : first_) = &added;
  last_ = &added;
}

void queue_core::remove(task& finished) {
  const std::lock_guard<std::mutex> lock(mutex_);
  (finished.queue_previous != nullptr ? finished.queue_previous->queue_next : first_) =
      finished.queue_next;
  (finished.queue_next != nullptr ? finished.queue_next->queue_previous : last_) =
      finished.queue_previous;
  if (barrier_.get() == &finished) {
    barrier_ = task_ref();  // they hold each other
  }
}

void queue_core::wait() {
  std::vector<task_ref> unfinished;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    for (task* t = first_; t != nullptr; t = t->queue_next) {
      unfinished.push_back(share(*t));
    }
  }
  for (const task_ref& t : unfinished) {
    if (!t->runs_on_this_thread()) {
      t->wait();
    }
  }
}

void queue_core::report(std::exception_ptr error) noexcept {
  std::vector<std::exception_ptr> late;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    (abandoned_ ? late : errors_).push_back(std::move(error));
  }
  call_handler(std::move(late));
}

void queue_core::throw_asynchronous() {
  std::vector<std::exception_ptr> errors;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    errors.swap(errors_);
  }
  call_handler(std::move(errors));
}

void queue_core::abandon() {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    abandoned_ = true;
  }
  throw_asynchronous();
}

queue_handle::~queue_handle() {
  core->abandon();
  core->settle();
}

void queue_core::settle() const {
  // Within a task, or within a parting, the caller may be what they wait for.
  if (!record.detached || task::depth_of_this_thread() != 0 || parting::on_this_thread()) {
    return;
  }
  completer::instance().settle(*this);
  // In a child made by fork the threads are gone.
  while (partings->load(std::memory_order_acquire) != 0 && process == getpid()) {
    std::this_thread::yield();
  }
}

void queue_core::call_handler(std::vector<std::exception_ptr> errors) {
  if (errors.empty()) {
    return;
  }
  exception_list list;
  list.list_ = std::move(errors);
  if (!handler_) {
    default_handler(list);
  }
  handler_(std::move(list));
}

}  // namespace detail
LUMEN_NAMESPACE_END
