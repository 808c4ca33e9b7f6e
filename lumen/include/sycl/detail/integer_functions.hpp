// SPDX-License-Identifier: Apache-2.0
// Scalar integer functions that need care for overflow. Everything that may wrap is computed in
// unsigned arithmetic; nothing needs a type wider than 64 bits.
#pragma once

#include <climits>
#include <cstdint>
#include <limits>
#include <type_traits>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

template <typename T>
inline constexpr int bits_of = static_cast<int>(sizeof(T) * CHAR_BIT);

template <typename T>
using unsigned_of = std::make_unsigned_t<T>;

// At least as wide as int, so that promotion changes nothing, and unsigned, so that it wraps.
template <typename T>
using wrapping = std::conditional_t<(sizeof(T) < sizeof(unsigned)), unsigned, unsigned_of<T>>;

// The 64-bit type of T's signedness.
template <typename T>
using widest = std::conditional_t<std::is_signed_v<T>, std::int64_t, std::uint64_t>;

// Without a comparison that no unsigned value meets, which compilers warn about.
template <typename T>
SYCL_EXTERNAL constexpr bool is_negative([[maybe_unused]] T x) {
  if constexpr (std::is_signed_v<T>) {
    return x < 0;
  } else {
    return false;
  }
}

template <typename T>
SYCL_EXTERNAL constexpr T wrapping_add(T x, T y) {
  return static_cast<T>(static_cast<wrapping<T>>(x) + static_cast<wrapping<T>>(y));
}
template <typename T>
SYCL_EXTERNAL constexpr T wrapping_subtract(T x, T y) {
  return static_cast<T>(static_cast<wrapping<T>>(x) - static_cast<wrapping<T>>(y));
}
template <typename T>
SYCL_EXTERNAL constexpr T wrapping_multiply(T x, T y) {
  return static_cast<T>(static_cast<wrapping<T>>(x) * static_cast<wrapping<T>>(y));
}

template <typename T>
SYCL_EXTERNAL constexpr T add_saturated(T x, T y) {
  constexpr T highest = std::numeric_limits<T>::max();
  constexpr T lowest = std::numeric_limits<T>::min();
  if (!is_negative(y)) {
    return x > highest - y ? highest : static_cast<T>(x + y);
  }
  return x < lowest - y ? lowest : static_cast<T>(x + y);
}

template <typename T>
SYCL_EXTERNAL constexpr T subtract_saturated(T x, T y) {
  constexpr T highest = std::numeric_limits<T>::max();
  constexpr T lowest = std::numeric_limits<T>::min();
  if (!is_negative(y)) {
    return x < lowest + y ? lowest : static_cast<T>(x - y);
  }
  return x > highest + y ? highest : static_cast<T>(x - y);
}

// (x + y) / 2 rounded down and up: the bits that both share, and half of those that differ.
template <typename T>
SYCL_EXTERNAL constexpr T mean_down(T x, T y) {
  return static_cast<T>((x & y) + ((x ^ y) >> 1));
}
template <typename T>
SYCL_EXTERNAL constexpr T mean_up(T x, T y) {
  return static_cast<T>((x | y) - ((x ^ y) >> 1));
}

// The upper half of the double-width product.
template <typename T>
SYCL_EXTERNAL constexpr T multiply_high(T x, T y) {
  if constexpr (sizeof(T) < 8) {
    return static_cast<T>((static_cast<widest<T>>(x) * static_cast<widest<T>>(y)) >> bits_of<T>);
  } else {
#if defined(__CUDA_ARCH__)
    if (!__builtin_is_constant_evaluated()) {
      if constexpr (std::is_signed_v<T>) {
        return __mul64hi(x, y);
      } else {
        return __umul64hi(x, y);
      }
    }
#endif
    // Schoolbook on 32-bit digits; the upper digits keep the sign, and the shifts with it.
    const auto x_low = static_cast<std::uint64_t>(x) & 0xFFFFFFFFU;
    const auto y_low = static_cast<std::uint64_t>(y) & 0xFFFFFFFFU;
    const T x_high = x >> 32;
    const T y_high = y >> 32;
    const std::uint64_t lowest = x_low * y_low;
    const T first = static_cast<T>(x_high * static_cast<T>(y_low)) + static_cast<T>(lowest >> 32);
    const T second = static_cast<T>(x_low) * y_high +
                     static_cast<T>(static_cast<std::uint64_t>(first) & 0xFFFFFFFFU);
    return x_high * y_high + (first >> 32) + (second >> 32);
  }
}

