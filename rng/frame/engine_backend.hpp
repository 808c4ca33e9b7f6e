// SPDX-License-Identifier: Apache-2.0
// Implementations of an engine, one per kind of device. Which one an object is follows from the
// device of its queue and is decided anew on each call: the only virtual operation is the
// destructor. The host road is the same for all engines (host_road.hpp); the body of `generate` on
// a device stands in device_road.hpp, which only the modules <engine>_gpu include.
#pragma once

#include <cstdint>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng/detail/engine_base.hpp>
#include <sycl/sycl.hpp>

#include "frame/streams.hpp"

namespace kestrel::tarn::rng::detail {

/// Owns the engine's host stream: its seeding, its skipping and its saved form.
template <typename Engine>
class engine_base_impl {
 public:
  explicit engine_base_impl(owned_stream made) : stream(std::move(made)) {}
  engine_base_impl(const engine_base_impl&) = delete;
  engine_base_impl& operator=(const engine_base_impl&) = delete;
  virtual ~engine_base_impl() = default;

  owned_stream stream;
};

template <typename Engine, device_type device>
class engine_base_impl_backend;

/// The host road needs the stream and nothing else.
template <typename Engine>
class engine_base_impl_backend<Engine, device_type::cpu> : public engine_base_impl<Engine> {
 public:
  using engine_base_impl<Engine>::engine_base_impl;
};

/// The backend on GPUs of engines whose state travels to each kernel by value. Which engines have
/// one is said by the specialisations of engine_base_impl_backend for device_type::gpu, next to
/// their stepping; engines without a device road have none.
template <typename Engine>
class snapshot_backend : public engine_base_impl<Engine> {
 public:
  using engine_base_impl<Engine>::engine_base_impl;

  /// `Out` is T* or sycl::buffer<T, 1>&; returns the event of the kernel, which may not have run.
  template <typename T, typename Distribution, typename Out>
  sycl::event generate(sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
                       const std::vector<sycl::event>& dependencies);
};

/// A distribution's parameters on their way into a backend.
template <typename T, typename Distr, device_type device>
struct distribution_impl;

/// The same where the parameters choose among algorithms: `Algorithm` is the one taken.
template <typename T, typename Distr, device_type device, typename Algorithm>
struct distribution_impl_ex;

/// The public distribution that a distribution_impl was made from.
template <typename Distribution>
struct public_distribution;
template <typename T, typename Distr, device_type device>
struct public_distribution<distribution_impl<T, Distr, device>> {
  using type = Distr;
};
template <typename T, typename Distr, device_type device, typename Algorithm>
struct public_distribution<distribution_impl_ex<T, Distr, device, Algorithm>> {
  using type = Distr;
};

}  // namespace kestrel::tarn::rng::detail
