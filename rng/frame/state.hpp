// SPDX-License-Identifier: Apache-2.0
// Saving and loading. The image is the stream's own, as the statistics library writes it, so it
// loads on any queue; nothing is added to it.
#pragma once

#include <cstdint>
#include <string>

#include <kestrel/tarn/rng/functions.hpp>
#include <sycl/sycl.hpp>

#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"

namespace kestrel::tarn::rng {

namespace detail {

/// Raise computation_error with the texts of each service.
std::int64_t stream_size(rvx_stream stream);
void save_stream(rvx_stream stream, std::uint8_t* mem);
void save_stream(rvx_stream stream, const std::string& filename);
/// Put the loaded stream in place of the one in `stream`, which is deleted first. An image of
/// another engine than `code` is refused like a damaged one.
void load_stream(owned_stream& stream, std::int64_t code, const std::uint8_t* mem);
void load_stream(owned_stream& stream, std::int64_t code, const std::string& filename);

}  // namespace detail

template <typename Engine>
std::int64_t get_state_size(Engine& engine) {
  return detail::stream_size(detail::engine_access::impl(engine)->stream.get());
}

template <typename Engine>
void save_state(Engine& engine, std::uint8_t* mem) {
  detail::save_stream(detail::engine_access::impl(engine)->stream.get(), mem);
}

template <typename Engine>
void save_state(Engine& engine, const std::string& filename) {
  detail::save_stream(detail::engine_access::impl(engine)->stream.get(), filename);
}

template <typename Engine>
Engine load_state(const sycl::queue& queue, const std::uint8_t* mem) {
  Engine engine(queue);
  detail::load_stream(detail::engine_access::impl(engine)->stream, detail::engine_row<Engine>::code,
                      mem);
  return engine;
}

template <typename Engine>
Engine load_state(const sycl::queue& queue, const std::string& filename) {
  Engine engine(queue);
  detail::load_stream(detail::engine_access::impl(engine)->stream, detail::engine_row<Engine>::code,
                      filename);
  return engine;
}

}  // namespace kestrel::tarn::rng
