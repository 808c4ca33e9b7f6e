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

/// Member `engine_idx` of a set of `members` engines, from a scalar seed or from words.
template <typename Engine, typename... Seed>
owned_impl<Engine> impl_of_member(sycl::queue& queue, std::uint32_t members,
                                  std::uint32_t engine_idx, Seed... seed) {
  const auto code = [=] { return member_code(engine_row<Engine>::code, engine_idx, members); };
  const auto on_gpu = [&] {
    code();  // for its check
    return gpu::create_engine<Engine>(queue, seed..., engine_idx);
  };
  return require_impl(make_impl<Engine>(
                          queue, [&] { return new_stream(code(), seed...); }, on_gpu),
                      queue);
}

/// From a table of the caller's, which comes back with the `header` that the stream needs in front
/// of it, and as it was when no engine can be made.
template <typename Engine>
owned_impl<Engine> impl_from_table(sycl::queue& queue, std::vector<std::uint32_t>& table,
                                   const std::array<std::uint32_t, 3>& header) {
  std::vector<std::uint32_t> headed(header.begin(), header.end());
  headed.insert(headed.end(), table.begin(), table.end());
  const auto n = static_cast<std::int64_t>(headed.size());
  owned_impl<Engine> impl = impl_from<Engine>(queue, n, headed.data());
  table.swap(headed);
  return impl;
}

/// The count of a list's items, as streams take it.
template <typename List>
std::int64_t count_of(const List& list) {
  return static_cast<std::int64_t>(list.size());
}

/// A list's storage as 32-bit words, low word of each item first.
std::vector<std::uint32_t> words_of(std::initializer_list<std::uint64_t> list);

}  // namespace kestrel::tarn::rng::detail
