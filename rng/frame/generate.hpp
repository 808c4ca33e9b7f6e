// SPDX-License-Identifier: Apache-2.0
// The frame of every generate call: verbose report around it, checks in a fixed order, then the
// road by the device of the engine's queue, asked anew on each call.
#pragma once

#include <cstdint>
#include <vector>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng/device_level.hpp>
#include <kestrel/tarn/rng/generate.hpp>
#include <sycl/sycl.hpp>

#include "distributions/all.hpp"
#include "frame/checks.hpp"
#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"
#include "frame/verbose_call.hpp"

namespace kestrel::tarn::rng::detail {

/// The backend frame. `Out` is T* or sycl::buffer<T, 1>&. Out of line, as an entry calls it in two
/// places and there are thousands of entries.
template <typename Distr, typename Engine, typename Out>
[[gnu::noinline]] sycl::event generate_on_device(const Distr& distr, Engine& engine, std::int64_t n,
                                                 Out r,
                                                 const std::vector<sycl::event>& dependencies) {
  if constexpr (is_refused<Distr, Engine>) {
    refuse_uniform_bits<Engine>();
  } else {
    using T = typename Distr::result_type;
    check_output(distr, n, r);
    sycl::queue& queue = engine.get_queue();
    auto* impl = engine_access::impl(engine);
    const sycl::device device = queue.get_device();
    if (device.is_cpu()) {
      using backend = engine_base_impl_backend<Engine, device_type::cpu>;
      using distribution = distribution_impl<T, Distr, device_type::cpu>;
      return static_cast<backend*>(impl)->template generate<T, distribution, Out>(
          queue, n, r, distribution(distr), dependencies);
    }
    if constexpr (engine_row<Engine>::gpu) {
      if (device.is_gpu()) {
        if constexpr (distribution_row<Distr>::entry == device_entry::generate_ex) {
          return gpu::generate_ex<Engine, Distr>(queue, distr, impl, n, r, dependencies).first;
        } else {
          return gpu::generate<Engine, Distr>(queue, distr, impl, n, r, dependencies);
        }
      }
    }
    throw unsupported_device("rng", "generate", device);
  }
}

}  // namespace kestrel::tarn::rng::detail

namespace kestrel::tarn::rng {

template <typename Distr, typename Engine>
sycl::event generate(const Distr& distr, Engine& engine, std::int64_t n,
                     typename Distr::result_type* r, const std::vector<sycl::event>& dependencies) {
  const auto frame = [&] {
    return detail::generate_on_device<Distr, Engine, typename Distr::result_type*>(distr, engine, n,
                                                                                   r, dependencies);
  };
  if (!detail::is_verbose()) {
    return frame();
  }
  return detail::run_reported(detail::describe_call<Distr>(engine, n, frame), r, dependencies);
}

template <typename Distr, typename Engine>
void generate(const Distr& distr, Engine& engine, std::int64_t n,
              sycl::buffer<typename Distr::result_type, 1>& r) {
  const auto frame = [&] {
    return detail::generate_on_device<Distr, Engine, sycl::buffer<typename Distr::result_type, 1>&>(
        distr, engine, n, r, {});
  };
  if (!detail::is_verbose()) {
    frame();
    return;
  }
  detail::run_reported(detail::describe_call<Distr>(engine, n, frame), r);
}

}  // namespace kestrel::tarn::rng
