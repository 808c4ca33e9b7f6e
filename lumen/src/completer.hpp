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
  // Lets go of a task that another thread has ended. Those that the thread has in its hands it lets
  // go soon.
  void remove(task& done);
  // To be called before a thread goes on to what comes after a task: if it is this one's, it lets
  // the task go.
  void before_telling();
  // Returns when the thread holds none of the queue's tasks that are done. It runs the user's code
  // before that, and nobody waits for it here.
  void settle(const queue_core& queue);
  // For the end of the process: ends all tasks on the calling thread. On return no other thread
  // touches one.
  void end_all();

 private:
  void work();
  bool sweep();
  task* take();
  void put_back(task& open);
  void unlink(task& watched);
  void let_go(std::unique_lock<std::mutex>& lock);

  std::mutex mutex_;
  std::condition_variable come_;
  std::condition_variable put_down_;
  // Linked by ready_next and ready_previous; each is retained and marked as watched.
  task* first_ = nullptr;
  task* last_ = nullptr;
  std::size_t count_ = 0;
  bool busy_ = false;     // the thread is at one of them, or at what comes after it
  task* held_ = nullptr;  // the one that the thread looks after, or null
  const queue_core* giving_back_ = nullptr;  // the queue of one that it lets go, or null
  pid_t process_ = 0;  // where the thread is: a child made by fork has none of its own yet
  std::thread::id thread_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
