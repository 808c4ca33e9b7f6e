// SPDX-License-Identifier: Apache-2.0
// The device road of engines without device state. In the command group, on the calling thread:
// the state record is copied out of the host stream, the stream is skipped past the call, the
// kernel is launched with the copy. So the calls of a thread read consecutive stretches of the
// sequence whether or not earlier kernels have run, and the kernels need no order among them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <type_traits>
#include <utility>
#include <vector>

#include <kestrel/tarn/rng/device_level.hpp>
#include <sycl/sycl.hpp>

#include "frame/engine_backend.hpp"
#include "frame/engine_func.hpp"
#include "frame/rows.hpp"

namespace kestrel::tarn::rng::detail {

/// A launch without its types: `launch` is called in the command group with the context and the
/// snapshot of the state record.
struct kernel_launch {
  void (*launch)(sycl::handler& group, const void* context, const void* record);
  const void* context;
  std::size_t record_size;  // at most max_record_size
};
inline constexpr std::size_t max_record_size = 32;

/// Submits the command group described above; `words` is what the call takes from the sequence.
/// Raises computation_error ("skip_ahead") and the runtime's own errors. There is no way back: the
/// stream stays moved if the launch fails.
sycl::event submit_with_snapshot(sycl::queue& queue, const std::vector<sycl::event>& dependencies,
                                 rvx_stream stream, std::uint64_t words,
                                 const kernel_launch& kernel);

/// The number of work-items for `n` results of `per_item` each, in signed arithmetic: a sum past
/// 2^63 turns negative, which the runtime's test of the range refuses like any range over 2^31.
inline std::size_t work_items(std::int64_t n, std::int32_t per_item) {
  const auto sum = static_cast<std::int64_t>(static_cast<std::uint64_t>(n) +
                                             static_cast<std::uint64_t>(per_item - 1));
  return static_cast<std::size_t>(sum / per_item);
}

/// What a kernel stores through: the pointer itself, or an accessor bound in the command group.
/// Elements past `n` keep their values.
template <typename T>
T* bind_output(sycl::handler&, T* r) {
  return r;
}
template <typename T>
auto bind_output(sycl::handler& group, sycl::buffer<T, 1>& r) {
  return sycl::accessor<T, 1, sycl::access_mode::write>(r, group);
}

/// The arguments of a launch of engine_func. `Out` is T* or sycl::buffer<T, 1>&.
template <typename Engine, typename T, typename Functor, typename Out>
struct engine_func_launch {
  std::int64_t n;
  Out r;
  Functor functor;

  using source = typename Functor::source;
  using traits = engine_traits<Engine>;

  static void launch(sycl::handler& group, const void* context, const void* record) {
    const auto& call = *static_cast<const engine_func_launch*>(context);
    auto out = bind_output(group, call.r);
    using kernel_type = engine_func<Engine, T, source, Functor, decltype(out)>;
    source scale{};
    source shift{};
    if constexpr (std::is_floating_point_v<source>) {
      scale = traits::scale(call.functor.lo(), call.functor.hi());
      shift = traits::offset(call.functor.lo(), call.functor.hi());
    }
    const kernel_type kernel{Functor::results,
                             out,
                             call.functor,
                             *static_cast<const typename traits::record*>(record),
                             scale,
                             shift,
                             static_cast<std::uint64_t>(call.n)};
    group.parallel_for(sycl::range<1>(work_items(call.n, Functor::results)), kernel);
  }
};

template <typename Engine>
template <typename T, typename Distribution, typename Out>
sycl::event engine_base_impl_backend<Engine, device_type::gpu>::generate(
    sycl::queue& queue, std::int64_t n, Out r, Distribution distribution,
    const std::vector<sycl::event>& dependencies) {
  using launch = engine_func_launch<Engine, T, typename Distribution::functor, Out>;
  using row = distribution_row<typename public_distribution<Distribution>::type>;
  using record = typename engine_traits<Engine>::record;
  static_assert(sizeof(record) <= max_record_size);
  const launch call{n, r, distribution.kernel};
  return submit_with_snapshot(queue, dependencies, this->stream.get(),
                              row::per_output_words * static_cast<std::uint64_t>(n),
                              {&launch::launch, &call, sizeof(record)});
}

namespace gpu {

// The level of an engine without device state: the queue has no say in it.

template <typename Engine>
engine_base_impl<Engine>* wrap_stream(owned_stream stream) {
  return new engine_base_impl_backend<Engine, device_type::gpu>(std::move(stream));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue&, std::uint64_t seed) {
  return wrap_stream<Engine>(new_stream(engine_row<Engine>::code, seed));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue&, std::int64_t n, const std::uint32_t* seed) {
  return wrap_stream<Engine>(new_stream(engine_row<Engine>::code, n, seed));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(sycl::queue&, engine_base_impl<Engine>* other) {
  return wrap_stream<Engine>(copy_stream(other->stream.get()));
}

template <typename Engine>
engine_base_impl<Engine>* create_engine(void* stream) {
  return wrap_stream<Engine>(copy_stream(stream));
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
  skip_stream(engine->stream.get(), static_cast<std::int64_t>(num_to_skip.size()),
              num_to_skip.begin());
}

/// From a public distribution to the backend's generate.
template <typename Engine, typename Distr, typename Out>
sycl::event generate_plain(sycl::queue& queue, const Distr& distr, engine_base_impl<Engine>* engine,
                           std::int64_t n, Out r, const std::vector<sycl::event>& dependencies) {
  using T = typename Distr::result_type;
  using distribution = distribution_impl<T, Distr, device_type::gpu>;
  using backend = engine_base_impl_backend<Engine, device_type::gpu>;
  return static_cast<backend*>(engine)->template generate<T, distribution, Out>(
      queue, n, r, distribution(distr), dependencies);
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
#define TARN_DEVICE_ROAD_OF(engine, T, ...)                                                       \
  template sycl::event generate<engine, __VA_ARGS__>(sycl::queue&, const __VA_ARGS__&,            \
                                                     engine_base_impl<engine>*, std::int64_t, T*, \
                                                     const std::vector<sycl::event>&);            \
  template sycl::event generate<engine, __VA_ARGS__>(                                             \
      sycl::queue&, const __VA_ARGS__&, engine_base_impl<engine>*, std::int64_t,                  \
      sycl::buffer<T, 1>&, const std::vector<sycl::event>&);
