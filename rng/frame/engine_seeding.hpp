// SPDX-License-Identifier: Apache-2.0
// From the arguments of an engine's constructor to its implementation: what the constructors of
// several engines share.
#pragma once

#include <array>
#include <cstdint>
#include <initializer_list>
#include <vector>

#include <kestrel/tarn/rng/engines.hpp>

#include "frame/engine_object.hpp"
#include "frame/streams.hpp"

namespace kestrel::tarn::rng::detail {

/// From a scalar seed, or from a count and as many seed words; the same on either kind of device.
template <typename Engine, typename... Seed>
owned_impl<Engine> impl_from(sycl::queue& queue, Seed... seed) {
  constexpr std::int64_t code = engine_row<Engine>::code;
  return require_impl(make_impl<Engine>(
                          queue, [&] { return new_stream(code, seed...); },
                          [&] { return gpu::create_engine<Engine>(queue, seed...); }),
                      queue);
}

/// From a stream that `make_stream` makes: for constructors without a device road.
template <typename Engine, typename MakeStream>
owned_impl<Engine> impl_on_cpu(sycl::queue& queue, MakeStream make_stream) {
  static_assert(!engine_row<Engine>::device_road, "this constructor needs a device road");
  const auto no_gpu = []() -> engine_base_impl<Engine>* { return nullptr; };
  return require_impl(make_impl<Engine>(queue, make_stream, no_gpu), queue);
}

/// Member `engine_idx` of a set of `members` engines, from a scalar seed or from words.
template <typename Engine, typename... Seed>
owned_impl<Engine> impl_of_member(sycl::queue& queue, std::uint32_t members,
                                  std::uint32_t engine_idx, Seed... seed) {
  return impl_on_cpu<Engine>(queue, [&] {
    return new_stream(member_code(engine_row<Engine>::code, engine_idx, members), seed...);
  });
}

/// From a table of the caller's, which keeps the `header` that the stream needs in front of it.
template <typename Engine>
owned_impl<Engine> impl_from_table(sycl::queue& queue, std::vector<std::uint32_t>& table,
                                   const std::array<std::uint32_t, 3>& header) {
  return impl_on_cpu<Engine>(queue, [&] {
    table.insert(table.begin(), header.begin(), header.end());
    return new_stream(engine_row<Engine>::code, static_cast<std::int64_t>(table.size()),
                      table.data());
  });
}

/// The count of a list's items, as streams take it.
template <typename List>
std::int64_t count_of(const List& list) {
  return static_cast<std::int64_t>(list.size());
}

/// A list's storage as 32-bit words, low word of each item first.
std::vector<std::uint32_t> words_of(std::initializer_list<std::uint64_t> list);

}  // namespace kestrel::tarn::rng::detail
