// SPDX-License-Identifier: Apache-2.0
// A submitted command group: its work, what it waits for and what waits for it. A task is
// pending until its dependencies are done, ready until a thread claims it, running, then done.
// Where the device works through a stream, running ends with the work in the stream: the task is
// issued until somebody has seen that the stream has done it. Tasks of streams need not see each
// other done: one that comes after another begins once that is issued, and the device keeps the
// order.
#pragma once

#include <atomic>
#include <cstdint>
#include <exception>
#include <memory>
#include <mutex>
#include <vector>

#include "sycl/detail/command_group.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class executor;
class stream_mark;

// Counted in a queue while a thread lets go of a task of it that is done, or is with the device:
// the task may be the last that holds the queue, and what stands behind it.
class parting {
 public:
  parting() = default;
  parting(const parting&) = delete;
  parting& operator=(const parting&) = delete;
  ~parting();
  void begin(const queue_core* queue) noexcept;
  // Whether the calling thread is within one: it must not wait for those of others.
  static bool on_this_thread() noexcept;

 private:
  std::shared_ptr<std::atomic<int>> count_;
};

// What a task lets go. It is told after the parting, since it may begin on the same thread.
struct released_tasks {
  std::vector<task_ref> successors;
  std::vector<task_ref> followers;
  bool after_the_end = false;  // of the task; else it is issued

  void tell();
};

enum class task_state : std::uint32_t { pending, ready, running, issued, done };

class task {
 public:
  // Without a queue the task stands for something that holds others up, such as a host accessor.
  task(std::shared_ptr<queue_core> queue, command_group&& group);
  task(const task&) = delete;
  task& operator=(const task&) = delete;
  ~task();

  void retain() noexcept { references_.fetch_add(1, std::memory_order_relaxed); }
  void release() noexcept {
    if (references_.fetch_sub(1, std::memory_order_acq_rel) == 1) {
      delete this;
    }
  }

  // Until finish_linking dependencies may be added; from then on the task may run.
  void depend_on(task& other);
  void finish_linking();
  // In place of finish_linking, when linking failed before the queue knew of the task: it does
  // nothing, but comes after all that it depends on so far, since others may come after it.
  void abandon() noexcept;

  task_state state() const noexcept {
    return static_cast<task_state>(word_.load(std::memory_order_acquire) & state_mask);
  }
  bool done() const noexcept { return state() == task_state::done; }
  // Blocks until done, running the task or what it depends on where nobody else does.
  void wait();
  // Runs a claimed task to its end, or into its stream, on the calling thread.
  void run();
  // The end of the work in the stream, as soon as the work is there; null where there is none.
  std::shared_ptr<stream_mark> wait_for_mark();
  // Whether the stream has done an issued task.
  bool reached() const noexcept;
  // Waits until the stream has done an issued task, and ends the task unless another thread is at
  // it: false then. Those that it follows have to be done.
  bool finish_issued();
  // One that an issued task follows and that is not done, although its work is where this one's is.
  task_ref issued_before();
  // True while the calling thread is inside run() of this task.
  bool runs_on_this_thread() const noexcept;
  // How many tasks the calling thread is inside of.
  static unsigned depth_of_this_thread() noexcept;
  // The task whose work is over and whose closure the calling thread is destroying, or null.
  static const task* closing_on_this_thread() noexcept;

  std::vector<task_ref> dependencies();
  const std::shared_ptr<queue_core>& queue() const noexcept { return queue_; }
  // To be read until finish_linking.
  const std::vector<access_request>& accesses() const noexcept { return accesses_; }

  // Nanoseconds; 0 where the queue does not profile.
  std::atomic<std::uint64_t> submit_time{0};
  std::atomic<std::uint64_t> start_time{0};
  std::atomic<std::uint64_t> end_time{0};

  // Links of the executor's ready list, guarded by the executor.
  task* ready_next = nullptr;
  task* ready_previous = nullptr;
  std::uint64_t ticket = 0;
  // Whether the completer's list has it, whose links are the same; guarded by the completer.
  bool watched = false;
  // Links of the queue's list of unfinished tasks, guarded by the queue.
  bool in_queue = false;
  task* queue_next = nullptr;
  task* queue_previous = nullptr;

 private:
  friend class executor;
  friend struct released_tasks;
  static constexpr std::uint32_t state_mask = 7;
  static constexpr std::uint32_t waited_bit = 8;
  static constexpr std::uint32_t linked_bit = 16;

  bool follows(const task& other) const noexcept;
  void execute();
  void issue();
  void wait_for_dependencies() noexcept;
  void run_and_part(released_tasks& released);
  bool finish_issued_and_part(released_tasks& released);
  void issued(parting& last, released_tasks& released);
  void finish(std::exception_ptr error, parting& last, released_tasks& released);
  void note_times();
  void dependency_done();
  void set_state(task_state next) noexcept;
  task_ref open_dependency();
  void sleep_while(std::uint32_t word) noexcept;

  std::atomic<std::uint32_t> references_{1};
  // The state in the low bits, plus whether somebody sleeps on this word and whether all
  // dependencies of a pending task are known.
  std::atomic<std::uint32_t> word_{0};
  // Unfinished dependencies, plus one while linking.
  std::atomic<std::uint32_t> unmet_{1};
  std::shared_ptr<queue_core> queue_;
  const work_kind kind_;
  const bool streamed_;      // the work goes through a stream while the host goes on
  const bool ends_on_host_;  // not all of it
  launch_shape shape_;
  std::unique_ptr<command> work_;
  std::vector<access_request> accesses_;  // keep the memory of buffers
  std::mutex mutex_;                      // guards the lists and the steps to issued and done
  std::vector<task_ref> dependencies_;
  std::vector<task_ref> successors_;  // begin when this is done
  std::vector<task_ref> followers_;   // begin when this is issued
  // Where the work begins and ends in the stream; unchanged from issued on.
  std::shared_ptr<stream_mark> begin_mark_;
  std::shared_ptr<stream_mark> end_mark_;
  std::atomic<bool> finishing_{false};
};

inline task_ref share(task& t) noexcept {
  t.retain();
  return task_ref(&t);
}

}  // namespace detail
LUMEN_NAMESPACE_END
