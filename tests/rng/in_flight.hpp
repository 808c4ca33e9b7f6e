// SPDX-License-Identifier: Apache-2.0
// Calls in flight in tests: a gate that holds their kernels back, and memory for their results.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <future>
#include <thread>
#include <vector>

#include <sycl/sycl.hpp>

#include "drawing.hpp"

namespace tarn_test {

/// No command that depends on `closed` runs before open() is called, or the gate goes.
class gate {
 public:
  explicit gate(sycl::queue queue) {
    closed = queue.submit([&](sycl::handler& group) {
      group.host_task([passed = opener_.get_future().share()] { passed.wait(); });
    });
  }
  gate(const gate&) = delete;
  gate& operator=(const gate&) = delete;
  ~gate() { open(); }

  void open() {
    if (!open_) {
      open_ = true;
      opener_.set_value();
    }
  }

  /// Opens the gate some time after `call` has begun, so that a call that waits for the kernels has
  /// something to wait for.
  template <typename Call>
  void open_during(const Call& call) {
    std::thread opener([this] {
      std::this_thread::sleep_for(std::chrono::milliseconds(20));
      open();
    });
    call();
    opener.join();
  }

  sycl::event closed;

 private:
  std::promise<void> opener_;
  bool open_ = false;
};

/// Shared memory for results, filled with the marker. Whoever owns it waits for the kernels.
template <typename T>
class results {
 public:
  results(const sycl::queue& queue, std::size_t size)
      : queue_(queue), size_(size), data_(sycl::malloc_shared<T>(size, queue)) {
    std::fill_n(data_, size, marker<T>());
  }
  results(const results&) = delete;
  results& operator=(const results&) = delete;
  ~results() { sycl::free(data_, queue_); }

  T* get() const { return data_; }
  std::vector<T> values() const { return {data_, data_ + size_}; }
  bool untouched() const {
    return std::all_of(data_, data_ + size_, [](T value) { return same_bits(value, marker<T>()); });
  }

 private:
  sycl::queue queue_;
  std::size_t size_;
  T* data_;
};

}  // namespace tarn_test
