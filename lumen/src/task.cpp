// SPDX-License-Identifier: Apache-2.0
// The life of a task: linking, waiting, running, and waking what comes after.
#include "task.hpp"

#include <algorithm>
#include <chrono>
#include <new>
#include <thread>

#include "access_record.hpp"
#include "backend.hpp"
#include "buffer_copies.hpp"
#include "clock.hpp"
#include "completer.hpp"
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

namespace {
// What uses the host's memory of a buffer has to find it current when it begins.
bool goes_through_stream(work_kind kind, const queue_core* queue,
                         const std::vector<access_request>& accesses) {
  return kind == work_kind::device && queue != nullptr && queue->record.detached &&
         std::none_of(accesses.begin(), accesses.end(),
                      [](const access_request& access) { return access.place == nullptr; });
}
}  // namespace

task::task(std::shared_ptr<queue_core> queue, command_group&& group)
    : queue_(std::move(queue)),
      kind_(group.kind),
      streamed_(goes_through_stream(kind_, queue_.get(), group.accesses)),
      ends_on_host_(streamed_ && group.work != nullptr &&
                    static_cast<device_command&>(*group.work).ends_on_host()),
      shape_(group.shape),
      work_(std::move(group.work)),
      accesses_(std::move(group.accesses)) {}

task::~task() = default;

void task::depend_on(task& other) {
  if (&other == this) {
    return;
  }
  const bool in_stream = follows(other);
  {
    const std::lock_guard<std::mutex> lock(other.mutex_);
    if (other.done()) {
      return;
    }
    if (!in_stream || other.state() != task_state::issued) {
      // May throw: nothing is counted then.
      (in_stream ? other.followers_ : other.successors_).push_back(share(*this));
      unmet_.fetch_add(1, std::memory_order_relaxed);
    }
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
  work_.reset();
  accesses_.clear();
  finish_linking();
}

// Whether the device itself keeps this task behind the other.
bool task::follows(const task& other) const noexcept {
  return streamed_ && other.streamed_ && !other.ends_on_host_ &&
         reach_each_other(*queue_->place, *other.queue_->place);
}

void task::dependency_done() {
  if (unmet_.fetch_sub(1, std::memory_order_acq_rel) != 1) {
    return;
  }
  // Putting work into a stream is short, and the order of the streams is that of the submissions.
  // Where a long chain becomes ready at once the rest of it goes through the ready list.
  static thread_local unsigned chained = 0;
  constexpr unsigned longest_chain = 32;
  if (streamed_ && chained < longest_chain) {
    ++chained;
    executor::instance().run_now(*this);
    --chained;
  } else {
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
    const bool holds_up =
        its == task_state::running || (its == task_state::issued && !follows(*candidate.get()));
    if (its == task_state::pending || (holds_up && !found)) {
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
        if (queue_) {
          queue_->settle();
        }
        return;
      }
      last = take_last(path);
    } else if (its == task_state::ready) {
      if (threads.claim(now)) {
        now.run();
      }
    } else if (task_ref next = its == task_state::pending  ? now.open_dependency()
                               : its == task_state::issued ? now.issued_before()
                                                           : task_ref()) {
      keep_if_possible(path, std::move(last));
      last = std::move(next);
    } else if (its == task_state::issued && now.finish_issued()) {
      continue;
    } else if (++spins < spins_before_sleep) {
      relax();
    } else {
      now.sleep_while(word);
    }
  }
}

void task::execute() {
  for (const access_request& access : accesses_) {
    if (access.place == nullptr) {
      access.core->to_host({access.writes, access.keeps});
    }
  }
  if (streamed_) {
    const std::lock_guard<std::mutex> lock(queue_->issue_mutex);
    try {
      issue();
    } catch (...) {
      // What went in before the failure uses what the task is about to give back, and who comes
      // after this task counts on what it comes after.
      end_mark_.reset();
      queue_->stream->drain();
      wait_for_dependencies();
      throw;
    }
  } else if (work_ == nullptr) {
    return;
  } else if (kind_ == work_kind::host) {
    static_cast<host_command&>(*work_).run(
        interop_handle(queue_ ? queue_->dev.get_backend() : backend::host));
  } else if (kind_ == work_kind::device) {
    static_cast<device_command&>(*work_).enqueue(*queue_->stream, shape_);
  }
}

void task::wait_for_dependencies() noexcept {
  for (const task_ref& dependency : dependencies_) {
    if (dependency->state() == task_state::issued) {
      try {
        dependency->end_mark_->wait();
      } catch (...) {  // told by the dependency itself
        while (!dependency->end_mark_->reached()) {
          std::this_thread::yield();
        }
      }
    }
  }
}

namespace {
thread_local unsigned partings_of_this_thread = 0;
}

void parting::begin(const queue_core* queue) noexcept {
  if (!count_ && queue != nullptr && queue->record.detached) {
    count_ = queue->partings;
    count_->fetch_add(1, std::memory_order_relaxed);
    ++partings_of_this_thread;
  }
}
parting::~parting() {
  if (count_) {
    --partings_of_this_thread;
    count_->fetch_sub(1, std::memory_order_release);
  }
}
bool parting::on_this_thread() noexcept {
  return partings_of_this_thread != 0;
}

