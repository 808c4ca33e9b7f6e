// SPDX-License-Identifier: Apache-2.0
// Runs the items of one work-group on one thread, in item order. A fiber loops over the items;
// only when one of them meets a barrier is that fiber parked and another started for the next
// item. A group without barriers costs one switch to the first fiber and one back.
#pragma once

#include <cstddef>
#include <exception>
#include <memory>
#include <vector>

#include "fiber.hpp"
#include "sycl/detail/command.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class group_runner : private group_frame {
 public:
  // The runner of the calling thread, made at first use.
  static group_runner& of_this_thread();

  group_runner();
  group_runner(const group_runner&) = delete;
  group_runner& operator=(const group_runner&) = delete;
  ~group_runner();

  // Runs the groups [begin, end) of a launch. Throws the first error of an item, or errc::runtime
  // when items of a group end or wait at different barriers.
  void run(const kernel_command& kernel, const launch_shape& shape, std::size_t begin,
           std::size_t end);

 private:
  friend void host_group_wait(group_frame& frame);
  struct worker {
    std::unique_ptr<fiber> stack;
    group_runner* runner;
    std::size_t number;
    bool parked = false;
  };
  struct cancelled {};  // unwinds the items of a group that has failed

  static void fiber_main(void* argument);
  void run_group();
  void wait_here();
  void leave(worker& self);
  worker& worker_at(std::size_t number);
  void fail(std::exception_ptr error);

  const kernel_command* kernel_ = nullptr;
  std::vector<std::unique_ptr<worker>> workers_;
  std::size_t started_ = 0;  // workers that serve the current group
  worker* current_ = nullptr;
  switch_point thread_;
  bool failed_ = false;
  std::exception_ptr error_;
  std::vector<void*> board_;
  std::unique_ptr<char, void (*)(void*)> local_memory_;
  std::size_t local_capacity_ = 0;
};

}  // namespace detail
LUMEN_NAMESPACE_END
