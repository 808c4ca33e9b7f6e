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
#include <kestrel/tarn/rng/engines.hpp>
#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail::gpu {

/// A new implementation from a seed, from `n` seed words, as a deep copy of another one, or from a
/// copy of a stream of the statistics library, which takes the queue for the engines with state on
/// the device (mt19937, mt2203, sobol) and no queue for the others. delete_engine frees it. Raise
/// computation_error, and device_bad_alloc where there is state on the device.
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
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, void* stream);

/// mrg32k3a in a sub-sequence mode, from the same seeds; from a stream it is in its default mode.
/// A copy keeps the mode and the place in the round. Raise device_bad_alloc besides.
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed,
                                                    mrg32k3a_mode::optimal mode);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed,
                                                    mrg32k3a_mode::custom mode);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                                    const std::uint32_t* seed,
                                                    mrg32k3a_mode::optimal mode);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                                    const std::uint32_t* seed,
                                                    mrg32k3a_mode::custom mode);
template <>
TARN_EXPORT engine_base_impl<mrg32k3a>* create_engine(sycl::queue& queue,
                                                      engine_base_impl<mrg32k3a>* other);

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

/// In a sub-sequence mode each sub-sequence moves past those of the next results that are its own,
/// the place in the round stays, and the kernels of earlier calls must have ended; a list is
/// refused.
template <>
TARN_EXPORT void skip_ahead(sycl::queue& queue, engine_base_impl<mrg32k3a>* engine,
                            std::uint64_t num_to_skip);
template <>
TARN_EXPORT void skip_ahead(sycl::queue& queue, engine_base_impl<mrg32k3a>* engine,
                            std::initializer_list<std::uint64_t> num_to_skip);

/// sobol has its current point on the device: a copy waits for the source's last kernel, a skip
/// runs behind it. Past the end of the sequence computation_error is raised in the name of sobol.
template <>
TARN_EXPORT engine_base_impl<sobol>* create_engine(sycl::queue& queue,
                                                   engine_base_impl<sobol>* other);
template <>
TARN_EXPORT void skip_ahead(sycl::queue& queue, engine_base_impl<sobol>* engine,
                            std::uint64_t num_to_skip);

/// The twisters have their state on the device: a copy waits for the source's last kernel, a skip
/// of mt19937 runs behind it and takes as long as drawing. After an odd number of `generate` calls
/// such a skip has no effect: it moves the half of the state that the next call does not read.
template <>
TARN_EXPORT engine_base_impl<mt19937>* create_engine(sycl::queue& queue,
                                                     engine_base_impl<mt19937>* other);
template <>
TARN_EXPORT void skip_ahead(sycl::queue& queue, engine_base_impl<mt19937>* engine,
                            std::uint64_t num_to_skip);
template <>
TARN_EXPORT engine_base_impl<mt2203>* create_engine(sycl::queue& queue,
                                                    engine_base_impl<mt2203>* other);

/// mt2203 from a seed alone, or from words alone, is one generator for each compute unit of the
/// device; with an index, below 6024, it is that member of the family.
template <>
TARN_EXPORT engine_base_impl<mt2203>* create_engine(sycl::queue& queue, std::uint64_t seed);
template <>
TARN_EXPORT engine_base_impl<mt2203>* create_engine(sycl::queue& queue, std::int64_t n,
                                                    const std::uint32_t* seed);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::uint64_t seed,
                                                    std::uint32_t engine_idx);
template <typename Engine>
TARN_EXPORT engine_base_impl<Engine>* create_engine(sycl::queue& queue, std::int64_t n,
                                                    const std::uint32_t* seed,
                                                    std::uint32_t engine_idx);

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
