// SPDX-License-Identifier: Apache-2.0
// What every engine object holds: a queue and an implementation for the queue's device.
#pragma once

#include <memory>

#include <kestrel/tarn/export.hpp>
#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail {

/// The two kinds of device that have a road.
enum class TARN_EXPORT device_type { cpu = 1, gpu = 2 };

template <typename Engine>
class TARN_EXPORT engine_base_impl;

struct engine_access;

/// Base of engine `Engine`. Copies are deep: copy and source go on independently. A moved-from
/// engine can only be destroyed or assigned to. One thread at a time may use an engine.
template <typename Engine>
class TARN_EXPORT engine_base {
 public:
  /// The queue whose device draws.
  sycl::queue& get_queue() { return queue; }

 protected:
  /// Takes the queue; the implementation is made by the engine's constructor.
  explicit engine_base(sycl::queue queue);
  /// Raises unsupported_device when the queue's device has no road for the engine.
  engine_base(const engine_base& other);
  engine_base(engine_base&& other) noexcept;
  /// On a device without a road the queue is taken over, the old implementation stays, and nothing
  /// is raised.
  engine_base& operator=(const engine_base& other);
  engine_base& operator=(engine_base&& other) noexcept;
  ~engine_base();

  sycl::queue queue;
  std::unique_ptr<engine_base_impl<Engine>> impl;

  friend struct engine_access;
};

}  // namespace kestrel::tarn::rng::detail
