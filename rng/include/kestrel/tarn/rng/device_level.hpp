// SPDX-License-Identifier: Apache-2.0
// The GPU level by itself, for callers that hold an implementation instead of an engine object
// (the offload entries). It exists for the engines with a device road, on a GPU queue; the
// arguments are not checked here. The events are those of the last kernel of a call.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <utility>
#include <vector>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/detail/engine_base.hpp>
#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail::gpu {

/// A new implementation from a seed, from `n` seed words, as a deep copy of another one, or from a
/// copy of a stream of the statistics library. delete_engine frees it.
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                                    const std::uint32_t* seed);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue,
                                                    engine_base_impl<Engine>* other);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(void* stream);

/// Frees device memory, then the implementation.
template <typename Engine>
TARN_EXPORT void delete_engine(sycl::queue& queue, engine_base_impl<Engine>* engine);

/// Move forward by a count of words; raise computation_error.
template <typename Engine>
TARN_EXPORT void skip_ahead(sycl::queue& queue, engine_base_impl<Engine>* engine,
                            std::uint64_t num_to_skip);
template <typename Engine>
TARN_EXPORT void skip_ahead(sycl::queue& queue, engine_base_impl<Engine>* engine,
                            std::initializer_list<std::uint64_t> num_to_skip);

/// Keep every `stride`-th word, beginning with word `idx`; raises computation_error.
template <typename Engine>
TARN_EXPORT void leapfrog(sycl::queue& queue, engine_base_impl<Engine>* engine, std::uint64_t idx,
                          std::uint64_t stride);

/// Draw into memory or into a buffer: the families whose results take a fixed number of words.
template <typename Engine, typename Distr>
TARN_EXPORT sycl::event generate(sycl::queue& queue, const Distr& distr,
                                 engine_base_impl<Engine>* engine, std::int64_t n,
                                 typename Distr::result_type* r,
                                 const std::vector<sycl::event>& dependencies);
template <typename Engine, typename Distr>
TARN_EXPORT sycl::event generate(sycl::queue& queue, const Distr& distr,
                                 engine_base_impl<Engine>* engine, std::int64_t n,
                                 sycl::buffer<typename Distr::result_type, 1>& r,
                                 const std::vector<sycl::event>& dependencies);

/// The same for rejecting and compound families; second in the pair is the count of words drawn.
template <typename Engine, typename Distr>
TARN_EXPORT std::pair<sycl::event, std::int64_t> generate_ex(
    sycl::queue& queue, const Distr& distr, engine_base_impl<Engine>* engine, std::int64_t n,
    typename Distr::result_type* r, const std::vector<sycl::event>& dependencies);
template <typename Engine, typename Distr>
TARN_EXPORT std::pair<sycl::event, std::int64_t> generate_ex(
    sycl::queue& queue, const Distr& distr, engine_base_impl<Engine>* engine, std::int64_t n,
    sycl::buffer<typename Distr::result_type, 1>& r, const std::vector<sycl::event>& dependencies);

}  // namespace kestrel::tarn::rng::detail::gpu
