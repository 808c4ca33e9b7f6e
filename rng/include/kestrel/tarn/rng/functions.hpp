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

///@{
/// Moves the engine forward.
///
/// \param engine       one that can skip: not r250, mt2203, nondeterministic
/// \param num_to_skip  words of its sequence: a number, or for philox4x32x10, ars5 and mrg32k3a a
///                     list of its 64-bit digits, least significant first
///
/// Raises computation_error past the end of a finite sequence, and without memory for the long jump
/// of a Mersenne twister; the engine has not moved then.
template <typename Engine>
auto skip_ahead(Engine& engine, std::uint64_t num_to_skip)
    -> decltype(detail::engine_access::skip_ahead(engine, num_to_skip)) {
  detail::engine_access::skip_ahead(engine, num_to_skip);
}
template <typename Engine>
auto skip_ahead(Engine& engine, std::initializer_list<std::uint64_t> num_to_skip)
    -> decltype(detail::engine_access::skip_ahead(engine, num_to_skip)) {
  detail::engine_access::skip_ahead(engine, num_to_skip);
}
///@}

/// Leaves the engine words idx, idx + stride, idx + 2 stride, ... of those that it would have
/// given.
///
/// \param engine  mcg31m1, mcg59 or wichmann_hill
/// \param idx     0 to stride - 1
/// \param stride  1 to 2^31 - 1
///
/// Raises computation_error for other numbers; the engine is as it was then.
template <typename Engine>
auto leapfrog(Engine& engine, std::uint64_t idx, std::uint64_t stride)
    -> decltype(detail::engine_access::leapfrog(engine, idx, stride)) {
  detail::engine_access::leapfrog(engine, idx, stride);
}

/// Bytes that save_state writes; positive. Raises computation_error.
template <typename Engine>
TARN_EXPORT std::int64_t get_state_size(Engine& engine);

/// Writes the engine's state to memory. Raises computation_error.
///
/// \param engine  any engine
/// \param mem     room for get_state_size bytes
template <typename Engine>
TARN_EXPORT void save_state(Engine& engine, std::uint8_t* mem);

/// Writes the engine's state to a file: beside it at first, so that an older one is lost only when
/// the new one is whole. Raises computation_error.
///
/// \param engine    any engine
/// \param filename  of the file
template <typename Engine>
TARN_EXPORT void save_state(Engine& engine, const std::string& filename);

/// An engine in the saved state. A state saved on one kind of device loads on another.
///
/// \tparam Engine  the class of the engine saved
/// \param queue    the queue of the new engine
/// \param mem      what save_state wrote, whole
///
/// Raises computation_error for what is no whole state of an `Engine`; unsupported_device and
/// unimplemented as its constructor does.
template <typename Engine>
TARN_EXPORT Engine load_state(const sycl::queue& queue, const std::uint8_t* mem);

/// The same from a file.
///
/// \tparam Engine   the class of the engine saved
/// \param queue     the queue of the new engine
/// \param filename  of the file that save_state wrote
template <typename Engine>
TARN_EXPORT Engine load_state(const sycl::queue& queue, const std::string& filename);

}  // namespace kestrel::tarn::rng
