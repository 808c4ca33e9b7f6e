// SPDX-License-Identifier: Apache-2.0
// Calls of the exported GPU level for rejecting and compound families: the whole output, in either
// form, with a wide guard behind it, and the count of words drawn.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <kestrel/tarn/rng/device_level.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "drawing.hpp"
#include "every_engine.hpp"
#include "in_flight.hpp"

namespace tarn_test {

// clang-format off
/// Each engine that has a device road, there.
using device_cases = case_list<void
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu_, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  TARN_IF_##gpu_(, engine_case<rng::name, device_type::gpu>)
#include "engines/engines.def"
>::type;
// clang-format on

enum class output_form { pointer, buffer };
inline constexpr output_form both_forms[] = {output_form::pointer, output_form::buffer};

/// As many values as a work-group may lie behind its last one.
inline constexpr std::size_t wide_guard = 300;

template <typename T>
struct level_result {
  std::vector<T> values;
  std::int64_t consumed;
};

/// Draws `n` results into an output of `size` elements, marked before the call. What the call left
/// of the marks is for the caller to see.
template <typename Distr, typename Engine>
auto draw_at_level(output_form form, const Distr& distr, Engine& engine, std::int64_t n,
                   std::size_t size) {
  using T = typename Distr::result_type;
  auto* impl = rng::detail::engine_access::impl(engine);
  sycl::queue& queue = engine.get_queue();
  level_result<T> result{std::vector<T>(size + wide_guard, marker<T>()), 0};
  if (form == output_form::pointer) {
    const results<T> memory(queue, size + wide_guard);
    auto [last, consumed] = rng::detail::gpu::generate_ex(queue, distr, impl, n, memory.get(), {});
    last.wait_and_throw();
    result = {memory.values(), consumed};
  } else {
    sycl::buffer<T, 1> buffer(result.values.data(), sycl::range<1>(result.values.size()));
    result.consumed = rng::detail::gpu::generate_ex(queue, distr, impl, n, buffer, {}).second;
  }
  const auto behind = result.values.begin() + static_cast<std::ptrdiff_t>(size);
  EXPECT_TRUE(std::all_of(behind, result.values.end(),
                          [](T value) { return same_bits(value, marker<T>()); }))
      << "stray store behind " << size << " elements";
  result.values.resize(size);
  return result;
}

}  // namespace tarn_test
