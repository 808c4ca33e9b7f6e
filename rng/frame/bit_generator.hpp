// SPDX-License-Identifier: Apache-2.0
// Reading ahead of an engine, and giving back. Not every engine can step back or skip, but every
// one can be copied: a copy from the start of the block takes the engine's place and draws again
// what was used of it.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <tarn_rvx.h>

#include <kestrel/tarn/exceptions.hpp>
#include <kestrel/tarn/rng/bit_generator.hpp>

#include "frame/engine_backend.hpp"
#include "frame/rows.hpp"
#include "frame/state.hpp"
#include "frame/streams.hpp"

namespace kestrel::tarn::rng {

namespace detail {

/// A routine of the statistics library that writes words.
using word_routine = int (*)(std::int64_t method, rvx_stream stream, std::int64_t n,
                             std::uint32_t* r);

struct read_ahead {
  word_routine draw;
  std::int64_t size;   // of a block, in words: at most words.size()
  owned_stream start;  // where the latest block begins
  std::array<std::uint32_t, 1024> words;
};

/// Fills a block from the stream. Raises computation_error; the stream has not moved then.
void fill_block(read_ahead& ahead, rvx_stream stream);

/// Moves the stream back to `used` words behind the start of the latest block.
void give_back(read_ahead& ahead, owned_stream& stream, std::int64_t used) noexcept;

/// True for the engines seeded by a count of dimensions: quasi-random sequences end.
template <typename Engine>
inline constexpr bool has_end = false;

enum class seed_kind : std::uint8_t { u32, u64, dim, none };
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  template <>                                                                                \
  inline constexpr bool has_end<name> = seed_kind::seed_type == seed_kind::dim;
#include "engines/engines.def"

/// Raises unsupported_device, as generate does, if the device of `queue` is none for the engine.
template <typename Engine>
void require_road(const sycl::queue& queue) {
  const sycl::device device = queue.get_device();
  if (!device.is_cpu() && !(engine_row<Engine>::gpu && device.is_gpu())) {
    throw unsupported_device("rng", "bit_generator", device);
  }
}

}  // namespace detail

// One word is a block of a sequence with an end: a call that would read past the end draws nothing
// and is reported, though the caller may want no word from there.
template <typename Engine>
bit_generator<Engine>::bit_generator(Engine& engine)
    : engine_(engine), ahead_(std::make_unique<detail::read_ahead>()) {
  ahead_->draw =
      detail::engine_row<Engine>::uniform_bits ? rvxiRngUniformBits32 : rvxiRngUniformBits;
  ahead_->size = detail::has_end<Engine> ? 1 : static_cast<std::int64_t>(ahead_->words.size());
}

template <typename Engine>
bit_generator<Engine>::~bit_generator() {
  release();
}

template <typename Engine>
void bit_generator<Engine>::read_block() {
  detail::require_road<Engine>(engine_.get_queue());
  auto* impl = detail::engine_access::impl(engine_);
  detail::image_to_stream(impl, "bit_generator");
  detail::fill_block(*ahead_, impl->stream.get());
  detail::image_from_stream(engine_.get_queue(), impl);
  next_ = ahead_->words.data();
  end_ = next_ + ahead_->size;
}

template <typename Engine>
void bit_generator<Engine>::release() noexcept {
  if (next_ != end_) {
    auto* impl = detail::engine_access::impl(engine_);
    detail::give_back(*ahead_, impl->stream, next_ - ahead_->words.data());
    detail::image_from_stream(engine_.get_queue(), impl);
  }
  next_ = end_;
}

}  // namespace kestrel::tarn::rng
