// SPDX-License-Identifier: Apache-2.0
// The verbose report. The core library holds the mode, the banner and the road to the output; here
// is what needs SYCL: the device, and its time from the profiling stamps of events.
#include "verbose.hpp"

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <limits>
#include <tarn_serv.h>
#include <vector>

#include "detected_devices.hpp"
#include "report_text.hpp"

namespace kestrel::tarn::gpu {
namespace {

struct verbose_thread_state {
  std::uint32_t depth = 0;
  std::vector<sycl::event> events;
};

thread_local verbose_thread_state state;

std::atomic<int> verbose_iface{2};  // SYCL, until set_verbose_gpu_iface(1)

/// From the start of the first to the end of the last kernel, in seconds; 0 without events. Stamps
/// are in nanoseconds.
double take_device_seconds() {
  std::vector<sycl::event> events;
  events.swap(state.events);
  std::uint64_t start = std::numeric_limits<std::uint64_t>::max();
  std::uint64_t end = 0;
  for (const sycl::event& event : events) {
    start = std::min<std::uint64_t>(
        start, event.get_profiling_info<sycl::info::event_profiling::command_start>());
    end = std::max<std::uint64_t>(
        end, event.get_profiling_info<sycl::info::event_profiling::command_end>());
  }
  return end >= start ? static_cast<double>(end - start) * 1e-9 : 0.0;
}

void append_time(report_text& text, const char* name, double seconds) {
  char time[32];
  tarn_serv_format_seconds(time, sizeof time, seconds);
  text.append("%s%s", name, time);
}

/// A kernel that does nothing but require the buffer.
template <typename T>
struct touch {
  sycl::accessor<T, 1, sycl::access_mode::read_write> buffer;
  SYCL_EXTERNAL void operator()() const {}
};

/// Lets earlier work on the buffer finish, so that the clock sees this call alone.
template <typename T>
void drain(sycl::buffer<T, 1>& buffer) {
  if (*tarn_serv_verbose_mode() != 2 || buffer.size() == 0) {
    return;
  }
  sycl::queue queue;
  queue.submit([&](sycl::handler& group) {
    group.single_task(touch<T>{sycl::accessor<T, 1, sycl::access_mode::read_write>(buffer, group)});
  });
  queue.wait();
}

}  // namespace

void verbose_depth_inc() {
  ++state.depth;
}

void verbose_depth_dec() {
  --state.depth;
}

void verbose_register_event(const sycl::event& event) {
  if (*tarn_serv_verbose_mode() == 2) {
    state.events.push_back(event);
  }
}

void set_verbose_gpu_iface(int value) {
  if (value == 1) {
    verbose_iface = 1;
  }
}

void print_verbose_gpu_info(sycl::queue* queue, const char* text, double host_seconds) {
  if (state.depth != 0 || *tarn_serv_verbose_mode() <= 0) {
    return;
  }
  tarn_serv_print_verbose_header(verbose_iface);
  report_detected_devices(*queue);
  report_text times;
  append_time(times, "host:", host_seconds);
  append_time(times, " device:", take_device_seconds());
  const int position = detected_position(queue->get_device());
  if (position >= 0) {
    times.append(" GPU%d", position);
  }
  tarn_serv_print_verbose_line(text, times.c_str());
}

template <typename T>
void verbose_buffer_start(double* seconds, sycl::buffer<T, 1>& buffer) {
  drain(buffer);
  verbose_depth_inc();
  *seconds = -tarn_serv_dsecnd();
}

template <typename T>
void verbose_buffer_end(double* seconds, sycl::buffer<T, 1>& buffer) {
  drain(buffer);
  verbose_depth_dec();
  *seconds += tarn_serv_dsecnd();
}

#define TARN_RESULT_TYPE(type)                                         \
  template void verbose_buffer_start(double*, sycl::buffer<type, 1>&); \
  template void verbose_buffer_end(double*, sycl::buffer<type, 1>&);
#include "result_types.def"

}  // namespace kestrel::tarn::gpu
