// SPDX-License-Identifier: Apache-2.0
// What a generate call refuses before it asks for a device: combinations that no device offers, bad
// counts, outputs that cannot hold the results.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

#include <kestrel/tarn/exceptions.hpp>
#include <sycl/sycl.hpp>

#include "frame/rows.hpp"

namespace kestrel::tarn::rng::detail {

/// Values that one result of `distr` fills: more than one for vectors, rows of counts, and raw
/// words of more than 32 bits.
template <typename Engine, typename Distr>
std::int64_t values_per_result(const Distr&) {
  return 1;
}
template <typename Engine, typename T, matrix_layout layout, typename Method>
std::int64_t values_per_result(const gaussian_mv<T, layout, Method>& distr) {
  return distr.dimension();
}
template <typename Engine, typename T, typename Method>
std::int64_t values_per_result(const multinomial<T, Method>& distr) {
  return static_cast<std::int64_t>(distr.p().size());
}
template <typename Engine>
std::int64_t values_per_result(const bits<std::uint32_t>&) {
  return engine_row<Engine>::stored_words;
}

/// Raise invalid_argument: "n" first, then "r". A buffer must hold every value that the call
/// writes; how much stands behind a pointer nobody can tell.
void check_output(std::int64_t n, const void* r);
void check_output(std::int64_t n, std::size_t buffer_size, std::int64_t values_per_result);

template <typename Engine, typename Distr, typename T>
void check_output(const Distr&, std::int64_t n, T* r) {
  check_output(n, r);
}
template <typename Engine, typename Distr, typename T>
void check_output(const Distr& distr, std::int64_t n, sycl::buffer<T, 1>& r) {
  check_output(n, r.size(), values_per_result<Engine>(distr));
}

/// Raises invalid_argument ("poisson_v") unless there is one rate for each result.
void check_rates(std::size_t rates, std::int64_t n);

/// What a distribution asks of the count of results.
template <typename Distr>
void check_count(const Distr&, std::int64_t) {}
template <typename T, typename Method>
void check_count(const poisson_v<T, Method>& distr, std::int64_t n) {
  check_rates(distr.lambda().size(), n);
}

/// The kind of the queue's device, asked anew on each call. Raises unsupported_device where it is
/// neither.
device_type road_of(const sycl::queue& queue);
[[noreturn]] void refuse_device(const sycl::queue& queue);

/// For a method that is drawn on CPU queues alone.
[[noreturn]] void refuse_on_gpu(const char* family, const char* method);

/// The families that an engine split into sub-sequences draws.
template <typename Distr>
inline constexpr bool runs_in_sub_sequences = false;
template <typename T, typename Method>
inline constexpr bool runs_in_sub_sequences<uniform<T, Method>> = true;
template <typename T, typename Method>
inline constexpr bool runs_in_sub_sequences<gaussian<T, Method>> = true;

/// Raises invalid_argument where the engine is split and the distribution is not one of those.
template <typename Engine>
void check_mode(engine_base_impl<Engine>*, bool /*runs_in_sub_sequences*/) {}
template <>
void check_mode(engine_base_impl<mrg32k3a>* engine, bool runs_in_sub_sequences);

template <typename Distr>
inline constexpr bool is_uniform_bits = false;
template <typename UIntType>
inline constexpr bool is_uniform_bits<uniform_bits<UIntType>> = true;

/// True if the engine's words cannot give the distribution, whatever the device.
template <typename Distr, typename Engine>
inline constexpr bool is_refused = is_uniform_bits<Distr> && !engine_row<Engine>::uniform_bits;

template <typename Engine>
[[noreturn]] void refuse_uniform_bits() {
  throw unimplemented("rng", "generate",
                      std::string("uniform_bits distribution and ") + engine_row<Engine>::name +
                          " engine combination");
}

}  // namespace kestrel::tarn::rng::detail
