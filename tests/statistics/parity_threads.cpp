// SPDX-License-Identifier: Apache-2.0
// Large calls: the values and the stream's place do not depend on the number of threads, on
// streaming stores, or on how the sequence is cut into calls.
#include <functional>

#include "support.hpp"

namespace {

constexpr plain::two key{3, 4};

// Runs `draw(stream, n, r)` for the whole of n at once and compares with small calls, which run on
// one thread and store plainly.
template <class Value>
void compare_with_small_calls(std::size_t n, std::size_t shift,
                              const std::function<int(rvx_stream, std::int64_t, Value*)>& draw) {
  // Next to a carry into the upper half of the counter, and in mid-block.
  const plain::u128 start = (plain::u128{5} << 64) - n / 8;
  support::stream small;
  small.set(key, start, 3);
  support::results<Value> expected(n + shift);
  constexpr std::size_t part = 5003;
  for (std::size_t done = 0; done < n; done += part)
    ASSERT_EQ(draw(small, static_cast<std::int64_t>(std::min(part, n - done)),
                   expected.data() + shift + done),
              0);
  for (int threads : {1, 2, 3, 8}) {
    tarn_serv_set_max_threads(threads);
    support::stream s;
    s.set(key, start, 3);
    support::results<Value> r(n + shift);
    ASSERT_EQ(draw(s, static_cast<std::int64_t>(n), r.data() + shift), 0);
    ASSERT_TRUE(r == expected) << threads << " threads, " << n << " values, shift " << shift;
    ASSERT_TRUE(support::same_position(s, small.position()));
  }
}

template <class Value>
void compare_sizes(const std::function<int(rvx_stream, std::int64_t, Value*)>& draw) {
  // Both sides of the sharing among threads, and of streaming stores (16 MiB of results).
  constexpr std::size_t shared = std::size_t{1} << 17;
  constexpr std::size_t streamed = (std::size_t{16} << 20) / sizeof(Value);
  for (std::size_t n : {shared - 1, shared, shared + 77, 3 * shared + 1})
    ASSERT_NO_FATAL_FAILURE(compare_with_small_calls<Value>(n, 0, draw));
  for (std::size_t n : {streamed, streamed + 1, streamed + 4321})
    for (std::size_t shift : {0u, 1u, 5u})
      ASSERT_NO_FATAL_FAILURE(compare_with_small_calls<Value>(n, shift, draw));
}

TEST(large_calls, words) {
  compare_sizes<std::uint32_t>([](rvx_stream s, std::int64_t n, std::uint32_t* r) {
    return rvxiRngUniformBits(0, s, n, r);
  });
}

TEST(large_calls, words_of_64_bits) {
  compare_sizes<std::uint64_t>([](rvx_stream s, std::int64_t n, std::uint64_t* r) {
    return rvxiRngUniformBits64(0, s, n, r);
  });
}

TEST(large_calls, floats) {
  compare_sizes<float>([](rvx_stream s, std::int64_t n, float* r) {
    return rvxsRngUniform(RVX_RNG_METHOD_UNIFORM_STD_ACCURATE, s, n, r, -1, 3);
  });
}

TEST(large_calls, doubles) {
  compare_sizes<double>([](rvx_stream s, std::int64_t n, double* r) {
    return rvxdRngUniform(RVX_RNG_METHOD_UNIFORM_STD, s, n, r, -1, 3);
  });
}

TEST(large_calls, integers) {
  compare_sizes<std::int32_t>([](rvx_stream s, std::int64_t n, std::int32_t* r) {
    return rvxiRngUniform(0, s, n, r, -1000, 1000);
  });
}

// Results that no vector store can be aligned to still come out whole.
TEST(large_calls, results_off_their_natural_alignment) {
  constexpr std::size_t n = (std::size_t{16} << 20) / sizeof(double) + 100;
  std::vector<double> expected(n);
  std::vector<unsigned char> bytes((n + 1) * sizeof(double), 0xA5);
  support::stream a, b;
  ASSERT_EQ(rvxdRngUniform(0, a, n, expected.data(), 0, 1), 0);
  auto* off = reinterpret_cast<double*>(bytes.data() + 4);
  ASSERT_EQ(rvxdRngUniform(0, b, n, off, 0, 1), 0);
  EXPECT_EQ(std::memcmp(bytes.data() + 4, expected.data(), n * sizeof(double)), 0);
  for (std::size_t i : {std::size_t{0}, std::size_t{3}, bytes.size() - 4, bytes.size() - 1})
    EXPECT_EQ(bytes[i], 0xA5);
}

}  // namespace
