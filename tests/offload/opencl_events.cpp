// SPDX-License-Identifier: Apache-2.0
// The double of OpenCL that knows events: their functions. The other names are in opencl_names.cpp.
#include "opencl_events.hpp"

#include <mutex>
#include <utility>
#include <vector>

#define TARN_SHOWN extern "C" __attribute__((visibility("default")))

using callback = void (*)(_cl_event* event, int status, void* told);

struct _cl_event {
  int references = 1;
  std::vector<std::pair<callback, void*>> callbacks;
};

namespace {

std::mutex mutex;
std::vector<_cl_event*> all;  // so that none is lost
int refusal = 0;

_cl_event* make() {
  const std::lock_guard<std::mutex> lock(mutex);
  all.push_back(new _cl_event);
  return all.back();
}

void end(_cl_event* event, int status) {
  std::vector<std::pair<callback, void*>> callbacks;
  {
    const std::lock_guard<std::mutex> lock(mutex);
    callbacks.swap(event->callbacks);
  }
  for (const auto& [function, told] : callbacks) {
    function(event, status, told);
  }
}

int references(_cl_event* event) {
  const std::lock_guard<std::mutex> lock(mutex);
  return event->references;
}

void refuse(int code) {
  const std::lock_guard<std::mutex> lock(mutex);
  refusal = code;
}

int add_reference(_cl_event* event, int number) {
  const std::lock_guard<std::mutex> lock(mutex);
  event->references += number;
  return 0;
}

}  // namespace

TARN_SHOWN const opencl_events::controls opencl_events_controls;
const opencl_events::controls opencl_events_controls = {make, end, references, refuse};

TARN_SHOWN int clRetainEvent(_cl_event* event) {
  return add_reference(event, 1);
}

TARN_SHOWN int clReleaseEvent(_cl_event* event) {
  return add_reference(event, -1);
}

TARN_SHOWN int clSetEventCallback(_cl_event* event, int /*status*/, callback function, void* told) {
  const std::lock_guard<std::mutex> lock(mutex);
  if (refusal == 0) {
    event->callbacks.emplace_back(function, told);
  }
  return refusal;
}
