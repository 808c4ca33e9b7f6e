// SPDX-License-Identifier: Apache-2.0
// Drawing in tests: results into shared memory or a buffer, pre-filled with a marker and with
// guards behind them, so that a missing or a stray store shows.
#pragma once

#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <limits>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "queues.hpp"

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

/// Whether reals made of the same words are the same: bit for bit where the kernels of `queue` run
/// on the host. The elementary functions of another device part from it by units in the last place,
/// which closed_form_roads bounds; a word from another place would show in the first digits.
template <typename T>
bool same_reals(const sycl::queue& queue, const std::vector<T>& got, const std::vector<T>& want) {
  if (!is_cuda(queue) || got.size() != want.size()) {
    return got == want;
  }
  for (std::size_t i = 0; i < got.size(); ++i) {
    const T bound = 100 * std::numeric_limits<T>::epsilon() * (10 + std::abs(want[i]));
    if (!(std::abs(got[i] - want[i]) <= bound)) {
      return false;
    }
  }
  return true;
}

/// A short call on each CUDA device, which has to give the words of the host.
inline void expect_words_on_cuda() {
  rng::philox4x32x10 host(cpu_queue(), 7);
  const auto expected = draw(rng::bits<>(), host, 1003);
  for (const sycl::queue& queue : cuda_queues()) {
    rng::philox4x32x10 engine(queue, 7);
    EXPECT_EQ(draw(rng::bits<>(), engine, 1003), expected);
  }
}

}  // namespace tarn_test

/// A test that says in the report whether a suite ran on a CUDA device as well.
#define TARN_REPORTS_CUDA(suite)             \
  TEST(suite##_on_cuda, there_is_a_device) { \
    if (tarn_test::cuda_queues().empty()) {  \
      GTEST_SKIP() << "no CUDA device";      \
    }                                        \
    tarn_test::expect_words_on_cuda();       \
  }
