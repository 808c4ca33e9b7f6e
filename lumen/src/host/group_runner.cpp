// SPDX-License-Identifier: Apache-2.0
// Phases of a group: in each one all items either meet the same barrier or end. In the first
// phase fibers start one by one; in later ones they are resumed in the order of their items.
#include "group_runner.hpp"

#include <cstdlib>
#include <new>
#include <utility>

#include "sycl/detail/exception.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

__thread char* local_memory_base = nullptr;

namespace {
constexpr std::size_t local_alignment = 128;  // the largest vec has 128 bytes

std::exception_ptr divergence() {
  return std::make_exception_ptr(
      exception(make_error_code(errc::runtime),
                "divergent barrier: items of one work-group ended or waited at another barrier"));
}
}  // namespace

void host_group_wait(group_frame& frame) {
  static_cast<group_runner&>(frame).wait_here();
}

group_runner& group_runner::of_this_thread() {
  // A plain pointer, because tasks may still run on a thread whose objects are destroyed: the
  // main thread finishes at exit what is left. The runner made then stays.
  static thread_local group_runner* runner = nullptr;
  struct release {
    ~release() { delete std::exchange(runner, nullptr); }
  };
  if (runner == nullptr) {
    runner = new group_runner;
    static thread_local const release at_thread_end;
  }
  return *runner;
}

group_runner::group_runner() : local_memory_(nullptr, &std::free) {}
group_runner::~group_runner() = default;

group_runner::worker& group_runner::worker_at(std::size_t number) {
  if (number == workers_.size()) {
    auto made = std::make_unique<worker>();
    made->runner = this;
    made->number = number;
    made->stack = std::make_unique<fiber>(&fiber_main, made.get(), number);
    workers_.push_back(std::move(made));
  }
  return *workers_[number];
}

void group_runner::run(const kernel_command& kernel, const launch_shape& shape, std::size_t begin,
                       std::size_t end) {
  kernel_ = &kernel;
  item_count = 1;
  for (int d = 0; d < 3; ++d) {
    local_range[d] = shape.local_range[d];
    group_range[d] = shape.global_range[d] / shape.local_range[d];
    offset[d] = shape.offset[d];
    item_count *= local_range[d];
  }
  board_.resize(item_count);
  exchange = board_.data();
  if (shape.local_bytes > local_capacity_) {
    const std::size_t bytes =
        (shape.local_bytes + local_alignment - 1) / local_alignment * local_alignment;
    local_memory_.reset(static_cast<char*>(std::aligned_alloc(local_alignment, bytes)));
    if (!local_memory_) {
      local_capacity_ = 0;
      throw std::bad_alloc();
    }
    local_capacity_ = bytes;
  }
  local_memory_base = local_memory_.get();
  adopt_thread(thread_);
  for (std::size_t g = begin; g < end; ++g) {
    // Row-major over the launch's own dimensions.
    std::size_t rest = g;
    for (int d = shape.dimensions - 1; d >= 0; --d) {
      group_id[d] = rest % group_range[d];
      rest /= group_range[d];
    }
    run_group();
    if (error_) {
      std::rethrow_exception(std::exchange(error_, nullptr));
    }
  }
}

void group_runner::run_group() {
  next_item = arrived = ended = 0;
  diverged = failed_ = false;
  started_ = 1;
  current_ = &worker_at(0);
  switch_to(thread_, current_->stack->point);
  // After a failure the parked items are unwound one by one, each coming back here.
  for (std::size_t i = 0; i < started_; ++i) {
    if (workers_[i]->parked) {
      current_ = workers_[i].get();
      switch_to(thread_, current_->stack->point);
    }
  }
}

void group_runner::fiber_main(void* argument) {
  worker& self = *static_cast<worker*>(argument);
  group_runner& runner = *self.runner;
  for (;;) {
    std::exception_ptr error;
    try {
      runner.kernel_->run_group(runner);
      if (runner.diverged) {
        error = divergence();
      }
    } catch (const cancelled&) {
    } catch (...) {
      error = std::current_exception();
    }
    if (error) {
      runner.fail(std::move(error));
    }
    runner.leave(self);
  }
}

void group_runner::fail(std::exception_ptr error) {
  if (!failed_) {
    failed_ = true;
    error_ = std::move(error);
  }
}

// The items of this fiber are done: on to the next fiber of the phase, or back to the thread.
void group_runner::leave(worker& self) {
  if (!failed_ && self.number + 1 < started_) {
    current_ = workers_[self.number + 1].get();
    switch_to(self.stack->point, current_->stack->point);
  } else {
    switch_to(self.stack->point, thread_);
  }
}

void group_runner::wait_here() {
  if (failed_) {
    // A barrier in a destructor that runs because the group failed.
    if (std::uncaught_exceptions() > 0) {
      return;
    }
    throw cancelled{};
  }
  if (ended != 0) {
    fail(divergence());
    throw cancelled{};
  }
  ++arrived;
  worker& self = *current_;
  worker* next = nullptr;
  if (self.number + 1 < started_) {
    next = workers_[self.number + 1].get();
  } else if (next_item < item_count) {
    next = &worker_at(started_);
    ++started_;
  } else {
    next = workers_[0].get();
  }
  if (next->number == 0) {
    arrived = 0;  // the last item has come: the next phase begins
  }
  if (next == &self) {
    return;
  }
  self.parked = true;
  current_ = next;
  switch_to(self.stack->point, next->stack->point);
  self.parked = false;
  if (failed_) {
    throw cancelled{};
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