// x * y + z clamped to the range of T.
template <typename T>
SYCL_EXTERNAL constexpr T multiply_add_saturated(T x, T y, T z) {
  constexpr T highest = std::numeric_limits<T>::max();
  constexpr T lowest = std::numeric_limits<T>::min();
  if constexpr (sizeof(T) < 8) {
    const auto exact =
        static_cast<widest<T>>(x) * static_cast<widest<T>>(y) + static_cast<widest<T>>(z);
    if constexpr (std::is_signed_v<T>) {
      if (exact < static_cast<widest<T>>(lowest)) {
        return lowest;
      }
    }
    return exact > static_cast<widest<T>>(highest) ? highest : static_cast<T>(exact);
  } else {
    // The 128-bit sum as two words; it fits if the upper one only extends the sign of the lower.
    const T low = wrapping_multiply(x, y);
    const T sum = wrapping_add(low, z);
    T high = multiply_high(x, y);
    if constexpr (std::is_signed_v<T>) {
      high += is_negative(z) ? T(-1) : T(0);
    }
    high += static_cast<std::uint64_t>(sum) < static_cast<std::uint64_t>(low) ? T(1) : T(0);
    const T fitting = is_negative(sum) ? static_cast<T>(-1) : T(0);
    return high == fitting ? sum : is_negative(high) ? lowest : highest;
  }
}

// Rotates to the left by y modulo the number of bits.
template <typename T>
SYCL_EXTERNAL constexpr T rotate_left(T x, T y) {
  constexpr int bits = bits_of<T>;
  const auto value = static_cast<unsigned_of<T>>(x);
  const int shift = static_cast<int>(static_cast<unsigned_of<T>>(y) % bits);
  return shift == 0 ? x : static_cast<T>((value << shift) | (value >> (bits - shift)));
}

// The built-ins are those of the compiler for 32 and 64 bits, which nvcc has for GPUs as well,
// apart from that for trailing zeros.
template <typename T>
SYCL_EXTERNAL constexpr T leading_zeros(T x) {
  const auto value = static_cast<unsigned_of<T>>(x);
  if (value == 0) {
    return static_cast<T>(bits_of<T>);
  }
  if constexpr (sizeof(T) < 8) {
    return static_cast<T>(__builtin_clz(value) - (32 - bits_of<T>));
  } else {
    return static_cast<T>(__builtin_clzll(value));
  }
}
template <typename T>
SYCL_EXTERNAL constexpr T trailing_zeros(T x) {
  const wrapping<T> value = static_cast<unsigned_of<T>>(x);
  if (value == 0) {
    return static_cast<T>(bits_of<T>);
  }
  const auto lowest_one = static_cast<T>(value & (0 - value));
  return static_cast<T>(bits_of<T> - 1 - leading_zeros(lowest_one));
}
template <typename T>
SYCL_EXTERNAL constexpr T count_ones(T x) {
  const auto value = static_cast<unsigned_of<T>>(x);
  if constexpr (sizeof(T) < 8) {
    return static_cast<T>(__builtin_popcount(value));
  } else {
    return static_cast<T>(__builtin_popcountll(value));
  }
}

// The integer of twice the width and the signedness of High.
template <typename High>
struct wider {};
#define LUMEN_WIDER(bits, twice)       \
  template <>                          \
  struct wider<std::int##bits##_t> {   \
    using type = std::int##twice##_t;  \
  };                                   \
  template <>                          \
  struct wider<std::uint##bits##_t> {  \
    using type = std::uint##twice##_t; \
  };
LUMEN_WIDER(8, 16)
LUMEN_WIDER(16, 32)
LUMEN_WIDER(32, 64)
#undef LUMEN_WIDER

template <typename T>
SYCL_EXTERNAL constexpr typename wider<T>::type join_halves(T high, unsigned_of<T> low) {
  using result = typename wider<T>::type;
  const auto upper = static_cast<unsigned_of<result>>(static_cast<unsigned_of<T>>(high));
  return static_cast<result>((upper << bits_of<T>) | low);
}

}  // namespace detail

LUMEN_NAMESPACE_END
