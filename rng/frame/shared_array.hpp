// SPDX-License-Identifier: Apache-2.0
// Memory for kernels: what host and device share, such as the device images of engines, what lives
// for one call, and what no host code ever looks at, which stays in the device's own memory.
#pragma once

#include <cstddef>
#include <utility>

#include <kestrel/tarn/exceptions.hpp>
#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail {

/// `size` elements in memory of a queue's device and context, not initialised. Whoever owns the
/// array sees to it that no kernel uses it any more when it goes.
template <typename T, sycl::usm::alloc kind>
class usm_array {
 public:
  /// Raises device_bad_alloc in the name of `engine`.
  usm_array(const sycl::queue& queue, std::size_t size, const char* engine)
      : context_(queue.get_context()),
        size_(size),
        data_(sycl::aligned_alloc<T>(alignof(T), size, queue, kind)) {
    if (data_ == nullptr) {
      throw device_bad_alloc("rng", engine, queue.get_device());
    }
  }
  usm_array(usm_array&& other) noexcept
      : context_(std::move(other.context_)),
        size_(std::exchange(other.size_, 0)),
        data_(std::exchange(other.data_, nullptr)) {}
  usm_array& operator=(usm_array&&) = delete;
  ~usm_array() {
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

template <typename T>
using shared_array = usm_array<T, sycl::usm::alloc::shared>;

/// Memory of one call. It goes when the last kernel has run: whoever drops it waits for that one,
/// so that no kernel loses it when something is raised.
template <typename T, sycl::usm::alloc kind = sycl::usm::alloc::shared>
struct call_memory {
  /// Raises device_bad_alloc in the name of `engine`. For no elements there is room for one, as
  /// memory of no bytes cannot be had.
  call_memory(const sycl::queue& queue, std::size_t size, const char* engine)
      : array(queue, size != 0 ? size : 1, engine) {}
  call_memory(const call_memory&) = delete;
  call_memory& operator=(const call_memory&) = delete;
  ~call_memory() { last_kernel.wait(); }

  usm_array<T, kind> array;
  sycl::event last_kernel;
};

}  // namespace kestrel::tarn::rng::detail
