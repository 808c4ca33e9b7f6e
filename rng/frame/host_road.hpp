// SPDX-License-Identifier: Apache-2.0
// The host road: one host_task that calls a routine of the statistics library on the engine's
// stream, and a wait. The submission is one non-template function; what differs per combination
// is a closure record of four words.
#pragma once

#include <cstdint>
#include <vector>

#include <sycl/sycl.hpp>

#include "frame/engine_backend.hpp"

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

/// The status is dropped: the routine has reported by itself, and a host task has no road from a
/// status to an exception.
template <typename T, typename Distribution>
void run_host_routine(const void* distribution, rvx_stream stream, std::int64_t n, void* r) {
  static_cast<const Distribution*>(distribution)->generate(stream, n, static_cast<T*>(r));
}

template <typename Engine>
template <typename T, typename Distribution, typename Out>
sycl::event engine_base_impl_backend<Engine, device_type::cpu>::generate(
    sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
    const std::vector<sycl::event>& dependencies) {
  const host_call call{&run_host_routine<T, Distribution>, &distribution, this->stream.get(), n};
  return run_host_call(queue, call, r, dependencies);
}

}  // namespace kestrel::tarn::rng::detail

/// The host road of `engine`, for every row that is built; to be used in namespace detail.
#define TARN_HOST_ROAD_OF(engine, T, ...)                                                  \
  template sycl::event engine_base_impl_backend<engine, device_type::cpu>::generate<       \
      T, distribution_impl<T, __VA_ARGS__, device_type::cpu>, T*>(                         \
      sycl::queue&, std::int64_t, T*, distribution_impl<T, __VA_ARGS__, device_type::cpu>, \
      const std::vector<sycl::event>&);                                                    \
  template sycl::event engine_base_impl_backend<engine, device_type::cpu>::generate<       \
      T, distribution_impl<T, __VA_ARGS__, device_type::cpu>, sycl::buffer<T, 1>&>(        \
      sycl::queue&, std::int64_t, sycl::buffer<T, 1>&,                                     \
      distribution_impl<T, __VA_ARGS__, device_type::cpu>, const std::vector<sycl::event>&);
