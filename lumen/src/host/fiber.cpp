// SPDX-License-Identifier: Apache-2.0
// Stacks and switches. A stack is a mapping of its own with a guard page below, of which only
// touched pages cost memory.
#include "fiber.hpp"

#include <cxxabi.h>
#include <new>
#include <unistd.h>

#include <boost/context/detail/fcontext.hpp>
#include <sys/mman.h>

#if defined(__SANITIZE_ADDRESS__)
#define LUMEN_ASAN 1
#include <sanitizer/asan_interface.h>
#include <sanitizer/common_interface_defs.h>
#else
#define LUMEN_ASAN 0
#endif
#if defined(__SANITIZE_THREAD__)
#define LUMEN_TSAN 1
#include <sanitizer/tsan_interface.h>
#else
#define LUMEN_TSAN 0
#endif

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {
namespace context = boost::context::detail;

// Instrumented code has larger frames.
constexpr std::size_t stack_bytes = LUMEN_ASAN || LUMEN_TSAN ? 256 * 1024 : 64 * 1024;
// At a power-of-two distance all tops would fall into the same cache sets, which costs three to
// five times per barrier at 1024 items; steps of three lines over one page spread them.
constexpr std::size_t colour_step = 192;
constexpr std::size_t colours = 21;

std::size_t page_bytes() {
  static const auto bytes = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
  return bytes;
}

exceptions_in_flight* exceptions_of_this_thread() {
  return reinterpret_cast<exceptions_in_flight*>(abi::__cxa_get_globals());
}

// First thing on arrival: remember where the other side can be resumed.
void arrive(switch_point& self, const context::transfer_t& from) {
  auto& origin = *static_cast<switch_point*>(from.data);
  origin.context = from.fctx;
#if LUMEN_ASAN
  __sanitizer_finish_switch_fiber(self.fake_stack, &origin.stack_bottom, &origin.stack_size);
#else
  (void)self;
#endif
}
}  // namespace

void switch_to(switch_point& from, switch_point& to) noexcept {
  from.target = &to;
  from.exceptions = *from.thread_exceptions;
  *from.thread_exceptions = to.exceptions;
#if LUMEN_ASAN
  __sanitizer_start_switch_fiber(&from.fake_stack, to.stack_bottom, to.stack_size);
#endif
#if LUMEN_TSAN
  __tsan_switch_to_fiber(to.thread_fiber, 0);
#endif
  arrive(from, context::jump_fcontext(to.context, &from));
}

void adopt_thread(switch_point& self) noexcept {
  self.thread_exceptions = exceptions_of_this_thread();
#if LUMEN_TSAN
  self.thread_fiber = __tsan_get_current_fiber();
#endif
}

struct fiber_start {
  static void run(context::transfer_t from) {
    // The transfer names only where it came from; that point knows where it went.
    fiber& self = *static_cast<switch_point*>(from.data)->target->owner;
    arrive(self.point, from);
    self.entry_(self.argument_);
  }
};

fiber::fiber(void (*entry)(void*), void* argument, std::size_t colour)
    : entry_(entry), argument_(argument), mapping_(nullptr) {
  const std::size_t guard = page_bytes();
  void* mapping = mmap(nullptr, stack_bytes + guard, PROT_READ | PROT_WRITE,
                       MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE | MAP_STACK, -1, 0);
  if (mapping == MAP_FAILED) {
    throw std::bad_alloc();
  }
  mapping_ = static_cast<char*>(mapping);
  // Fails only where the number of mappings is exhausted; the stack works without its guard.
  (void)mprotect(mapping_, guard, PROT_NONE);
  char* top = mapping_ + guard + stack_bytes - (colour % colours) * colour_step;
  point.owner = this;
  point.thread_exceptions = exceptions_of_this_thread();
  point.context = context::make_fcontext(top, static_cast<std::size_t>(top - (mapping_ + guard)),
                                         &fiber_start::run);
  point.stack_bottom = mapping_ + guard;
  point.stack_size = static_cast<std::size_t>(top - (mapping_ + guard));
#if LUMEN_TSAN
  point.thread_fiber = __tsan_create_fiber(0);
#endif
}

fiber::~fiber() {
#if LUMEN_TSAN
  __tsan_destroy_fiber(point.thread_fiber);
#endif
#if LUMEN_ASAN
  // Whoever maps these addresses next must not find what frames that never ended have poisoned.
  __asan_unpoison_memory_region(mapping_, stack_bytes + page_bytes());
#endif
  munmap(mapping_, stack_bytes + page_bytes());
}

}  // namespace detail
LUMEN_NAMESPACE_END
