// SPDX-License-Identifier: Apache-2.0
// The host road: one host_task that calls a routine of the statistics library on the engine's
// stream, and a wait. The submission is one non-template function; what differs per distribution is
// a closure record of four words, and nothing differs per engine.
#pragma once

#include <cstdint>
#include <vector>

#include <sycl/sycl.hpp>

#include "frame/streams.hpp"

namespace kestrel::tarn::rng::detail {

/// A routine bound to its arguments, apart from the output. The call is over before the record's
/// owner returns, so it refers to the distribution instead of copying it.
struct host_call {
  void (*run)(const void* distribution, rvx_stream stream, std::int64_t n, void* r);
  const void* distribution;
  rvx_stream stream;
  std::int64_t n;
};

/// Runs the call after `dependencies` and waits for it.
sycl::event run_host_call(sycl::queue& queue, const host_call& call, void* r,
                          const std::vector<sycl::event>& dependencies);

/// The same into a buffer, which is bound inside the command group.
template <typename T>
sycl::event run_host_call(sycl::queue& queue, const host_call& call, sycl::buffer<T, 1>& r,
                          const std::vector<sycl::event>& dependencies);

/// A row's routine: `distribution` is the Distr. The status is dropped: the routine has reported by
/// itself, and a host task has no road from a status to an exception. Defined in host_rows.cpp,
/// once for each row.
template <typename Distr>
void run_host_routine(const void* distribution, rvx_stream stream, std::int64_t n, void* r);

}  // namespace kestrel::tarn::rng::detail
