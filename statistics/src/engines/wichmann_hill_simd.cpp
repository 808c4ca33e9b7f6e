// SPDX-License-Identifier: Apache-2.0
// Runs of Wichmann-Hill words with SIMD. Lanes hold successive states as doubles, all of whose
// arithmetic here is exact: products of two numbers of 24 bits have 48 bits, and the quotient of
// such a product t by a prime p that does not divide it lies at least 1/p > 2^-24 away from any
// integer, while t * (1/p), rounded twice, lies within 2^24 * 2^-52 = 2^-28 of it. So its floor is
// the floor of the quotient.
#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "engines/wichmann_hill_simd.cpp"
#include <cstring>

#include <hwy/foreach_target.h>  // IWYU pragma: keep
#include <hwy/highway.h>

#include "engines/wichmann_hill.hpp"
#include "simd/target.hpp"

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::wichmann_hill::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET == HWY_SCALAR

void write_words(const generator& g, std::uint32_t state[components], std::size_t n,
                 std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  for (std::size_t i = 0; i < n; ++i) {
    std::uint64_t sum = 0;
    for (int j = 0; j < components; ++j) {
      sum += state[j] * g.reciprocal[j];
      state[j] = product(state[j], g.multiplier[j], g.modulus[j]);
    }
    out[i] = static_cast<std::uint32_t>(sum >> 32);
  }
}

#else

using real = hn::ScalableTag<double>;
using d64 = hn::RebindToUnsigned<real>;
using d32 = hn::Repartition<std::uint32_t, d64>;
using reals = hn::Vec<real>;

constexpr std::size_t lanes = hn::MaxLanes(real());
constexpr std::size_t step = 2 * lanes;  // words of one turn

// R_j in two parts, so that s_j times either is exact, and the sum of four such products, too.
constexpr int low_bits = 26;

struct component {
  reals first, second;  // the states 0..lanes - 1 and lanes..2 lanes - 1 from the next one on
  reals leap;           // a^step mod p
  reals modulus, inverse;
  reals high, low;  // of R
};

// The floor of 0 <= x < 2^24.
HWY_INLINE reals floor_of(reals x) {
#if HWY_TARGET == HWY_SSSE3  // has no instruction for it, and Highway's steps cost five times these
  const hn::Rebind<std::int32_t, real> d_whole;
  return hn::PromoteTo(real(), hn::DemoteTo(d_whole, x));
#else
  return hn::Floor(x);
#endif
}

// a b mod p, from and to 1..p - 1.
HWY_INLINE reals product(const component& c, reals a, reals b) {
  const reals t = hn::Mul(a, b);
  const reals quotient = floor_of(hn::Mul(t, c.inverse));
  return hn::NegMulAdd(quotient, c.modulus, t);
}

HWY_INLINE component prepare(const generator& g, std::uint32_t state, int j) {
  const real d;
  const d64 du;
  const double modulus = g.modulus[j];
  component c;
  c.modulus = hn::Set(d, modulus);
  c.inverse = hn::Set(d, 1 / modulus);
  c.high = hn::Set(d, static_cast<double>(g.reciprocal[j] >> low_bits));
  c.low = hn::Set(d, static_cast<double>(g.reciprocal[j] % (std::uint64_t{1} << low_bits)));
  // Lane i comes to state * a^i by the binary digits of i.
  const auto lane = hn::Iota(du, 0);
  c.first = hn::Set(d, state);
  reals power = hn::Set(d, g.multiplier[j]);
  for (std::size_t bit = 1; bit < lanes; bit *= 2) {
    const auto has_bit = hn::RebindMask(d, hn::TestBit(lane, hn::Set(du, bit)));
    c.first = hn::IfThenElse(has_bit, product(c, c.first, power), c.first);
    power = product(c, power, power);
  }
  c.second = product(c, c.first, power);
  c.leap = product(c, power, power);
  return c;
}

// The words of the first or second states, each in the high half of its lane.
template <reals component::*States>
HWY_INLINE hn::Vec<d64> words(const component (&c)[components]) {
  const real d;
  const d64 du;
  // Sums that begin at 2^52 hold integers below 2^52 in the low bits of their representation. The
  // exponent bits above are 0x433; in the first sum they are shifted out, in the second one they
  // are cancelled by 0x1000 - 0x433 = 0xBCD at the same place of the first.
  reals high = hn::Set(d, 0x1p52 + 0xBCDp0 * 0x1p26);
  reals low = hn::Set(d, 0x1p52);
  for (const component& one : c) {
    high = hn::MulAdd(one.*States, one.high, high);
    low = hn::MulAdd(one.*States, one.low, low);
  }
  return hn::Add(hn::ShiftLeft<low_bits>(hn::BitCast(du, high)), hn::BitCast(du, low));
}

HWY_INLINE hn::Vec<d32> words_of_step(const component (&c)[components]) {
  const d32 d;
  return hn::ConcatOdd(d, hn::BitCast(d, words<&component::second>(c)),
                       hn::BitCast(d, words<&component::first>(c)));
}

void write_words(const generator& g, std::uint32_t state[components], std::size_t n,
                 std::uint32_t* HWY_RESTRICT out) {
  note_simd_target(hwy::TargetName(HWY_TARGET));
  component c[components];
  for (int j = 0; j < components; ++j)
    c[j] = prepare(g, state[j], j);

  for (; n >= step; n -= step, out += step) {
    hn::StoreU(words_of_step(c), d32(), out);
    for (component& one : c) {
      one.first = product(one, one.first, one.leap);
      one.second = product(one, one.second, one.leap);
    }
  }
  if (n != 0) {
    HWY_ALIGN std::uint32_t last[step];
    hn::Store(words_of_step(c), d32(), last);
    std::memcpy(out, last, n * sizeof *out);
  }
  for (int j = 0; j < components; ++j) {
    HWY_ALIGN double states[step];
    hn::Store(c[j].first, real(), states);
    hn::Store(c[j].second, real(), states + lanes);
    state[j] = static_cast<std::uint32_t>(states[n]);
  }
}

#endif

}  // namespace tarn::statistics::wichmann_hill::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace tarn::statistics::wichmann_hill {

HWY_EXPORT(write_words);

void write_words(const generator& g, std::uint32_t state[components], std::size_t n,
                 std::uint32_t* out) {
  TARN_SIMD_CALL(write_words)(g, state, n, out);
}

}  // namespace tarn::statistics::wichmann_hill
#endif
