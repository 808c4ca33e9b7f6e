// SPDX-License-Identifier: Apache-2.0
// A stack of its own for a function, entered and left by plain switches on one thread
// (Boost.Context). The address and thread sanitizers are told of every switch.
#pragma once

#include <cstddef>

#include "sycl/detail/config.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// What the C++ runtime keeps for each thread about exceptions that are thrown or being handled
// (Itanium C++ ABI, section 2.2.2). A fiber may leave in the middle of a catch block.
struct exceptions_in_flight {
  void* caught = nullptr;
  unsigned uncaught_count = 0;
};

// A place to come back to: a fiber that is not running, or the thread's own stack.
class fiber;
struct switch_point {
  void* context = nullptr;
  fiber* owner = nullptr;          // null for a thread's own stack
  switch_point* target = nullptr;  // where the last switch from here went
  exceptions_in_flight exceptions;
  exceptions_in_flight* thread_exceptions = nullptr;  // of the thread, which stays the same
  // For the sanitizers only.
  void* fake_stack = nullptr;
  const void* stack_bottom = nullptr;
  std::size_t stack_size = 0;
  void* thread_fiber = nullptr;
};

// Leaves `from` and goes on at `to`; returns when somebody switches back to `from`.
void switch_to(switch_point& from, switch_point& to) noexcept;

// Makes the calling thread's own stack a switch point.
void adopt_thread(switch_point& self) noexcept;

class fiber {
 public:
  // For the calling thread alone. `entry` starts at the first switch to the fiber and never
  // returns. The colour moves the top of the stack, so that many stacks do not share their cache
  // sets.
  fiber(void (*entry)(void*), void* argument, std::size_t colour);
  fiber(const fiber&) = delete;
  fiber& operator=(const fiber&) = delete;
  ~fiber();

  switch_point point;

 private:
  friend struct fiber_start;
  void (*entry_)(void*);
  void* argument_;
  char* mapping_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
