// SPDX-License-Identifier: Apache-2.0
// The frame of every generate call: verbose report around it, checks in a fixed order, then the
// road by the device of the engine's queue.
#pragma once

#include <cstdint>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng/device_level.hpp>
#include <kestrel/tarn/rng/generate.hpp>
#include <sycl/sycl.hpp>

#include "frame/checks.hpp"
#include "frame/engine_backend.hpp"
#include "frame/host_road.hpp"
#include "frame/rows.hpp"
#include "frame/verbose_call.hpp"

namespace kestrel::tarn::rng::detail {

/// The device road, where the engine and the distribution have one.
template <typename Distr, typename Engine, typename Out>
sycl::event generate_on_gpu(sycl::queue& queue, const Distr& distr, engine_base_impl<Engine>* impl,
                            std::int64_t n, Out r, const std::vector<sycl::event>& dependencies) {
  using row = distribution_row<Distr>;
  check_mode(impl, runs_in_sub_sequences<Distr>);
  if constexpr (!engine_row<Engine>::gpu) {
    refuse_device(queue);
  } else if constexpr (!row::gpu) {
    refuse_on_gpu(row::family, row::method);
  } else if constexpr (row::entry == device_entry::generate_ex) {
    return gpu::generate_ex<Engine, Distr>(queue, distr, impl, n, r, dependencies).first;
  } else {
    return gpu::generate<Engine, Distr>(queue, distr, impl, n, r, dependencies);
  }
}

/// The backend frame. `Out` is T* or sycl::buffer<T, 1>&. Out of line, as an entry calls it in two
/// places and there are thousands of entries.
template <typename Distr, typename Engine, typename Out>
[[gnu::noinline]] sycl::event generate_on_device(const Distr& distr, Engine& engine, std::int64_t n,
                                                 Out r,
                                                 const std::vector<sycl::event>& dependencies) {
  if constexpr (is_refused<Distr, Engine>) {
    refuse_uniform_bits<Engine>();
  } else {
    check_output<Engine>(distr, n, r);
    sycl::queue& queue = engine.get_queue();
    const device_type road = road_of(queue);
    check_count(distr, n);
    auto* impl = engine_access::impl(engine);
    if (road == device_type::gpu) {
      return generate_on_gpu<Distr, Engine, Out>(queue, distr, impl, n, r, dependencies);
    }
    const host_call call{&run_host_routine<Distr>, &distr, impl->stream.get(), n};
    return run_host_call(queue, call, r, dependencies);
  }
}

/// The same with a report around it; of its own, so that what reports need costs the entry nothing
/// while they are off.
template <typename Distr, typename Engine, typename Out>
[[gnu::noinline, gnu::cold]] sycl::event generate_reported(
    const Distr& distr, Engine& engine, std::int64_t n, Out r,
    const std::vector<sycl::event>& dependencies) {
  const auto frame = [&] {
    return generate_on_device<Distr, Engine, Out>(distr, engine, n, r, dependencies);
  };
  const reported_call call = describe_call<Distr>(engine, n, frame);
  if constexpr (std::is_pointer_v<Out>) {
    return run_reported(call, r, dependencies);
  } else {
    run_reported(call, r);
    return {};
  }
}

}  // namespace kestrel::tarn::rng::detail

namespace kestrel::tarn::rng {

template <typename Distr, typename Engine>
sycl::event generate(const Distr& distr, Engine& engine, std::int64_t n,
                     typename Distr::result_type* r, const std::vector<sycl::event>& dependencies) {
  using Out = typename Distr::result_type*;
  if (detail::is_verbose()) {
    return detail::generate_reported<Distr, Engine, Out>(distr, engine, n, r, dependencies);
  }
  return detail::generate_on_device<Distr, Engine, Out>(distr, engine, n, r, dependencies);
}

template <typename Distr, typename Engine>
void generate(const Distr& distr, Engine& engine, std::int64_t n,
              sycl::buffer<typename Distr::result_type, 1>& r) {
  using Out = sycl::buffer<typename Distr::result_type, 1>&;
  if (detail::is_verbose()) {
    detail::generate_reported<Distr, Engine, Out>(distr, engine, n, r, {});
  } else {
    detail::generate_on_device<Distr, Engine, Out>(distr, engine, n, r, {});
  }
}

}  // namespace kestrel::tarn::rng
