// SPDX-License-Identifier: Apache-2.0
// Runs of words of a multiplicative congruential engine with SIMD, once for each target of the
// source that includes this. Lanes hold successive words; a step multiplies all of them by the
// power of the multiplier that leads over the words in flight.
//
// Lanes is a class of
//   group                   as in multiplicative.hpp
//   factor(a)               a vector whose lanes multiply by a
//   multiply(v, f)          the products of words and factors
//   store(v, out)           writes a vector of words
#include <cstddef>
#include <cstdint>
#include <cstring>

#include <hwy/highway.h>

#include "engines/multiplicative.hpp"

#if defined(TARN_MULTIPLICATIVE_SIMD_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_MULTIPLICATIVE_SIMD_HPP
#undef TARN_MULTIPLICATIVE_SIMD_HPP
#else
#define TARN_MULTIPLICATIVE_SIMD_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// n words from x on; returns the word behind them.
template <class Lanes, class Number>
Number write_multiplicative(Number x, Number a, std::size_t n, std::uint32_t* HWY_RESTRICT out) {
#if HWY_TARGET == HWY_SCALAR
  return write_one_by_one<typename Lanes::group>(x, a, n, out);
#else
  using group = typename Lanes::group;
  const hn::ScalableTag<Number> d;
  using vector = hn::Vec<decltype(d)>;
  constexpr std::size_t parts = sizeof(Number) / sizeof *out;
  constexpr std::size_t in_flight = 4;  // vectors, to hide the latency of a multiplication
  const std::size_t words = hn::Lanes(d);

  // Lane j of the first vector gets a^j x: one multiplication for each bit of j.
  vector v[in_flight];
  v[0] = hn::Set(d, x);
  Number power = a;  // a^width, then of the distance between vectors
  for (std::size_t width = 1; width < words; width *= 2) {
    const auto odd = hn::TestBit(hn::Iota(d, 0), hn::Set(d, static_cast<Number>(width)));
    v[0] = Lanes::multiply(v[0], hn::IfThenElse(odd, Lanes::factor(power), Lanes::factor(1)));
    power = group::multiply(power, power);
  }
  for (std::size_t have = 1; have < in_flight; have *= 2) {
    for (std::size_t i = 0; i < have; ++i)
      v[have + i] = Lanes::multiply(v[i], Lanes::factor(power));
    power = group::multiply(power, power);
  }

  const vector step = Lanes::factor(power);
  for (; n >= in_flight * words; n -= in_flight * words, out += in_flight * words * parts) {
    for (std::size_t i = 0; i < in_flight; ++i) {
      Lanes::store(v[i], out + i * words * parts);
      v[i] = Lanes::multiply(v[i], step);
    }
  }
  HWY_ALIGN std::uint32_t rest[in_flight * HWY_MAX_BYTES / sizeof *out];
  for (std::size_t i = 0; i < in_flight; ++i)
    Lanes::store(v[i], rest + i * words * parts);
  std::memcpy(out, rest, n * parts * sizeof *out);
  std::memcpy(&x, rest + n * parts, sizeof x);
  return x;
#endif
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
