// SPDX-License-Identifier: Apache-2.0
// The controls of a double of OpenCL that knows events and nothing else. A test ends them as it
// likes, with errors as well, of which PoCL tells no callback. It is libOpenCL.so.1 in a folder of
// its own, found by that name when LD_LIBRARY_PATH has the folder.
#pragma once

#include <dlfcn.h>
#include <stdexcept>

struct _cl_event;

namespace opencl_events {

/// What the double exports, as "opencl_events_controls".
struct controls {
  /// An event with one reference; it is never freed.
  _cl_event* (*make)();
  /// Calls the callbacks of the event with a status.
  void (*end)(_cl_event* event, int status);
  int (*references)(_cl_event* event);
  /// From now on callbacks are not taken, with this code, unless it is 0.
  void (*refuse)(int code);
};

inline const controls& get() {
  static const auto* const found = [] {
    void* const library = dlopen("libOpenCL.so.1", RTLD_NOW);
    return static_cast<const controls*>(
        library == nullptr ? nullptr : dlsym(library, "opencl_events_controls"));
  }();
  if (found == nullptr) {
    throw std::runtime_error("LD_LIBRARY_PATH does not lead to the double of libOpenCL.so.1");
  }
  return *found;
}

}  // namespace opencl_events
