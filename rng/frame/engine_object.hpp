// SPDX-License-Identifier: Apache-2.0
// Making, copying and destroying engine objects: the backend is chosen by the device of the queue.
#pragma once

#include <memory>
#include <utility>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng/device_level.hpp>
#include <sycl/sycl.hpp>

#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"

namespace kestrel::tarn::rng::detail {

template <typename Engine>
using owned_impl = std::unique_ptr<engine_base_impl<Engine>>;

/// A backend of the host road around a stream that `make_stream` makes.
template <typename Engine, typename MakeStream>
owned_impl<Engine> make_cpu_backend(MakeStream make_stream) {
  return std::make_unique<engine_base_impl_backend<Engine, device_type::cpu>>(make_stream());
}

/// The implementation for the queue's device, by the first of two factories on a CPU and by the
/// second on a GPU; null on any other device or where the engine has no road.
template <typename Engine, typename MakeCpu, typename MakeGpu>
owned_impl<Engine> make_impl(sycl::queue& queue, MakeCpu make_cpu, MakeGpu make_gpu) {
  const sycl::device device = queue.get_device();
  if (device.is_cpu()) {
    return make_cpu();
  }
  if constexpr (engine_row<Engine>::gpu) {
    if (device.is_gpu()) {
      return owned_impl<Engine>(make_gpu());
    }
  }
  return nullptr;
}

template <typename Engine>
owned_impl<Engine> copy_impl(sycl::queue& queue, engine_base_impl<Engine>* source) {
  return make_impl<Engine>(
      queue,
      [&] { return make_cpu_backend<Engine>([&] { return copy_stream(source->stream.get()); }); },
      [&] { return gpu::create_engine<Engine>(queue, source); });
}

template <typename Engine>
owned_impl<Engine> require_impl(owned_impl<Engine> impl, const sycl::queue& queue) {
  if (impl == nullptr) {
    throw unsupported_device("rng", engine_row<Engine>::name, queue.get_device());
  }
  return impl;
}

template <typename Engine>
engine_base<Engine>::engine_base(sycl::queue queue_) : queue(std::move(queue_)) {}

template <typename Engine>
engine_base<Engine>::engine_base(const engine_base& other)
    : queue(other.queue), impl(require_impl(copy_impl(queue, other.impl.get()), queue)) {}

template <typename Engine>
engine_base<Engine>::engine_base(engine_base&& other) noexcept = default;

template <typename Engine>
engine_base<Engine>& engine_base<Engine>::operator=(const engine_base& other) {
  if (this != &other) {
    sycl::queue target = other.queue;
    owned_impl<Engine> copy = copy_impl(target, other.impl.get());  // may raise: nothing is lost
    queue = std::move(target);
    if (copy != nullptr) {
      impl = std::move(copy);
    }
  }
  return *this;
}

template <typename Engine>
engine_base<Engine>& engine_base<Engine>::operator=(engine_base&& other) noexcept = default;

template <typename Engine>
engine_base<Engine>::~engine_base() = default;

}  // namespace kestrel::tarn::rng::detail
