// SPDX-License-Identifier: Apache-2.0
// The life of a task: linking, waiting, running, and waking what comes after.
#include "task.hpp"

#include <chrono>
#include <new>

#include "backend.hpp"
#include "clock.hpp"
#include "executor.hpp"
#include "futex.hpp"
#include "queue_core.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {
// The tasks that this thread is inside of, innermost first.
struct running_frame {
  const task* running;
  running_frame* outer;
  bool closing;  // its work is over, its closure is being destroyed
};
thread_local running_frame* innermost = nullptr;
// A waiter looks this many times before it goes to sleep: about two microseconds.
constexpr int spins_before_sleep = 64;

inline void relax() {
#if defined(__x86_64__) || defined(__i386__)
  __builtin_ia32_pause();
#endif
}
}  // namespace

task_ref::task_ref(const task_ref& other) noexcept : task_(other.task_) {
  if (task_ != nullptr) {
    task_->retain();
  }
}
void task_ref::release() noexcept {
  task_->release();
}

task::task(std::shared_ptr<queue_core> queue, command_group&& group)
    : queue_(std::move(queue)),
      kind_(group.kind),
      shape_(group.shape),
      work_(std::move(group.work)),
      accesses_(std::move(group.accesses)) {}

task::~task() = default;

void task::depend_on(task& other) {
  if (&other == this) {
    return;
  }
  {
    const std::lock_guard<std::mutex> lock(other.mutex_);
    if (other.done()) {
      return;
    }
    other.successors_.push_back(share(*this));  // may throw: nothing is counted then
    unmet_.fetch_add(1, std::memory_order_relaxed);
  }
  const std::lock_guard<std::mutex> lock(mutex_);
  dependencies_.push_back(share(other));
}

void task::finish_linking() {
  // Who sleeps on this task already has seen too few dependencies to help with.
  if ((word_.fetch_or(linked_bit, std::memory_order_acq_rel) & waited_bit) != 0) {
    futex_wake_all(word_);
  }
  dependency_done();
}

void task::abandon() noexcept {
  kind_ = work_kind::none;
  work_.reset();
  queue_.reset();
  finish_linking();
}

void task::dependency_done() {
  if (unmet_.fetch_sub(1, std::memory_order_acq_rel) == 1) {
    executor::instance().submit(*this);
  }
}

std::vector<task_ref> task::dependencies() {
  const std::lock_guard<std::mutex> lock(mutex_);
  return dependencies_;
}

void task::set_state(task_state next) noexcept {
  const std::uint32_t before =
      word_.exchange(static_cast<std::uint32_t>(next), std::memory_order_acq_rel);
  if ((before & waited_bit) != 0) {
    futex_wake_all(word_);
  }
}

bool task::runs_on_this_thread() const noexcept {
  for (const running_frame* frame = innermost; frame != nullptr; frame = frame->outer) {
    if (frame->running == this) {
      return true;
    }
  }
  return false;
}

unsigned task::depth_of_this_thread() noexcept {
  unsigned depth = 0;
  for (const running_frame* frame = innermost; frame != nullptr; frame = frame->outer) {
    ++depth;
  }
  return depth;
}

const task* task::closing_on_this_thread() noexcept {
  return innermost != nullptr && innermost->closing ? innermost->running : nullptr;
}

// A task that this one cannot start without, preferably one that can be helped.
task_ref task::open_dependency() {
  const std::lock_guard<std::mutex> lock(mutex_);
  task_ref found;
  for (const task_ref& candidate : dependencies_) {
    const task_state its = candidate->state();
    if (its == task_state::ready) {
      return candidate;
    }
    if (its == task_state::pending || (its == task_state::running && !found)) {
      found = candidate;
    }
  }
  return found;
}

// Returns when the word is no longer the given one; may return for no reason.
void task::sleep_while(std::uint32_t word) noexcept {
  if ((word & waited_bit) != 0 ||
      word_.compare_exchange_strong(word, word | waited_bit, std::memory_order_acq_rel)) {
    futex_wait(word_, word | waited_bit);
  }
}

namespace {
void keep_if_possible(std::vector<task_ref>& path, task_ref passed) noexcept {
  if (passed) {
    try {
      path.push_back(std::move(passed));
    } catch (const std::bad_alloc&) {
    }
  }
}

task_ref take_last(std::vector<task_ref>& path) noexcept {
  if (path.empty()) {
    return {};
  }
  task_ref last = std::move(path.back());
  path.pop_back();
  return last;
}
}  // namespace

void task::wait() {
  executor& threads = executor::instance();
  // Each task of the path holds up the one before it, the first this one, and `last` is behind them
  // all. Whoever sleeps does it on the last: when that is done there may be nobody else to run what
  // becomes ready. The path only saves the way back: where there is no memory for it, the way
  // begins anew, as destructors wait and must not fail.
  std::vector<task_ref> path;
  task_ref last;  // null: this one
  for (int spins = 0;;) {
    task& now = last ? *last.get() : *this;
    const std::uint32_t word = now.word_.load(std::memory_order_acquire);
    const auto its = static_cast<task_state>(word & state_mask);
    if (its == task_state::done) {
      if (!last) {
        return;
      }
      last = take_last(path);
    } else if (its == task_state::ready) {
      if (threads.claim(now)) {
        now.run();
      }
    } else if (task_ref next = its == task_state::pending ? now.open_dependency() : task_ref()) {
      keep_if_possible(path, std::move(last));
      last = std::move(next);
    } else if (++spins < spins_before_sleep) {
      relax();
    } else {
      now.sleep_while(word);
    }
  }
}

void task::execute() {
  if (kind_ == work_kind::host) {
    static_cast<host_command&>(*work_).run(interop_handle(0));
  } else if (kind_ == work_kind::kernel) {
    const device_record& device = queue_->record;
    auto& kernel = static_cast<kernel_command&>(*work_);
    device.driver->launch(device, shape_, kernel);
    kernel.finish();
  }
}

void task::run() {
  const task_ref self = share(*this);
  running_frame frame{this, innermost, false};
  innermost = &frame;
  if (queue_ && queue_->profiling) {
    start_time.store(now_nanoseconds(), std::memory_order_relaxed);
  }
  std::exception_ptr error;
  try {
    execute();
  } catch (...) {
    error = std::current_exception();
  }
  if (queue_ && queue_->profiling) {
    end_time.store(now_nanoseconds(), std::memory_order_relaxed);
  }
  if (error && queue_) {
    queue_->report(std::move(error));
  }
  // Before done: what the closure holds is gone when a waiter returns.
  frame.closing = true;
  work_.reset();
  accesses_.clear();
  innermost = frame.outer;
  if (queue_) {
    queue_->remove(*this);
  }
  std::vector<task_ref> successors;
  std::vector<task_ref> dependencies;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    successors.swap(successors_);
    dependencies.swap(dependencies_);
    set_state(task_state::done);
  }
  for (const task_ref& successor : successors) {
    successor->dependency_done();
  }
  executor::instance().finished();
  release();  // the count that kept the task alive while it was unfinished
}

}  // namespace detail
LUMEN_NAMESPACE_END
