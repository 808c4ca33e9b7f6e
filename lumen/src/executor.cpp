// SPDX-License-Identifier: Apache-2.0
// The thread pool. One mutex guards the ready list, the loops and the roles of the workers: it
// is held for a few dozen instructions at a time.
#include "executor.hpp"

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <ctime>
#include <new>
#include <system_error>
#include <unistd.h>

#include <sys/prctl.h>

#include "completer.hpp"
#include "settings.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {
// Waking up adds some 25 us on a virtual machine: a task that nobody waits for starts after some
// tens of microseconds.
constexpr long nap_nanoseconds = 20'000;
constexpr unsigned naps_until_deep_sleep = 450;  // about 20 ms
thread_local bool is_worker = false;
}  // namespace

bool shared_loop::run_chunk() {
  const std::size_t begin = next.fetch_add(grain, std::memory_order_relaxed);
  if (begin >= total) {
    return false;
  }
  body(context, begin, begin + std::min(grain, total - begin));
  return true;
}

executor& executor::instance() {
  // Never destroyed: tasks submitted by late static destructors still find it.
  static executor& only = *new executor;
  return only;
}

// The process may do all its work in streams and never start a worker.
executor::executor() : thread_count_(number_of_threads()), process_(getpid()) {
  stop_before_others();
}

void executor::stop_before_others() {
  std::atexit([] { instance().stop(); });
}

void executor::start_threads() {
  process_ = getpid();
  try {
    threads_.reserve(thread_count_);
    for (unsigned i = 0; i < thread_count_; ++i) {
      threads_.emplace_back([this] { work(); });
    }
  } catch (const std::system_error&) {
    // at a limit of the system: fewer workers are slower, not wrong
  } catch (const std::bad_alloc&) {
    // the same
  }
}

void executor::submit(task& ready) {
  bool wake = false;
  {
    std::unique_lock<std::mutex> lock(mutex_);
    if (stopped_) {
      // The workers are gone: the task runs here, now.
      lock.unlock();
      run_now(ready);
      return;
    }
    ready.ticket = ++last_ticket_;
    ready.ready_previous = last_ready_;
    ready.ready_next = nullptr;
    (last_ready_ != nullptr ? last_ready_->ready_next : first_ready_) = &ready;
    last_ready_ = &ready;
    ready.set_state(task_state::ready);
    if (threads_.empty()) {
      start_threads();
    }
    wake = !sentinel_ && sleeping_ > 0;
  }
  if (wake) {
    sleepers_.notify_one();
  }
}

void executor::run_now(task& ready) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    ready.set_state(task_state::running);
    ++running_;
  }
  ready.run();
}

bool executor::stopped() {
  const std::lock_guard<std::mutex> lock(mutex_);
  return stopped_;
}

void executor::unlink(task& ready) {
  (ready.ready_previous != nullptr ? ready.ready_previous->ready_next : first_ready_) =
      ready.ready_next;
  (ready.ready_next != nullptr ? ready.ready_next->ready_previous : last_ready_) =
      ready.ready_previous;
  ready.ready_next = ready.ready_previous = nullptr;
  ready.set_state(task_state::running);
  ++running_;
}

bool executor::claim(task& wanted) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (wanted.state() != task_state::ready) {
    return false;
  }
  unlink(wanted);
  return true;
}

void executor::finished() {
  const std::lock_guard<std::mutex> lock(mutex_);
  --running_;
  if (stopping_) {
    milestones_.notify_all();
  }
}

shared_loop* executor::joinable_loop() const {
  for (shared_loop* loop : loops_) {
    if (loop->next.load(std::memory_order_relaxed) < loop->total &&
        loop->helpers + 1 < loop->threads) {
      return loop;
    }
  }
  return nullptr;
}

void executor::run(shared_loop& loop) {
  const std::size_t chunks = (loop.total + loop.grain - 1) / loop.grain;
  // The first of many chunks runs before anybody is woken: a short loop then costs no wake-up.
  const auto begin = std::chrono::steady_clock::now();
  bool alone = loop.threads < 2 || chunks < 2;
  if (!alone && chunks >= std::size_t{4} * loop.threads && loop.run_chunk()) {
    const auto chunk_time = std::chrono::steady_clock::now() - begin;
    alone = chunk_time * (chunks - 1) < std::chrono::microseconds(20);
  }
  if (alone) {
    while (loop.run_chunk()) {
    }
    return;
  }
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!stopped_) {
      if (threads_.empty()) {
        start_threads();
      }
      loops_.push_back(&loop);
      sleepers_.notify_all();
    }
  }
  while (loop.run_chunk()) {
  }
  std::unique_lock<std::mutex> lock(mutex_);
  const auto place = std::find(loops_.begin(), loops_.end(), &loop);
  if (place != loops_.end()) {
    loops_.erase(place);
  }
  milestones_.wait(lock, [&loop] { return loop.helpers == 0; });
}

