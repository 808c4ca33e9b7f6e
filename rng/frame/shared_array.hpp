// SPDX-License-Identifier: Apache-2.0
// Memory that host and device share: the device images of engines, and what lives for one call.
#pragma once

#include <cstddef>
#include <utility>

#include <kestrel/tarn/exceptions.hpp>
#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail {

/// `size` elements in shared memory of a queue's device and context, not initialised. Whoever owns
/// the array sees to it that no kernel uses it any more when it goes.
template <typename T>
class shared_array {
 public:
  /// Raises device_bad_alloc in the name of `engine`.
  shared_array(const sycl::queue& queue, std::size_t size, const char* engine)
      : context_(queue.get_context()),
        size_(size),
        data_(sycl::aligned_alloc_shared<T>(alignof(T), size, queue)) {
    if (data_ == nullptr) {
      throw device_bad_alloc("rng", engine, queue.get_device());
    }
  }
  shared_array(shared_array&& other) noexcept
      : context_(std::move(other.context_)),
        size_(std::exchange(other.size_, 0)),
        data_(std::exchange(other.data_, nullptr)) {}
  shared_array& operator=(shared_array&&) = delete;
  ~shared_array() {
    if (data_ != nullptr) {
      sycl::free(data_, context_);
    }
  }

  T* get() const { return data_; }
  std::size_t size() const { return size_; }
  T& operator[](std::size_t i) const { return data_[i]; }

 private:
  sycl::context context_;
  std::size_t size_;
  T* data_;
};

/// Memory of one call. It goes when the last kernel has run: whoever drops it waits for that one,
/// so that no kernel loses it when something is raised.
template <typename T>
struct call_memory {
  /// Raises device_bad_alloc in the name of `engine`. For no elements there is room for one, as
  /// memory of no bytes cannot be had.
  call_memory(const sycl::queue& queue, std::size_t size, const char* engine)
      : array(queue, size != 0 ? size : 1, engine) {}
  call_memory(const call_memory&) = delete;
  call_memory& operator=(const call_memory&) = delete;
  ~call_memory() { last_kernel.wait(); }

  shared_array<T> array;
  sycl::event last_kernel;
};

}  // namespace kestrel::tarn::rng::detail