void task::issue() {
  command_stream& stream = *queue_->stream;
  for (const task_ref& dependency : dependencies_) {
    if (dependency->state() == task_state::issued && dependency->queue_ != queue_) {
      stream.wait_for(*dependency->end_mark_);
    }
  }
  for (const access_request& access : accesses_) {
    if (access.place != nullptr) {
      access.core->copies().to_device(*access.place, stream, {access.writes, access.keeps});
    }
  }
  if (queue_->profiling) {
    begin_mark_ = stream.mark();
  }
  if (work_ != nullptr) {
    static_cast<device_command&>(*work_).enqueue(stream, shape_);
  }
  end_mark_ = stream.mark();
}

// No reference is kept to a task that may begin: it holds itself until it is done, and whoever
// waits for it then may take away what stands behind it.
void released_tasks::tell() {
  completer::instance().before_telling();
  for (std::vector<task_ref>* const list : {&successors, &followers}) {
    for (task_ref& each : *list) {
      task& released = *each.get();
      each = task_ref();
      released.dependency_done();
    }
  }
  if (after_the_end) {
    executor::instance().finished();
  }
}

void task::run() {
  released_tasks released;
  run_and_part(released);
  released.tell();
}

void task::run_and_part(released_tasks& released) {
  parting last;
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
  innermost = frame.outer;
  if (end_mark_) {
    issued(last, released);
  } else {
    finish(std::move(error), last, released);
  }
}

void task::issued(parting& last, released_tasks& released) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    released.followers.swap(followers_);
    last.begin(queue_.get());
    set_state(task_state::issued);
  }
  if (executor::instance().stopped()) {
    wait();  // the process ends: nobody looks later
  } else {
    completer::instance().add(*this);
  }
}

std::shared_ptr<stream_mark> task::wait_for_mark() {
  executor& threads = executor::instance();
  for (;;) {
    const task_state its = state();
    if (its == task_state::issued || its == task_state::done) {
      return end_mark_;
    }
    if (its == task_state::ready && threads.claim(*this)) {
      run();
    } else if (const task_ref before =
                   its == task_state::pending ? open_dependency() : task_ref()) {
      before->wait();
    } else {
      std::this_thread::yield();
    }
  }
}

bool task::reached() const noexcept {
  return end_mark_->reached();
}

task_ref task::issued_before() {
  const std::lock_guard<std::mutex> lock(mutex_);
  // One that this thread is about to end, in whose handler it waits here, is as good as done.
  const auto found =
      std::find_if(dependencies_.begin(), dependencies_.end(), [](const task_ref& dependency) {
        return dependency->state() == task_state::issued && !dependency->runs_on_this_thread();
      });
  return found == dependencies_.end() ? task_ref() : *found;
}

bool task::finish_issued() {
  released_tasks released;
  const bool ended = finish_issued_and_part(released);
  released.tell();
  return ended;
}

bool task::finish_issued_and_part(released_tasks& released) {
  parting last;
  const task_ref self = share(*this);
  std::exception_ptr error;
  try {
    end_mark_->wait();
  } catch (...) {
    error = std::current_exception();
  }
  if (finishing_.exchange(true)) {
    return false;
  }
  if (error && !end_mark_->reached()) {
    // The device is still at work on what the task is about to give back.
    const std::lock_guard<std::mutex> lock(queue_->issue_mutex);
    queue_->stream->drain();
  }
  finish(std::move(error), last, released);
  return true;
}

void task::note_times() {
  if (end_mark_) {
    const std::uint64_t began = std::max(submit_time.load(), begin_mark_->time());
    start_time.store(began, std::memory_order_relaxed);
    end_time.store(std::max(began, end_mark_->time()), std::memory_order_relaxed);
  } else {
    end_time.store(now_nanoseconds(), std::memory_order_relaxed);
  }
}

// The work is over: tells of its error, gives back what it held, and lets go what comes after.
void task::finish(std::exception_ptr error, parting& last, released_tasks& released) {
  const task_ref self = share(*this);
  running_frame frame{this, innermost, false};
  innermost = &frame;
  try {
    if (!error && kind_ == work_kind::device && work_ != nullptr) {
      static_cast<device_command&>(*work_).finish();
    }
    // A command that failed may have no times.
    if (queue_ && queue_->profiling && !(error && end_mark_)) {
      note_times();
    }
  } catch (...) {
    error = std::current_exception();
  }
  if (error && queue_) {
    queue_->report(std::move(error));
  }
  // Before done: what the closure holds is gone when a waiter returns.
  frame.closing = true;
  work_.reset();
  accesses_.clear();
  innermost = frame.outer;
  if (in_queue) {
    queue_->remove(*this);
  }
  std::vector<task_ref> dependencies;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    released.successors.swap(successors_);
    released.followers.swap(followers_);
    released.after_the_end = true;
    dependencies.swap(dependencies_);
    last.begin(queue_.get());
    set_state(task_state::done);
  }
  if (end_mark_) {
    completer::instance().remove(*this);
  }
  release();  // the count that kept the task alive while it was unfinished
}

}  // namespace detail
LUMEN_NAMESPACE_END
