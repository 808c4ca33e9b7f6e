// SPDX-License-Identifier: Apache-2.0
// Ends issued tasks that nobody waits for: a thread that looks after the streams in short steps as
// long as there is work in them. Without it what comes after a device on the host would not begin,
// and closures would keep their memory.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <mutex>
#include <thread>

#include <sys/types.h>

#include "task.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class completer {
 public:
  // Lives until the process ends, as does its thread.
  static completer& instance();
  // Needs no memory. Where there is no thread to be had, the task is waited for at once.
  void add(task& issued);
  // For the end of the process: ends all tasks on the calling thread. On return no other thread
  // touches one.
  void end_all();

 private:
  void work();
  bool sweep();
  task* take();
  void put_back(task& open);
  void put_down();

  std::mutex mutex_;
  std::condition_variable come_;
  std::condition_variable put_down_;
  // Linked by ready_next; each is retained.
  task* first_ = nullptr;
  task* last_ = nullptr;
  std::size_t count_ = 0;
  bool holds_ = false;  // the thread has one of them in its hands
  pid_t process_ = 0;   // where the thread is: a child made by fork has none of its own yet
  std::thread::id thread_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
