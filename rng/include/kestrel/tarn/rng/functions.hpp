// SPDX-License-Identifier: Apache-2.0
// Services of engines: skipping, splitting, saving and loading. skip_ahead and leapfrog exist for
// the engines that can; for the others a call does not compile.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>

#include <kestrel/tarn/export.hpp>
#include <kestrel/tarn/rng/engines.hpp>
#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng {

/// Moves the engine forward by `num_to_skip` words of its sequence. Raises computation_error.
template <typename Engine>
auto skip_ahead(Engine& engine, std::uint64_t num_to_skip)
    -> decltype(detail::engine_access::skip_ahead(engine, num_to_skip)) {
  detail::engine_access::skip_ahead(engine, num_to_skip);
}

/// The same for counts past 64 bits: `num_to_skip` holds 64-bit digits, least significant first.
template <typename Engine>
auto skip_ahead(Engine& engine, std::initializer_list<std::uint64_t> num_to_skip)
    -> decltype(detail::engine_access::skip_ahead(engine, num_to_skip)) {
  detail::engine_access::skip_ahead(engine, num_to_skip);
}

/// Leaves the engine every `stride`-th word, beginning with word `idx`. Raises computation_error.
template <typename Engine>
auto leapfrog(Engine& engine, std::uint64_t idx, std::uint64_t stride)
    -> decltype(detail::engine_access::leapfrog(engine, idx, stride)) {
  detail::engine_access::leapfrog(engine, idx, stride);
}

/// Bytes that save_state writes; positive. Raises computation_error.
template <typename Engine>
TARN_EXPORT std::int64_t get_state_size(Engine& engine);

/// Writes the engine's state to `mem`, which must hold get_state_size bytes, or to a file. Raises
/// computation_error.
template <typename Engine>
TARN_EXPORT void save_state(Engine& engine, std::uint8_t* mem);
template <typename Engine>
TARN_EXPORT void save_state(Engine& engine, const std::string& filename);

/// An engine on `queue` in the saved state. A state saved on one kind of device loads on another.
/// Raises computation_error and leaves no half-made engine.
template <typename Engine>
TARN_EXPORT Engine load_state(const sycl::queue& queue, const std::uint8_t* mem);
template <typename Engine>
TARN_EXPORT Engine load_state(const sycl::queue& queue, const std::string& filename);

}  // namespace kestrel::tarn::rng
