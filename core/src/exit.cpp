// SPDX-License-Identifier: Apache-2.0
// The end of the process: the exit hook, and functions to be called before the core unloads.
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <dlfcn.h>
#include <unistd.h>

#include "tarn_serv.h"

namespace {

std::atomic<tarn_serv_exit_hook> exit_hook{nullptr};

// Keeps the library that holds `function` mapped until the process ends.
void pin_library_of(void (*function)()) {
  Dl_info owner{};
  if (::dladdr(reinterpret_cast<void*>(function), &owner) != 0) {
    ::dlopen(owner.dli_fname, RTLD_LAZY | RTLD_NOLOAD | RTLD_NODELETE);
  }
}

}  // namespace

tarn_serv_exit_hook tarn_serv_set_exit_hook(tarn_serv_exit_hook hook) {
  return exit_hook.exchange(hook);
}

void tarn_serv_exit(int code) {
  if (const tarn_serv_exit_hook hook = exit_hook.load()) {
    hook(code);
    return;
  }
  std::fflush(stdout);  // these two only: another thread may hold the lock of some other file
  std::fflush(stderr);
  ::_exit(code);
}

// The C library's own list of exit functions serves here, rather than a destructor of this
// library. Its handlers run in reverse order among the destructors of static objects, so that a
// function registered at first use runs while everything built before it is still alive; a
// library destructor would run after the statics of all dependent libraries are gone. The entry
// belongs to this library, so that unloading it calls the function as well.
void tarn_serv_core_register_sycl_destructor(void (*function)(void)) {
  if (function != nullptr) {
    pin_library_of(function);
    if (std::atexit(function) != 0) {
      std::fputs("Tarn: no memory to register a clean-up function\n", stderr);
    }
  }
}
