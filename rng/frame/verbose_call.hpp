// SPDX-License-Identifier: Apache-2.0
// One reported generate call: its description, its clock, its depth. At level 0 nothing of this
// runs; asking costs one pointer load and one compare.
#pragma once

#include <atomic>
#include <cstdint>
#include <string>
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

/// Lives around the backend frame. Should that frame raise, the depth goes back and nothing is
/// printed.
class verbose_call {
 public:
  /// For a call into memory.
  verbose_call(const std::type_info& distribution, const std::type_info& engine, std::int64_t n,
               const void* r, const sycl::queue& queue);
  /// For a call into a buffer.
  verbose_call(const std::type_info& distribution, const std::type_info& engine, std::int64_t n,
               const sycl::queue& queue);
  verbose_call(const verbose_call&) = delete;
  verbose_call& operator=(const verbose_call&) = delete;
  ~verbose_call();

  /// Waits for what the call depends on (level 2 only), starts the clock, enters the call.
  void start(const std::vector<sycl::event>& dependencies);
  template <typename T>
  void start(sycl::buffer<T, 1>& r);

  /// Waits for the call (level 2 only), stops the clock, leaves the call and reports.
  void finish(const sycl::event& event);
  template <typename T>
  void finish(const sycl::event& event, sycl::buffer<T, 1>& r);

 private:
  void report(const sycl::event& event);

  std::string description_;
  sycl::queue queue_;
  bool timed_;
  bool entered_ = false;
  double seconds_ = 0.0;
};

}  // namespace kestrel::tarn::rng::detail
