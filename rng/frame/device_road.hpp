// SPDX-License-Identifier: Apache-2.0
// The device road: from a public distribution to a kernel, and the exported GPU level. Engines
// whose state travels by value have all of it here; those with state on the device bring a backend
// and a creation of their own.
#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <type_traits>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng/device_level.hpp>
#include <sycl/sycl.hpp>

#include "frame/checks.hpp"
#include "frame/engine_backend.hpp"
#include "frame/engine_func.hpp"
#include "frame/kernel_launch.hpp"
#include "frame/rows.hpp"

namespace kestrel::tarn::rng::detail {

/// A call on its way to engine_func. `Out` is T* or sycl::buffer<T, 1>&.
template <typename Engine, typename T, typename Functor, typename Out>
struct engine_func_call {
  std::int64_t n;  // values to store
  Out r;
  Functor functor;

  using source = typename Functor::source;
  using record_type = typename engine_traits<Engine>::record;
  static_assert(sizeof(record_type) <= max_record_size);

  /// The kernel on the bound output and the snapshot of the state record.
  auto kernel(sycl::handler& group, const void* record) const {
    auto out = bind_output(group, r);
    return engine_func<Engine, T, source, Functor, decltype(out)>{
        Functor::results,
        out,
        functor,
        *static_cast<const record_type*>(record),
        rule_of<Engine>(functor),
        static_cast<std::uint64_t>(n)};
  }

  /// One work-item for each block of values.
  static void launch(sycl::handler& group, const void* context, const void* record) {
    const auto& call = *static_cast<const engine_func_call*>(context);
    group.parallel_for(sycl::range<1>(work_items(call.n, Functor::results)),
                       call.kernel(group, record));
  }
};

/// Words of the sequence that `n` results take.
template <typename Functor>
std::uint64_t words_taken(std::int64_t n) {
  return gpu::words_per_result<Functor> * static_cast<std::uint64_t>(n);
}

template <typename Engine>
template <typename T, typename Distribution, typename Out>
sycl::event snapshot_backend<Engine>::generate(sycl::queue& queue, std::int64_t n, Out r,
                                               Distribution distribution,
                                               const std::vector<sycl::event>& dependencies) {
  using functor = typename Distribution::functor;
  using call_type = engine_func_call<Engine, T, functor, Out>;
  constexpr int values = functor::asks == gpu::drawn::words ? engine_row<Engine>::stored_words : 1;
  const call_type call{values_of(n, values), r, distribution.kernel};
  return submit_with_snapshot(queue, dependencies, this->stream.get(), words_taken<functor>(n),
                              {&call_type::launch, &call, sizeof(typename call_type::record_type)});
}

namespace gpu {

// The level of engines whose state travels by value, where the queue has no say. Those with state
// on the device have a backend that takes the queue as well, and specialise what does not fit here.

template <typename Engine>
engine_base_impl<Engine>* wrap_stream(sycl::queue& queue, owned_stream stream) {
  using backend = engine_base_impl_backend<Engine, device_type::gpu>;
  if constexpr (std::is_constructible_v<backend, sycl::queue&, owned_stream>) {
    return new backend(queue, std::move(stream));
  } else {
    return new backend(std::move(stream));
  }
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed) {
  return wrap_stream<Engine>(queue, new_stream(engine_row<Engine>::code, seed));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                        const std::uint32_t* seed) {
  return wrap_stream<Engine>(queue, new_stream(engine_row<Engine>::code, n, seed));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, engine_base_impl<Engine>* other) {
  return wrap_stream<Engine>(queue, copy_stream(other->stream.get()));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue& queue, void* stream) {
  return wrap_stream<Engine>(queue, copy_stream(stream));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(void* stream) {
  return new engine_base_impl_backend<Engine, device_type::gpu>(copy_stream(stream));
}

template <typename Engine>
void delete_engine(sycl::queue&, engine_base_impl<Engine>* engine) {
  delete engine;
}

template <typename Engine>
void skip_ahead(sycl::queue&, engine_base_impl<Engine>* engine, std::uint64_t num_to_skip) {
  skip_stream(engine->stream.get(), num_to_skip);
}

template <typename Engine>
void skip_ahead(sycl::queue&, engine_base_impl<Engine>* engine,
                std::initializer_list<std::uint64_t> num_to_skip) {
  skip_stream(engine->stream.get(), num_to_skip);
}

template <typename Engine>
void leapfrog(sycl::queue&, engine_base_impl<Engine>* engine, std::uint64_t idx,
              std::uint64_t stride) {
  leapfrog_stream(engine->stream.get(), idx, stride);
}

/// The backend of an engine on a GPU queue. An engine made on a CPU queue, whose queue was replaced
/// by one on a GPU, has none: raises unsupported_device.
template <typename Engine>
engine_base_impl_backend<Engine, device_type::gpu>& backend_of(const sycl::queue& queue,
                                                               engine_base_impl<Engine>* engine) {
  auto* on_gpu = dynamic_cast<engine_base_impl_backend<Engine, device_type::gpu>*>(engine);
  if (on_gpu == nullptr) {
    throw unsupported_device("rng", "generate", queue.get_device());
  }
  return *on_gpu;
}

/// From a public distribution to the backend's generate.
template <typename Engine, typename Distr, typename Out>
sycl::event generate_plain(sycl::queue& queue, const Distr& distr, engine_base_impl<Engine>* engine,
                           std::int64_t n, Out r, const std::vector<sycl::event>& dependencies) {
  if constexpr (is_refused<Distr, Engine>) {
    refuse_uniform_bits<Engine>();
  } else {
    using T = typename Distr::result_type;
    using distribution = distribution_impl<T, Distr, device_type::gpu>;
    return backend_of(queue, engine)
        .template generate<T, distribution, Out>(queue, n, r, distribution(distr), dependencies);
  }
}

template <typename Engine, typename Distr>
sycl::event generate(sycl::queue& queue, const Distr& distr, engine_base_impl<Engine>* engine,
                     std::int64_t n, typename Distr::result_type* r,
                     const std::vector<sycl::event>& dependencies) {
  return generate_plain<Engine, Distr, typename Distr::result_type*>(queue, distr, engine, n, r,
                                                                     dependencies);
}

template <typename Engine, typename Distr>
sycl::event generate(sycl::queue& queue, const Distr& distr, engine_base_impl<Engine>* engine,
                     std::int64_t n, sycl::buffer<typename Distr::result_type, 1>& r,
                     const std::vector<sycl::event>& dependencies) {
  return generate_plain<Engine, Distr, sycl::buffer<typename Distr::result_type, 1>&>(
      queue, distr, engine, n, r, dependencies);
}

}  // namespace gpu

}  // namespace kestrel::tarn::rng::detail

/// The drawing entries of `engine` at the GPU level, for one row of a family with a fixed number of
/// words; to be used in namespace detail::gpu.
#define TARN_DEVICE_ROAD_generate(engine, T, ...)                                                 \
  template sycl::event generate<engine, __VA_ARGS__>(sycl::queue&, const __VA_ARGS__&,            \
                                                     engine_base_impl<engine>*, std::int64_t, T*, \
                                                     const std::vector<sycl::event>&);            \
  template sycl::event generate<engine, __VA_ARGS__>(                                             \
      sycl::queue&, const __VA_ARGS__&, engine_base_impl<engine>*, std::int64_t,                  \
      sycl::buffer<T, 1>&, const std::vector<sycl::event>&);
