// SPDX-License-Identifier: Apache-2.0
// Verbose reporting of public calls: nesting depth, the events of the current report, clocks
// around calls into buffers, and the report line itself.
#pragma once

#include <sycl/sycl.hpp>

namespace kestrel::tarn::gpu {

/// Nesting of reported calls on this thread: a report at a depth other than 0 is silent, so a call
/// made inside another prints no line of its own.
void verbose_depth_inc();
void verbose_depth_dec();

/// At level 2, adds an event to the device time of this thread's next report.
void verbose_register_event(const sycl::event& event);

/// 1 for callers of the C interface; any other value is ignored.
void set_verbose_gpu_iface(int value);

/// Prints `text` with the seconds spent on the host and on the device, and forgets the registered
/// events. Silent inside a nested call and at level 0.
void print_verbose_gpu_info(sycl::queue* queue, const char* text, double host_seconds);

/// At level 2, waits for earlier work on the buffer; at every level enters a nested call and
/// starts the clock by storing the negated time.
template <typename T>
void verbose_buffer_start(double* seconds, sycl::buffer<T, 1>& buffer);

/// The counterpart: leaves the nested call; `*seconds` then holds the elapsed time.
template <typename T>
void verbose_buffer_end(double* seconds, sycl::buffer<T, 1>& buffer);

}  // namespace kestrel::tarn::gpu
