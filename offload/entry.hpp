// SPDX-License-Identifier: Apache-2.0
// The steps of every entry behind its look at the parameters: the offload runtime, the queue, the
// engine of the stream, the kernels, the end of the call.
#pragma once

#include <cstdint>
#include <memory>
#include <tarn_rvx.h>

#include <sycl/sycl.hpp>

#include "finish.hpp"
#include "generator.hpp"
#include "guard.hpp"
#include "interop.hpp"
#include "service/openmp_binding.hpp"
#include "statuses.hpp"

namespace kestrel::tarn::rng::detail::openmp {

/// What all routines are given, whatever their integers are.
template <typename T>
struct call {
  std::int64_t method;
  rvx_stream stream;
  std::int64_t n;
  T* r;
  void* interop;
};

/// The number of an engine, from the code in the first word of a stream. Members of a set other
/// than the first have numbers beyond all engines: the low bits of their codes go to the top.
constexpr std::uint32_t engine_index(std::uint32_t code) {
  const std::uint32_t rest = code - 0x100000;
  return rest << 12 | rest >> 20;
}

/// Raises invalid_argument ("stream") for a null one.
std::uint32_t engine_index_of(rvx_stream stream);

/// Draws with the private engine of `generator_impl<Engine, Distr>` and ends the call.
template <typename Engine, typename Distr>
int draw(const call<typename Distr::result_type>& asked, const Distr& distr,
         const interop_queue& on, ending how) {
  auto made = std::make_unique<generator_impl<Engine, Distr>>(asked.stream, distr, *on.queue);
  generator<Distr>& work = *made;
  sycl::event kernels;
  work.generate(kernels, asked.n, asked.r);
  if (work.status != done) {
    kernels.wait();
    return work.status;
  }
  return finish(
      std::move(kernels),
      {made.release(), [](void* it) { delete static_cast<generator_impl<Engine, Distr>*>(it); }},
      asked.interop, how);
}

/// A `make` gives the distribution; it runs once the queue is there and the engine is known to have
/// a device road, and may raise.
template <typename T, typename Make>
int run(const call<T>& asked, const Make& make) {
  if (tarn::gpu::bind_openmp() != 0) {
    return no_device;
  }
  const bool nowait = is_nowait(asked.interop);
  return guarded([&] {
    const interop_queue on = queue_of(asked.interop);
    if (on.status != done) {
      return on.status;
    }
    const ending how = !nowait        ? ending::waited_for
                       : on.is_opencl ? ending::by_callback
                                      : ending::by_thread;
    switch (engine_index_of(asked.stream)) {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  TARN_IF_##gpu(case engine_index(code) : return draw<name>(asked, make(), on, how);)
#include "rng/engines/engines.def"
      default:
        return static_cast<int>(no_gpu_path);
    }
  });
}

}  // namespace kestrel::tarn::rng::detail::openmp
