// SPDX-License-Identifier: Apache-2.0
// Doubles are drawn into half of the output itself, converted in place, and the rest goes through
// an 8 KiB block on the stack: no memory of the size of the call is needed.
#include "distributions/uniform_integers.hpp"

#include <algorithm>
#include <cstddef>
#include <cstring>

namespace kestrel::tarn::rng::detail {
namespace {

constexpr std::int64_t block_size = 1024;

int draw(rvx_stream stream, std::int64_t n, double* values, double a, double b) {
  return rvxdRngUniform(RVX_RNG_METHOD_UNIFORM_STD, stream, n, values, a, b);
}

/// The doubles lie in the memory of the integers, at twice the offset, so that reading from the
/// front stays ahead of writing.
template <typename Integer>
void convert_in_place(Integer* r, std::int64_t count) {
  auto* bytes = reinterpret_cast<unsigned char*>(r);
  for (std::size_t i = 0; i < static_cast<std::size_t>(count); ++i) {
    double value;
    std::memcpy(&value, bytes + i * sizeof(double), sizeof value);
    const auto integer = static_cast<Integer>(value);
    std::memcpy(bytes + i * sizeof(Integer), &integer, sizeof integer);
  }
}

template <typename Integer>
int draw_by_blocks(rvx_stream stream, std::int64_t n, Integer* r, double a, double b) {
  double block[block_size];
  while (n > 0) {
    const std::int64_t count = std::min(n, block_size);
    const int status = draw(stream, count, block, a, b);
    if (status != 0) {
      return status;
    }
    std::transform(block, block + count, r,
                   [](double value) { return static_cast<Integer>(value); });
    r += count;
    n -= count;
  }
  return 0;
}

bool holds_doubles(const void* r) {
  return reinterpret_cast<std::uintptr_t>(r) % alignof(double) == 0;
}

}  // namespace

template <typename Integer>
int uniform_integers(rvx_stream stream, std::int64_t n, Integer* r, Integer a, Integer b) {
  const auto lo = static_cast<double>(a);
  const auto hi = static_cast<double>(b);
  if (n <= 0 || r == nullptr) {
    return draw(stream, n, nullptr, lo, hi);  // reports what is to be reported
  }
  if (!holds_doubles(r)) {  // one value further on it does
    const int status = draw_by_blocks(stream, std::int64_t{1}, r, lo, hi);
    if (status != 0) {
      return status;
    }
    ++r;
    --n;
  }
  const std::int64_t half = n / 2;
  if (half > block_size) {
    const int status = draw(stream, half, reinterpret_cast<double*>(r), lo, hi);
    if (status != 0) {
      return status;
    }
    convert_in_place(r, half);
    r += half;
    n -= half;
  }
  return draw_by_blocks(stream, n, r, lo, hi);
}

template int uniform_integers(rvx_stream, std::int64_t, std::int32_t*, std::int32_t, std::int32_t);
template int uniform_integers(rvx_stream, std::int64_t, std::uint32_t*, std::uint32_t,
                              std::uint32_t);

}  // namespace kestrel::tarn::rng::detail
