// SPDX-License-Identifier: Apache-2.0
// Reported generate calls. At level 0 nothing of this runs; asking costs one pointer load and one
// compare.
#pragma once

#include <atomic>
#include <cstdint>
#include <typeinfo>
#include <vector>

#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail {

/// Where the level stands. Until the first call it is a word of value -1, which sends that call to
/// the slow test; from then on it is the core library's own word, so no lookup is made per call.
/// Threads may race for the binding: each stores the same address.
extern std::atomic<const int*> verbose_level;

/// The slow test: binds `verbose_level` on the first call; true at a level other than 0.
bool is_verbose_slow();

inline bool is_verbose() {
  return *verbose_level.load(std::memory_order_relaxed) != 0 && is_verbose_slow();
}

/// A call without its types: what the report names, and the backend frame behind it.
struct reported_call {
  const std::type_info& distribution;
  const std::type_info& engine;
  std::int64_t n;
  sycl::queue& queue;
  sycl::event (*run)(const void* frame);
  const void* frame;
};

template <typename Distr, typename Engine, typename Frame>
reported_call describe_call(Engine& engine, std::int64_t n, const Frame& frame) {
  return {typeid(Distr),
          typeid(Engine),
          n,
          engine.get_queue(),
          [](const void* object) { return (*static_cast<const Frame*>(object))(); },
          &frame};
}

/// Runs the call and reports it. At level 2 it waits for `dependencies` before and for the call
/// after. Should the frame raise, the nesting depth goes back and nothing is printed.
sycl::event run_reported(const reported_call& call, const void* r,
                         const std::vector<sycl::event>& dependencies);

/// The same for a call into a buffer: at level 2 work on the buffer is waited for.
template <typename T>
void run_reported(const reported_call& call, sycl::buffer<T, 1>& r);

}  // namespace kestrel::tarn::rng::detail
