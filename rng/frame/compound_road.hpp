// SPDX-License-Identifier: Apache-2.0
// The exported GPU level of the rejecting and compound families.
#pragma once

#include <cstdint>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng/device_level.hpp>
#include <sycl/sycl.hpp>

#include "distributions/compound.hpp"
#include "frame/checks.hpp"
#include "frame/device_road.hpp"

namespace kestrel::tarn::rng::detail::gpu {

/// Whether an engine draws nothing on devices, for what its stream holds. Overloaded where that can
/// be: whoever counts on results would read memory that nobody has written.
template <typename Backend>
bool is_silent(const Backend&) {
  return false;
}

/// `Out` is T* or sycl::buffer<T, 1>. Unlike the plain families, these wait for `dependencies`.
template <typename Engine, typename Distr, typename Out>
compound_result generate_waiting(sycl::queue& queue, const Distr& distr,
                                 engine_base_impl<Engine>* engine, std::int64_t n, Out out,
                                 const std::vector<sycl::event>& dependencies) {
  check_mode(engine, runs_in_sub_sequences<Distr>);
  const compound_call<Engine, Out> call{queue, backend_of(queue, engine), n, out};
  sycl::event::wait_and_throw(dependencies);
  if (is_silent(call.engine)) {
    return {};
  }
  return generate_compound(call, distr);
}

template <typename Engine, typename Distr>
std::pair<sycl::event, std::int64_t> generate_ex(sycl::queue& queue, const Distr& distr,
                                                 engine_base_impl<Engine>* engine, std::int64_t n,
                                                 typename Distr::result_type* r,
                                                 const std::vector<sycl::event>& dependencies) {
  return generate_waiting<Engine, Distr, typename Distr::result_type*>(queue, distr, engine, n, r,
                                                                       dependencies);
}

template <typename Engine, typename Distr>
std::pair<sycl::event, std::int64_t> generate_ex(sycl::queue& queue, const Distr& distr,
                                                 engine_base_impl<Engine>* engine, std::int64_t n,
                                                 sycl::buffer<typename Distr::result_type, 1>& r,
                                                 const std::vector<sycl::event>& dependencies) {
  return generate_waiting<Engine, Distr, sycl::buffer<typename Distr::result_type, 1>>(
      queue, distr, engine, n, r, dependencies);
}

}  // namespace kestrel::tarn::rng::detail::gpu

/// The same as TARN_DEVICE_ROAD_generate, for families that reject.
#define TARN_DEVICE_ROAD_generate_ex(engine, T, ...)                                 \
  template std::pair<sycl::event, std::int64_t> generate_ex<engine, __VA_ARGS__>(    \
      sycl::queue&, const __VA_ARGS__&, engine_base_impl<engine>*, std::int64_t, T*, \
      const std::vector<sycl::event>&);                                              \
  template std::pair<sycl::event, std::int64_t> generate_ex<engine, __VA_ARGS__>(    \
      sycl::queue&, const __VA_ARGS__&, engine_base_impl<engine>*, std::int64_t,     \
      sycl::buffer<T, 1>&, const std::vector<sycl::event>&);
