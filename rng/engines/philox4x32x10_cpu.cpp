// SPDX-License-Identifier: Apache-2.0
// philox4x32x10 on the host: the engine object and its host road.
#include <initializer_list>
#include <utility>
#include <vector>

#include "distributions/all.hpp"
#include "frame/engine_object.hpp"
#include "frame/host_road.hpp"

namespace kestrel::tarn::rng {

using engine = philox4x32x10;

namespace {

constexpr std::int64_t code = detail::engine_row<engine>::code;

/// The list's storage as 32-bit words, low word of each item first.
std::vector<std::uint32_t> words_of(std::initializer_list<std::uint64_t> list) {
  std::vector<std::uint32_t> words;
  words.reserve(2 * list.size());
  for (const std::uint64_t item : list) {
    words.push_back(static_cast<std::uint32_t>(item));
    words.push_back(static_cast<std::uint32_t>(item >> 32));
  }
  return words;
}

}  // namespace

philox4x32x10::philox4x32x10(sycl::queue queue_, std::uint64_t seed)
    : engine_base(std::move(queue_)) {
  impl = detail::require_impl(detail::make_impl<engine>(
                                  queue, [&] { return detail::new_stream(code, seed); },
                                  [&] { return detail::gpu::create_engine<engine>(queue, seed); }),
                              queue);
}

// A list of n items travels as n words on a CPU queue, which are the first n of its 2n words, and
// as all 2n words on a GPU queue. Streams made so have to stay as they are.
philox4x32x10::philox4x32x10(sycl::queue queue_, std::initializer_list<std::uint64_t> seed)
    : engine_base(std::move(queue_)) {
  const std::vector<std::uint32_t> words = words_of(seed);
  const auto items = static_cast<std::int64_t>(seed.size());
  impl = detail::require_impl(
      detail::make_impl<engine>(
          queue, [&] { return detail::new_stream(code, items, words.data()); },
          [&] { return detail::gpu::create_engine<engine>(queue, 2 * items, words.data()); }),
      queue);
}

void philox4x32x10::skip_ahead(std::uint64_t num_to_skip) {
  detail::skip_stream(impl->stream.get(), num_to_skip);
}

void philox4x32x10::skip_ahead(std::initializer_list<std::uint64_t> num_to_skip) {
  detail::skip_stream(impl->stream.get(), static_cast<std::int64_t>(num_to_skip.size()),
                      num_to_skip.begin());
}

namespace detail {

template class engine_base<engine>;
#define TARN_DISTRIBUTION(family, result, method, type, words, road, built) \
  TARN_IF_##built(TARN_HOST_ROAD_OF(engine, result, TARN_UNWRAP type))
#include "distributions/distributions.def"

}  // namespace detail

}  // namespace kestrel::tarn::rng
