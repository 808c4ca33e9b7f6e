// SPDX-License-Identifier: Apache-2.0
// The thread behind issued tasks.
#include "completer.hpp"

#include <algorithm>
#include <array>
#include <chrono>
#include <new>
#include <system_error>
#include <thread>

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

// Ends the tasks that their streams have done and takes them out of the list, whose last link comes
// back. `any` tells whether there were such.
task** sweep(task*& first, bool& any) {
  busy_queues busy;
  task** link = &first;
  while (*link != nullptr) {
    task& each = **link;
    const queue_core* const owner = each.queue().get();
    if (!each.done() && (busy.has(owner) || !each.reached())) {
      busy.add(owner);
      link = &each.ready_next;
      continue;
    }
    *link = each.ready_next;
    each.finish_issued();
    each.release();
    any = true;
  }
  return link;
}
}  // namespace

completer& completer::instance() {
  static completer& only = *new completer;
  return only;
}

void completer::add(task& issued) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    try {
      if (!started_) {
        std::thread([this] { work(); }).detach();
        started_ = true;
      }
    } catch (const std::bad_alloc&) {
    } catch (const std::system_error&) {
    }
    if (started_) {
      issued.retain();
      issued.ready_next = nullptr;
      (first_ != nullptr ? last_->ready_next : first_) = &issued;
      last_ = &issued;
      sleep_.notify_one();
      return;
    }
  }
  issued.finish_issued();
}

void completer::work() {
  task* mine = nullptr;
  task** end = &mine;
  std::chrono::microseconds nap = shortest_nap;
  for (;;) {
    {
      std::unique_lock<std::mutex> lock(mutex_);
      if (mine == nullptr) {
        sleep_.wait(lock, [this] { return first_ != nullptr; });
      }
      *end = first_;
      first_ = last_ = nullptr;
    }
    bool any = false;
    end = sweep(mine, any);
    nap = any ? shortest_nap : std::min(2 * nap, longest_nap);
    if (mine != nullptr) {
      std::this_thread::sleep_for(nap);
    }
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
