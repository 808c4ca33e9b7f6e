// SPDX-License-Identifier: Apache-2.0
// The thread behind issued tasks.
#include "completer.hpp"

#include <algorithm>
#include <array>
#include <chrono>
#include <new>
#include <system_error>
#include <thread>
#include <unistd.h>

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {
// A look costs about a microsecond for each stream with work.
constexpr std::chrono::microseconds shortest_nap(20);
constexpr std::chrono::microseconds longest_nap(200);

// Queues whose earliest task is not done: those behind it need not be asked. What does not fit is
// asked for nothing, which costs time only.
class busy_queues {
 public:
  bool has(const queue_core* queue) const {
    return std::find(queues_.begin(), queues_.begin() + count_, queue) != queues_.begin() + count_;
  }
  void add(const queue_core* queue) {
    if (count_ < static_cast<int>(queues_.size())) {
      queues_[static_cast<std::size_t>(count_++)] = queue;
    }
  }

 private:
  std::array<const queue_core*, 16> queues_{};
  int count_ = 0;
};

thread_local bool is_completer = false;

}  // namespace

completer& completer::instance() {
  static completer& only = *new completer;
  return only;
}

void completer::add(task& issued) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    try {
      if (process_ != getpid()) {
        // What a parent's thread had is nobody's here.
        while (first_ != nullptr) {
          unlink(*first_);
        }
        held_ = nullptr;
        giving_back_ = nullptr;
        busy_ = false;
        std::thread worker([this] { work(); });
        process_ = getpid();
        thread_ = worker.get_id();
        worker.detach();
      }
    } catch (const std::bad_alloc&) {
    } catch (const std::system_error&) {
    }
    if (issued.done()) {
      return;
    }
    if (process_ == getpid()) {
      issued.retain();
      put_back(issued);
      come_.notify_one();
      return;
    }
  }
  issued.wait();
}

void completer::remove(task& done) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!done.watched || process_ != getpid()) {
      return;
    }
    unlink(done);
  }
  done.release();
}

void completer::before_telling() {
  if (!is_completer) {
    return;
  }
  std::unique_lock<std::mutex> lock(mutex_);
  if (held_ != nullptr && held_->done()) {
    let_go(lock);
  }
}

void completer::settle(const queue_core& queue) {
  std::unique_lock<std::mutex> lock(mutex_);
  if (process_ != getpid() || std::this_thread::get_id() == thread_) {
    return;
  }
  put_down_.wait(lock, [this, &queue] {
    return giving_back_ != &queue &&
           (held_ == nullptr || held_->queue().get() != &queue || !held_->done());
  });
}

void completer::put_back(task& open) {
  open.watched = true;
  open.ready_next = nullptr;
  open.ready_previous = last_;
  (first_ != nullptr ? last_->ready_next : first_) = &open;
  last_ = &open;
  ++count_;
}

void completer::unlink(task& watched) {
  (watched.ready_previous != nullptr ? watched.ready_previous->ready_next : first_) =
      watched.ready_next;
  (watched.ready_next != nullptr ? watched.ready_next->ready_previous : last_) =
      watched.ready_previous;
  watched.watched = false;
  --count_;
}

// The first of the list, or null.
task* completer::take() {
  task* const taken = first_;
  if (taken != nullptr) {
    unlink(*taken);
  }
  return taken;
}

// What the thread held is done or goes back to the list.
void completer::let_go(std::unique_lock<std::mutex>& lock) {
  task& each = *held_;
  held_ = nullptr;
  if (each.done()) {
    giving_back_ = each.queue().get();
    lock.unlock();
    each.release();
    lock.lock();
    giving_back_ = nullptr;
  } else {
    put_back(each);
  }
  put_down_.notify_all();
}

// Looks at each task once and ends those that their streams have done. Returns whether there were
// such.
bool completer::sweep() {
  busy_queues busy;
  bool any = false;
  std::unique_lock<std::mutex> lock(mutex_);
  for (std::size_t left = count_; left > 0; --left) {
    task* const each = take();
    if (each == nullptr) {
      break;
    }
    held_ = each;
    busy_ = true;
    lock.unlock();
    const queue_core* const owner = each->queue().get();
    const bool open =
        !each->done() && (busy.has(owner) || !each->reached() || each->issued_before());
    if (open) {
      busy.add(owner);
    } else if (!each->done()) {
      each->finish_issued();  // the task may be gone when it returns
    }
    any = any || !open;
    lock.lock();
    if (held_ != nullptr) {
      let_go(lock);
    }
    busy_ = false;
    put_down_.notify_all();
  }
  return any;
}

void completer::work() {
  is_completer = true;
  std::chrono::microseconds nap = shortest_nap;
  for (;;) {
    {
      std::unique_lock<std::mutex> lock(mutex_);
      come_.wait(lock, [this] { return first_ != nullptr; });
    }
    nap = sweep() ? shortest_nap : std::min(2 * nap, longest_nap);
    std::this_thread::sleep_for(nap);
  }
}

void completer::end_all() {
  std::unique_lock<std::mutex> lock(mutex_);
  const bool self = std::this_thread::get_id() == thread_;
  for (;;) {
    if (task* const each = take()) {
      lock.unlock();
      each->wait();
      each->release();
      lock.lock();
    } else if (busy_ && !self) {
      put_down_.wait(lock);
    } else {
      return;
    }
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
