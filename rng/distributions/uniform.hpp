// SPDX-License-Identifier: Apache-2.0
// uniform, bits and uniform_bits on both roads: the kernel functors, and the routines of the
// statistics library.
#pragma once

#include <cstdint>
#include <limits>
#include <type_traits>

#include <kestrel/tarn/rng/bits.hpp>
#include <kestrel/tarn/rng/continuous.hpp>
#include <sycl/sycl.hpp>

#include "distributions/host_routine.hpp"
#include "distributions/kernel_functor.hpp"
#include "distributions/uniform_integers.hpp"

namespace kestrel::tarn::rng::detail::gpu {

/// Floor of a real as an integer. Rounding may carry a real to an upper bound that the type cannot
/// hold, where a plain conversion would mean something else on each device; it gives the nearest
/// end of the type instead.
template <typename Integer, typename Real>
SYCL_EXTERNAL Integer floor_to_integer(Real x) {
  constexpr Integer least = std::numeric_limits<Integer>::min();
  constexpr Integer greatest = std::numeric_limits<Integer>::max();
  const Real floor = sycl::floor(x);
  if (!(floor > static_cast<Real>(least))) {
    return least;
  }
  // In float the greatest value rounds up to the power of two above it, hence >=.
  return floor >= static_cast<Real>(greatest) ? greatest : static_cast<Integer>(floor);
}

/// Uniform T from reals R on [a, b). Reals are clamped to [a, b] if `accurate` is set; integers
/// ignore it.
template <typename T, typename R>
struct uniform_std {
  using source = R;
  static constexpr drawn asks = drawn::reals;
  static constexpr int results = 4;

  R a;
  R b;
  std::uint8_t accurate;

  real_range<R> range() const { return {a, b}; }

  SYCL_EXTERNAL sycl::vec<T, results> operator()(const sycl::vec<R, 4>& x) const {
    if constexpr (std::is_integral_v<T>) {
      sycl::vec<T, results> out;
      for (int i = 0; i < results; ++i) {
        out[i] = floor_to_integer<T>(x[i]);
      }
      return out;
    } else {
      sycl::vec<T, results> out = x;
      if (accurate != 0) {  // asked once for all four: work-items of a call answer alike
        for (int i = 0; i < results; ++i) {
          out[i] = sycl::fmin(sycl::fmax(x[i], a), b);
        }
      }
      return out;
    }
  }
};

/// Words as they are delivered.
template <drawn what>
struct words_std {
  using source = std::uint32_t;
  static constexpr drawn asks = what;
  static constexpr int results = 4;

  SYCL_EXTERNAL sycl::vec<std::uint32_t, results> operator()(
      const sycl::vec<std::uint32_t, 4>& words) const {
    return words;
  }
};

/// Engine words.
template <typename UIntType>
struct bits_std;
template <>
struct bits_std<std::uint32_t> : words_std<drawn::words> {};

/// Equidistributed words: one word a result, or two with the first in the low half.
template <typename UIntType>
struct uniform_bits_std;

template <>
struct uniform_bits_std<std::uint32_t> : words_std<drawn::bits> {};

template <>
struct uniform_bits_std<std::uint64_t> {
  using source = std::uint32_t;
  static constexpr drawn asks = drawn::bits;
  static constexpr int results = 2;

  SYCL_EXTERNAL sycl::vec<std::uint64_t, results> operator()(
      const sycl::vec<std::uint32_t, 4>& words) const {
    sycl::vec<std::uint64_t, results> out;
    out[0] = std::uint64_t{words[1]} << 32 | words[0];
    out[1] = std::uint64_t{words[3]} << 32 | words[2];
    return out;
  }
};

}  // namespace kestrel::tarn::rng::detail::gpu

namespace kestrel::tarn::rng::detail {

template <typename Method>
inline constexpr bool is_accurate = std::is_same_v<Method, uniform_method::accurate>;

/// The precision that a uniform is drawn in on a device: integers pass through float in the
/// standard method, so they carry float resolution, and through double in the accurate one.
template <typename T, typename Method>
using uniform_real = std::conditional_t<std::is_integral_v<T>,
                                        std::conditional_t<is_accurate<Method>, double, float>, T>;

template <typename T, typename Method>
struct distribution_impl<T, uniform<T, Method>, device_type::gpu> {
  using real = uniform_real<T, Method>;
  using functor = gpu::uniform_std<T, real>;

  explicit distribution_impl(const uniform<T, Method>& distr)
      : kernel{bound(distr.a()), bound(distr.b()), is_accurate<Method>} {}

  functor kernel;

 private:
  /// Unsigned bounds go to double, which holds them exactly, and are rounded once.
  static real bound(T value) {
    return std::is_same_v<T, std::uint32_t> ? static_cast<real>(static_cast<double>(value))
                                            : static_cast<real>(value);
  }
};

template <typename UIntType>
struct distribution_impl<UIntType, bits<UIntType>, device_type::gpu> {
  using functor = gpu::bits_std<UIntType>;
  explicit distribution_impl(const bits<UIntType>&) {}
  functor kernel;
};

template <typename UIntType>
struct distribution_impl<UIntType, uniform_bits<UIntType>, device_type::gpu> {
  using functor = gpu::uniform_bits_std<UIntType>;
  explicit distribution_impl(const uniform_bits<UIntType>&) {}
  functor kernel;
};

template <>
inline constexpr std::int64_t method_code<uniform_method::accurate> =
    RVX_RNG_METHOD_UNIFORM_STD_ACCURATE;

template <typename T, typename Method>
struct distribution_impl<T, uniform<T, Method>, device_type::cpu> {
  const uniform<T, Method>& distr;

  int generate(rvx_stream stream, std::int64_t n, T* r) const {
    constexpr std::int64_t method = method_code<Method>;
    if constexpr (std::is_floating_point_v<T>) {
      return real_routine<T>(rvxsRngUniform, rvxdRngUniform)(method, stream, n, r, distr.a(),
                                                             distr.b());
    } else if constexpr (std::is_same_v<T, std::int32_t> && !is_accurate<Method>) {
      return rvxiRngUniform(method, stream, n, r, distr.a(), distr.b());
    } else {
      return uniform_integers(stream, n, r, distr.a(), distr.b());
    }
  }
};

template <typename UIntType>
struct distribution_impl<UIntType, bits<UIntType>, device_type::cpu> {
  const bits<UIntType>& distr;

  int generate(rvx_stream stream, std::int64_t n, UIntType* r) const {
    return rvxiRngUniformBits(RVX_RNG_METHOD_STANDARD, stream, n, r);
  }
};

template <typename UIntType>
struct distribution_impl<UIntType, uniform_bits<UIntType>, device_type::cpu> {
  const uniform_bits<UIntType>& distr;

  int generate(rvx_stream stream, std::int64_t n, UIntType* r) const {
    if constexpr (std::is_same_v<UIntType, std::uint32_t>) {
      return rvxiRngUniformBits32(RVX_RNG_METHOD_STANDARD, stream, n, r);
    } else {
      return rvxiRngUniformBits64(RVX_RNG_METHOD_STANDARD, stream, n, r);
    }
  }
};

}  // namespace kestrel::tarn::rng::detail
