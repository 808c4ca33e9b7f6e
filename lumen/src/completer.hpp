// SPDX-License-Identifier: Apache-2.0
// Ends issued tasks that nobody waits for: a thread that looks after the streams in short steps as
// long as there is work in them. Without it what comes after a device on the host would not begin,
// and closures would keep their memory.
#pragma once

#include <condition_variable>
#include <mutex>

#include "task.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class completer {
 public:
  // Lives until the process ends, as does its thread.
  static completer& instance();
  // Needs no memory. Where there is no thread to be had, the task is waited for at once.
  void add(task& issued);

 private:
  void work();

  std::mutex mutex_;
  std::condition_variable sleep_;
  // Tasks that came since the thread looked last, linked by ready_next; each is retained.
  task* first_ = nullptr;
  task* last_ = nullptr;
  bool started_ = false;
};

}  // namespace detail
LUMEN_NAMESPACE_END
