// SPDX-License-Identifier: Apache-2.0
// Who uses a buffer: the last writer, the readers since, and the host accessors that are alive.
// A reader comes after the writer, a writer after both (read after write, write after read,
// write after write).
#pragma once

#include <mutex>
#include <vector>

#include "task.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class access_record {
 public:
  // Guards all records, and keeps the order of command groups the same for all their buffers
  // and queues: two groups that met two buffers in opposite order would wait for each other.
  static std::mutex& order_mutex();

  // The rest expects the order mutex to be held.
  void add(task& user, bool writes);
  void add_holder(task& holder, bool writes);
  void remove_holder(const task& holder);
  // What a host access has to wait for.
  std::vector<task_ref> conflicts(bool writes) const;
  // A user that has not ended, other than one that runs on this thread; null if there is none.
  task_ref unfinished() const;

 private:
  struct holder {
    task_ref task;
    bool writes;
  };
  task_ref last_writer_;
  std::vector<task_ref> readers_;
  std::vector<holder> holders_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
