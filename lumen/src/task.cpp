// SPDX-License-Identifier: Apache-2.0
// The life of a task: linking, waiting, running, and waking what comes after.
#include "task.hpp"

#include <chrono>

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
      work_(std::move(group.work)) {}

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
    unmet_.fetch_add(1, std::memory_order_relaxed);
    other.successors_.push_back(share(*this));
  }
  const std::lock_guard<std::mutex> lock(mutex_);
  dependencies_.push_back(share(other));
}

void task::finish_linking() {
  dependency_done();
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

// A ready task that this one cannot start without, if the first open path leads to one.
task_ref task::ready_ancestor() {
  task_ref here = share(*this);
  for (;;) {
    task_ref next;
    for (const task_ref& candidate : here->dependencies()) {
      const task_state its = candidate->state();
      if (its == task_state::ready) {
        return candidate;
      }
      if (its == task_state::pending && !next) {
        next = candidate;
      }
    }
    if (!next) {
      return {};
    }
    here = next;
  }
}

void task::wait() {
  executor& threads = executor::instance();
  for (int spins = 0; !done();) {
    const task_state seen = state();
    if (seen == task_state::ready && threads.claim(*this)) {
      run();
      return;
    }
    if (seen == task_state::pending) {
      if (const task_ref ancestor = ready_ancestor()) {
        if (threads.claim(*ancestor.get())) {
          ancestor->run();
        }
        continue;
      }
    }
    if (++spins < spins_before_sleep) {
      relax();
      continue;
    }
    std::uint32_t word = word_.load(std::memory_order_acquire);
    const auto now = static_cast<task_state>(word & state_mask);
    if (now == task_state::pending || now == task_state::running) {
      if ((word & waited_bit) != 0 ||
          word_.compare_exchange_strong(word, word | waited_bit, std::memory_order_acq_rel)) {
        futex_wait(word_, word | waited_bit);
      }
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
  running_frame frame{this, innermost};
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
  try {
    work_.reset();  // before done: what the closure holds is gone when a waiter returns
  } catch (...) {
    error = std::current_exception();
  }
  if (queue_ && queue_->profiling) {
    end_time.store(now_nanoseconds(), std::memory_order_relaxed);
  }
  innermost = frame.outer;
  if (error && queue_) {
    queue_->report(std::move(error));
  }
  std::vector<task_ref> successors;
  std::vector<task_ref> dependencies;
  if (queue_) {
    queue_->remove(*this);
  }
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
