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

/// The implementation for the queue's device: on a CPU around the stream that `make_stream` makes,
/// on a GPU what `make_gpu` creates. Null on any other device and where the engine has no road.
template <typename Engine, typename MakeStream, typename MakeGpu>
owned_impl<Engine> make_impl(sycl::queue& queue, MakeStream make_stream, MakeGpu make_gpu) {
  const sycl::device device = queue.get_device();
  if (device.is_cpu()) {
    return std::make_unique<engine_base_impl_backend<Engine, device_type::cpu>>(make_stream());
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
      queue, [&] { return copy_stream(source->stream.get()); },
      [&] { return gpu::create_engine<Engine>(queue, source); });
}

/// Raises unsupported_device for what could not be made.
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
