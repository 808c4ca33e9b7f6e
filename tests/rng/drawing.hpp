// SPDX-License-Identifier: Apache-2.0
// Drawing in tests: results into shared memory or a buffer, pre-filled with a marker and with
// guards behind them, so that a missing or a stray store shows.
#pragma once

#include <array>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

namespace tarn_test {

namespace rng = kestrel::tarn::rng;

inline constexpr std::size_t guard_size = 16;

template <typename T>
T marker() {
  T value;
  std::memset(&value, 0xA5, sizeof value);
  return value;
}

template <typename T>
bool same_bits(const T& x, const T& y) {
  return std::memcmp(&x, &y, sizeof x) == 0;
}

/// Draws `n` results of as many values each into USM, waits, checks the guards and returns the
/// values.
template <typename Distr, typename Engine>
auto draw(const Distr& distr, Engine& engine, std::int64_t n, std::size_t values_per_result = 1) {
  using T = typename Distr::result_type;
  const std::size_t count = static_cast<std::size_t>(n) * values_per_result;
  sycl::queue& queue = engine.get_queue();
  T* memory = sycl::malloc_shared<T>(count + guard_size, queue);
  for (std::size_t i = 0; i < count + guard_size; ++i) {
    memory[i] = marker<T>();
  }
  rng::generate(distr, engine, n, memory).wait_and_throw();
  for (std::size_t i = count; i < count + guard_size; ++i) {
    EXPECT_TRUE(same_bits(memory[i], marker<T>())) << "stray store at " << i << " of " << n;
  }
  std::vector<T> values(memory, memory + count);
  sycl::free(memory, queue);
  return values;
}

/// The same into a buffer that is longer than `n`.
template <typename Distr, typename Engine>
auto draw_into_buffer(const Distr& distr, Engine& engine, std::int64_t n,
                      std::size_t values_per_result = 1) {
  using T = typename Distr::result_type;
  const std::size_t count = static_cast<std::size_t>(n) * values_per_result;
  std::vector<T> values(count + guard_size, marker<T>());
  {
    sycl::buffer<T, 1> buffer(values.data(), sycl::range<1>(values.size()));
    rng::generate(distr, engine, n, buffer);
  }
  for (std::size_t i = count; i < values.size(); ++i) {
    EXPECT_TRUE(same_bits(values[i], marker<T>())) << "stray store at " << i << " of " << n;
  }
  values.resize(count);
  return values;
}

/// Philox with the six words key[0], key[1], ctr[0] to ctr[3], on any queue: a list of six items
/// of which the CPU road takes the first six words and the GPU road all twelve; the words past the
/// sixth are ignored.
inline rng::philox4x32x10 philox_at(const sycl::queue& queue,
                                    const std::array<std::uint32_t, 2>& key,
                                    const std::array<std::uint32_t, 4>& ctr) {
  const auto pair = [](std::uint32_t low, std::uint32_t high) {
    return std::uint64_t{high} << 32 | low;
  };
  return rng::philox4x32x10(
      queue, {pair(key[0], key[1]), pair(ctr[0], ctr[1]), pair(ctr[2], ctr[3]), 0, 0, 0});
}

}  // namespace tarn_test