void executor::nap(std::unique_lock<std::mutex>& lock) {
  const std::uint64_t seen = last_ticket_;
  lock.unlock();
  const timespec step{0, nap_nanoseconds};
  nanosleep(&step, nullptr);
  lock.lock();
  stale_ticket_ = std::max(stale_ticket_, seen);
}

void executor::run_claimed(task& claimed, std::unique_lock<std::mutex>& lock) {
  // Somebody else must watch while this worker is busy.
  const bool watch = !sentinel_ && sleeping_ > 0;
  lock.unlock();
  if (watch) {
    sleepers_.notify_one();
  }
  claimed.run();
  lock.lock();
}

void executor::work() {
  is_worker = true;
  prctl(PR_SET_TIMERSLACK, 1000UL);  // naps as long as they say, not 50 us longer
  std::unique_lock<std::mutex> lock(mutex_);
  bool eager = false;  // just done with something: takes a ready task of any age
  unsigned idle_naps = 0;
  std::uint64_t seen = last_ticket_;
  while (!stopped_) {
    if (shared_loop* loop = joinable_loop()) {
      ++loop->helpers;
      lock.unlock();
      while (loop->run_chunk()) {
      }
      lock.lock();
      --loop->helpers;
      milestones_.notify_all();
      eager = true;
    } else if (first_ready_ != nullptr && (eager || first_ready_->ticket <= stale_ticket_)) {
      task& next = *first_ready_;
      unlink(next);
      run_claimed(next, lock);
      eager = true;
    } else if (!sentinel_ &&
               (first_ready_ != nullptr || (idle_naps < naps_until_deep_sleep && loops_.empty()))) {
      // While a loop runs, naps would take its processors from it, and whoever ends it looks
      // around.
      sentinel_ = true;
      nap(lock);
      sentinel_ = false;
      idle_naps = seen == last_ticket_ ? idle_naps + 1 : 0;
      seen = last_ticket_;
      eager = false;
    } else {
      ++sleeping_;
      sleepers_.wait(lock);
      --sleeping_;
      idle_naps = 0;
      eager = false;
    }
  }
}

void executor::stop() {
  std::unique_lock<std::mutex> lock(mutex_, std::try_to_lock);
  if (!lock.owns_lock()) {
    if (process_ != getpid()) {
      return;  // held by a worker of the parent at the time of the fork, and for good
    }
    lock.lock();
  }
  stopping_ = true;
  // What is ready runs to its end, and what becomes ready by that. What hangs on a host
  // accessor that nobody will release is left, and so are the tasks that called exit.
  const unsigned mine = task::depth_of_this_thread();
  for (;;) {
    if (first_ready_ != nullptr) {
      task& next = *first_ready_;
      unlink(next);
      run_claimed(next, lock);
    } else if (running_ > mine && process_ == getpid()) {
      // Issued tasks are ended here: the thread that looks after them may be the one that ends the
      // process. More of them may come without a milestone.
      lock.unlock();
      completer::instance().end_all();
      lock.lock();
      if (first_ready_ == nullptr && running_ > mine) {
        milestones_.wait_for(lock, std::chrono::milliseconds(1));
      }
    } else {
      break;
    }
  }
  stopped_ = true;
  if (process_ == getpid()) {
    // Nobody touches a device from now on.
    lock.unlock();
    completer::instance().end_all();
    lock.lock();
  }
  sleepers_.notify_all();
  lock.unlock();
  for (std::thread& thread : threads_) {
    // A child made by fork has no workers; a worker that calls exit cannot wait for itself.
    if (process_ != getpid() || is_worker) {
      thread.detach();
    } else {
      thread.join();
    }
  }
  threads_.clear();  // the next call finds none
}

}  // namespace detail
LUMEN_NAMESPACE_END
