// SPDX-License-Identifier: Apache-2.0
// Saving and loading. The image is the stream's own, as the statistics library writes it, so it
// loads on any queue; nothing is added to it.
#pragma once

#include <cstdint>
#include <string>

#include <kestrel/tarn/rng/engines.hpp>
#include <kestrel/tarn/rng/functions.hpp>
#include <sycl/sycl.hpp>

#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"

namespace kestrel::tarn::rng {

namespace detail {

/// Engines with an image of their state on the device bring the record in the stream up to date
/// before `service` reads it, and the image after a record has been loaded. Where no stream can
/// hold the state the first raises computation_error in the name of the service. Nothing is done
/// for an implementation that was made on a CPU queue.
template <typename Engine>
void image_to_stream(engine_base_impl<Engine>*, const char* /*service*/) {}
template <typename Engine>
void image_from_stream(sycl::queue&, engine_base_impl<Engine>*) {}
template <>
void image_to_stream(engine_base_impl<mrg32k3a>* engine, const char* service);
template <>
void image_to_stream(engine_base_impl<mt19937>* engine, const char* service);
template <>
void image_from_stream(sycl::queue& queue, engine_base_impl<mt19937>* engine);
template <>
void image_to_stream(engine_base_impl<mt2203>* engine, const char* service);
template <>
void image_from_stream(sycl::queue& queue, engine_base_impl<mt2203>* engine);
template <>
void image_to_stream(engine_base_impl<sobol>* engine, const char* service);
template <>
void image_from_stream(sycl::queue& queue, engine_base_impl<sobol>* engine);

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
  auto* impl = detail::engine_access::impl(engine);
  detail::image_to_stream(impl, "save_state");
  detail::save_stream(impl->stream.get(), mem);
}

template <typename Engine>
void save_state(Engine& engine, const std::string& filename) {
  auto* impl = detail::engine_access::impl(engine);
  detail::image_to_stream(impl, "save_state");
  detail::save_stream(impl->stream.get(), filename);
}

template <typename Engine>
Engine load_state(const sycl::queue& queue, const std::uint8_t* mem) {
  Engine engine(queue);
  auto* impl = detail::engine_access::impl(engine);
  detail::load_stream(impl->stream, detail::engine_row<Engine>::code, mem);
  detail::image_from_stream(engine.get_queue(), impl);
  return engine;
}

template <typename Engine>
Engine load_state(const sycl::queue& queue, const std::string& filename) {
  Engine engine(queue);
  auto* impl = detail::engine_access::impl(engine);
  detail::load_stream(impl->stream, detail::engine_row<Engine>::code, filename);
  detail::image_from_stream(engine.get_queue(), impl);
  return engine;
}

}  // namespace kestrel::tarn::rng
