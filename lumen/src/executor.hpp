// SPDX-License-Identifier: Apache-2.0
// The threads that run tasks and share out the items of kernels. A submission wakes nobody while
// there is a sentinel: a worker that naps in short steps as long as there is activity and takes
// tasks that have lain ready for a whole nap, so that whoever waits at once runs them first.
// After 20 ms without a submission the sentinel sleeps deeply too. A child made by fork has no
// workers: there, waiting threads run the tasks.
#pragma once

#include <atomic>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <mutex>
#include <thread>
#include <vector>

#include <sys/types.h>

#include "task.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Work over [0, total) that several threads take in chunks. Lives on its leader's stack.
struct shared_loop {
  void (*body)(void* context, std::size_t begin, std::size_t end);
  void* context;
  std::size_t total;
  std::size_t grain;  // units of a chunk, at least 1
  unsigned threads;   // that may work on it at one time, at least 1
  std::atomic<std::size_t> next{0};
  unsigned helpers = 0;  // guarded by the executor

  shared_loop(void (*loop_body)(void*, std::size_t, std::size_t), void* loop_context,
              std::size_t loop_total, std::size_t loop_grain, unsigned loop_threads)
      : body(loop_body),
        context(loop_context),
        total(loop_total),
        grain(loop_grain),
        threads(loop_threads) {}

  // Runs one chunk; false when none is left.
  bool run_chunk();
};

class executor {
 public:
  // Lives until the process ends; its threads are joined at exit.
  static executor& instance();
  // Ends the work of the process at its end before those that have registered themselves so far do
  // anything: drivers that were loaded late end their own.
  static void stop_before_others();

  unsigned thread_count() const noexcept { return thread_count_; }

  // The task is ready: somebody will run it.
  void submit(task& ready);
  // The task is ready: it runs on the calling thread.
  void run_now(task& ready);
  // True from the end of main on.
  bool stopped();
  // Takes a ready task for the calling thread; false when it is not ready (any more).
  bool claim(task& wanted);
  // Runs the loop on the calling thread and as many workers as are free and the loop admits.
  void run(shared_loop& loop);
  // A claimed task was run to its end.
  void finished();

 private:
  executor();
  void start_threads();
  void work();
  void nap(std::unique_lock<std::mutex>& lock);
  void run_claimed(task& claimed, std::unique_lock<std::mutex>& lock);
  shared_loop* joinable_loop() const;
  void unlink(task& ready);
  void stop();

  const unsigned thread_count_;
  std::mutex mutex_;
  std::condition_variable sleepers_;    // workers in deep sleep
  std::condition_variable milestones_;  // a helper left a loop, a task ended while stopping
  task* first_ready_ = nullptr;
  task* last_ready_ = nullptr;
  std::uint64_t last_ticket_ = 0;
  std::uint64_t stale_ticket_ = 0;  // tasks up to here have lain for a whole nap
  std::vector<shared_loop*> loops_;
  unsigned sleeping_ = 0;
  unsigned running_ = 0;  // tasks claimed and not finished
  bool sentinel_ = false;
  bool stopping_ = false;
  bool stopped_ = false;
  pid_t process_;  // where the workers are
  std::vector<std::thread> threads_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
