// SPDX-License-Identifier: Apache-2.0
// Logarithms, exponentials, and sine with cosine, for kernels that spend most of their time in
// them: up to three times as fast as the calls of vector_math-inl.hpp, since nothing has to be
// saved around them and the arguments are bounded. One rounding per operation, hence the same bits
// on every SIMD target. For sources that are compiled once per target: include after
// <hwy/highway.h>, inside no namespace.
//
// Arguments are reduced by Cody and Waite's way (Software Manual for the Elementary Functions,
// 1980): a multiple k of ln 2 or pi/2 is taken away in parts so short that their products with k
// are exact. What is left goes into a power series, cut off where what is lost is below a quarter
// unit in the last place: Taylor's, or economized, which has fewer terms. Kernels wait for these
// chains of steps more than they compute, so that a term less gains more than its two operations.
#include <array>
#include <cstddef>
#include <cstdint>
#include <type_traits>

#if defined(TARN_INLINE_MATH_INL_HPP) == defined(HWY_TARGET_TOGGLE)
#ifdef TARN_INLINE_MATH_INL_HPP
#undef TARN_INLINE_MATH_INL_HPP
#else
#define TARN_INLINE_MATH_INL_HPP
#endif

HWY_BEFORE_NAMESPACE();
namespace tarn::statistics::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

template <class Real>
struct math_constants;

template <>
struct math_constants<float> {
  static constexpr float to_integer = 0x1.8p23f;  // added, it leaves the nearest integer below
  static constexpr int mantissa_bits = 23, exponent_bias = 127;
  // exp is 0 below the first and infinite from the second on.
  static constexpr float exp_least = -104, exp_greatest = 89;
  static constexpr std::array<float, 2> ln_2{0x1.62e4p-1f, 0x1.7f7d1cp-20f};
  static constexpr std::array<float, 3> half_pi{0x1.921fap0f, 0x1.54442p-20f, 0x1.a308d4p-41f};
  static constexpr int exp_terms = 8, exp2_terms = 7, sin_terms = 4, cos_terms = 5, log_terms = 4;
  // The bits of sqrt(1/2) and of the number whose unit in the last place is 1.
  static constexpr std::uint32_t root_half = 0x3f3504f3, unit_one = 0x4b000000;
};

template <>
struct math_constants<double> {
  static constexpr double to_integer = 0x1.8p52;
  static constexpr int mantissa_bits = 52, exponent_bias = 1023;
  static constexpr double exp_least = -746, exp_greatest = 710;
  static constexpr std::array<double, 2> ln_2{0x1.62e42fefa3p-1, 0x1.3de6af278ece6p-42};
  static constexpr std::array<double, 3> half_pi{0x1.921fb54442d1p0, 0x1.08d313198a2ep-49,
                                                 0x1.b839a252049c1p-104};
  static constexpr int exp_terms = 14, exp2_terms = 12, sin_terms = 7, cos_terms = 8, log_terms = 8;
  static constexpr std::uint64_t root_half = 0x3fe6a09e667f3bcd, unit_one = 0x4330000000000000;
};

// 1 / n! of the series of a function: of exp, or of every second term with changing signs.
template <class Real>
constexpr Real reciprocal_factorial(int n) {
  double factorial = 1;  // exact up to 22!
  for (int i = 2; i <= n; ++i)
    factorial *= i;
  return static_cast<Real>(1 / factorial);
}

// The first `Terms` coefficients of a power series for |x| <= reach. Lanczos' economization
// (Applied Analysis, 1956): from its far end on each term a x^n is replaced by its difference from
// a reach^n 2^(1-n) T_n(x / reach), T_n Chebyshev's polynomial, whose powers are n - 2, n - 4, ...;
// what is lost is no more than that factor. 23 terms stand for all: 22! is the greatest exact one.
template <std::size_t Terms, class Coefficient>
constexpr std::array<double, Terms> economized(double reach, const Coefficient& coefficient) {
  constexpr int all = 23;
  double c[all] = {};
  for (int n = 0; n < all; ++n)
    c[n] = coefficient(n);
  for (int n = all - 1; n >= static_cast<int>(Terms); --n) {
    double term = c[n];
    for (int j = 1; 2 * j <= n; ++j) {
      term *= -(n - 2 * j + 2) * (n - 2 * j + 1) / (4.0 * j * (n - j)) * reach * reach;
      c[n - 2 * j] -= term;
    }
  }
  std::array<double, Terms> first{};
  for (std::size_t n = 0; n < Terms; ++n)
    first[n] = c[n];
  return first;
}

// The series of 2^x for |x| <= 1/2, of sine and cosine for |x| <= pi/4, of 2 artanh(x) for the x
// that a mantissa of [sqrt(1/2), sqrt(2)] gives, and of (2 artanh(x) - 2 x) / x^2.
constexpr double exp2_term(int n) {
  double term = 1;
  for (int i = 1; i <= n; ++i)
    term *= 0.69314718055994530942 / i;
  return term;
}
constexpr double sine_term(int n) {
  return n % 2 == 0 ? 0 : (n % 4 == 1 ? 1 : -1) * reciprocal_factorial<double>(n);
}
constexpr double cosine_term(int n) {
  return n % 2 != 0 ? 0 : (n % 4 == 0 ? 1 : -1) * reciprocal_factorial<double>(n);
}
constexpr double log_term(int n) {
  return n % 2 == 0 ? 0 : 2.0 / n;
}
constexpr double log_tail_term(int n) {
  return log_term(n + 2);
}
template <class Real>
struct math_series {
  using constants = math_constants<Real>;
  static constexpr auto exp2 = economized<constants::exp2_terms>(0.5, exp2_term);
  static constexpr auto sine = economized<2 * constants::sin_terms>(0.7854, sine_term);
  static constexpr auto cosine = economized<2 * constants::cos_terms - 1>(0.7854, cosine_term);
  static constexpr auto log = economized<2 * constants::log_terms>(0.1716, log_term);
  static constexpr auto log_tail = economized<2 * constants::log_terms - 2>(0.1716, log_tail_term);
};

// The sum of coefficient(n) x^(n - first) over `terms` numbers n from `first` on, by Estrin's
// scheme: halves that do not wait for each other. powers[i] is x^(2^i).
template <int first, int terms, class D, class Powers, class Coefficient>
HWY_INLINE hn::Vec<D> partial_series(D d, const Powers& powers, const Coefficient& coefficient) {
  if constexpr (terms == 1) {
    return hn::Set(d, coefficient(first));
  } else {
    constexpr int half_bits = terms > 8 ? 3 : terms > 4 ? 2 : terms > 2 ? 1 : 0;
    constexpr int half = 1 << half_bits;
    const auto low = partial_series<first, half>(d, powers, coefficient);
    const auto high = partial_series<first + half, terms - half>(d, powers, coefficient);
    return hn::Add(low, hn::Mul(high, powers[half_bits]));
  }
}

template <int terms, class D, class Coefficient>
HWY_INLINE hn::Vec<D> power_series(D d, hn::Vec<D> x, const Coefficient& coefficient) {
  static_assert(terms <= 16);
  const auto square = hn::Mul(x, x), fourth = hn::Mul(square, square);
  const hn::Vec<D> powers[4] = {x, square, fourth, hn::Mul(fourth, fourth)};
  return partial_series<0, terms>(d, powers, coefficient);
}

// exp(x) for all x that are numbers, infinite ones too. Error below 1 unit in the last place.
template <class D>
HWY_INLINE hn::Vec<D> inline_exp(D d, hn::Vec<D> number) {
  using real = hn::TFromD<D>;
  using constants = math_constants<real>;
  const hn::RebindToSigned<D> di;
  const auto x = hn::Min(hn::Max(number, hn::Set(d, constants::exp_least)),
                         hn::Set(d, constants::exp_greatest));
  const auto to_integer = hn::Set(d, constants::to_integer);
  const auto shifted =
      hn::Add(hn::Mul(x, hn::Set(d, static_cast<real>(1.44269504088896340736))), to_integer);
  const auto k = hn::Sub(shifted, to_integer);
  const auto r = hn::Sub(hn::Sub(x, hn::Mul(k, hn::Set(d, constants::ln_2[0]))),
                         hn::Mul(k, hn::Set(d, constants::ln_2[1])));
  const auto tail = power_series<constants::exp_terms - 2>(
      d, r, [](int n) { return reciprocal_factorial<real>(n + 2); });
  const auto e = hn::Add(hn::Set(d, 1), hn::Add(r, hn::Mul(hn::Mul(r, r), tail)));

  // 2^k in two factors, so that subnormal results are reached and the greatest one is.
  const auto power = hn::Sub(hn::BitCast(di, shifted), hn::BitCast(di, to_integer));
  const auto half = hn::ShiftRight<1>(power);
  const auto power_of_2 = [&](auto exponent) {
    const auto biased = hn::Add(exponent, hn::Set(di, constants::exponent_bias));
    return hn::BitCast(d, hn::ShiftLeft<constants::mantissa_bits>(biased));
  };
  return hn::Mul(hn::Mul(e, power_of_2(half)), power_of_2(hn::Sub(power, half)));
}

// 2^x for all x that are numbers, infinite ones too; 0 below the least normal number. Error below 2
// units in the last place.
template <class D>
HWY_INLINE hn::Vec<D> inline_exp2(D d, hn::Vec<D> number) {
  using real = hn::TFromD<D>;
  using constants = math_constants<real>;
  const hn::RebindToUnsigned<D> du;
  // The exponents 0 and all ones, next to those of normal numbers, make 0 and infinity.
  constexpr real bias = constants::exponent_bias;
  const auto x = hn::Min(hn::Max(number, hn::Set(d, -bias)), hn::Set(d, bias + 1));
  const auto to_exponent = hn::Set(d, constants::to_integer + bias);
  const auto shifted = hn::Add(x, to_exponent);
  const auto r = hn::Sub(x, hn::Sub(shifted, to_exponent));
  const auto series = power_series<constants::exp2_terms>(
      d, r, [](int n) { return static_cast<real>(math_series<real>::exp2[n]); });
  const auto power = hn::ShiftLeft<constants::mantissa_bits>(hn::BitCast(du, shifted));
  return hn::Mul(series, hn::BitCast(d, power));
}

enum class base { e, two };

// The logarithm of a positive normal number, x = 2^k m with m of [sqrt(1/2), sqrt(2)]: k, and
// 2 artanh(s), s = (m - 1) / (m + 1), whose series converges as fast as s^2 <= 0.03. To base e the
// first term 2 s is written as f - s f with f = m - 1, which is exact, so that the rounding of s
// counts only a sixth: error below 1.2 units of 2^-23 or 2^-52 of the result (1.03 seen); to base 2
// below 2.5.
template <base Base, class D>
HWY_INLINE hn::Vec<D> inline_log(D d, hn::Vec<D> x) {
  using real = hn::TFromD<D>;
  using constants = math_constants<real>;
  const hn::RebindToUnsigned<D> du;
  using bits = hn::TFromD<decltype(du)>;
  constexpr int mantissa_bits = constants::mantissa_bits;
  constexpr bits mantissa = (bits{1} << mantissa_bits) - 1;
  constexpr bits one = bits{constants::exponent_bias} << mantissa_bits;

  const auto raised = hn::Add(hn::BitCast(du, x), hn::Set(du, one - constants::root_half));
  const auto biased =
      hn::Or(hn::ShiftRight<mantissa_bits>(raised), hn::Set(du, constants::unit_one));
  const auto k =
      hn::Sub(hn::BitCast(d, biased), hn::Set(d, static_cast<real>(bits{1} << mantissa_bits) +
                                                     static_cast<real>(constants::exponent_bias)));
  const auto m = hn::BitCast(
      d, hn::Add(hn::And(raised, hn::Set(du, mantissa)), hn::Set(du, constants::root_half)));
  const auto f = hn::Sub(m, hn::Set(d, 1));
  const auto s = hn::Div(f, hn::Add(m, hn::Set(d, 1)));
  const auto square = hn::Mul(s, s);
  if constexpr (Base == base::two) {
    const auto series = power_series<constants::log_terms>(d, square, [](int n) {
      return static_cast<real>(1.44269504088896340736 * math_series<real>::log[2 * n + 1]);
    });
    return hn::Add(k, hn::Mul(s, series));
  } else {
    const auto tail = power_series<constants::log_terms - 1>(
        d, square, [](int n) { return static_cast<real>(math_series<real>::log_tail[2 * n + 1]); });
    const auto log_m = hn::Sub(f, hn::Mul(s, hn::Sub(f, hn::Mul(square, tail))));
    return hn::Add(hn::Mul(k, hn::Set(d, static_cast<real>(0.69314718055994530942))), log_m);
  }
}

template <class D>
struct sine_and_cosine {
  hn::Vec<D> sine, cosine;
};

// Of t in [0, 2 pi]; errors below 1.5 units in the last place.
template <class D>
HWY_INLINE sine_and_cosine<D> inline_sincos(D d, hn::Vec<D> t) {
  using real = hn::TFromD<D>;
  using constants = math_constants<real>;
  const hn::RebindToSigned<D> di;
  const auto to_integer = hn::Set(d, constants::to_integer);
  const auto shifted =
      hn::Add(hn::Mul(t, hn::Set(d, static_cast<real>(0.63661977236758134308))), to_integer);
  const auto k = hn::Sub(shifted, to_integer);
  auto r = t;
  for (const real part : constants::half_pi)
    r = hn::Sub(r, hn::Mul(k, hn::Set(d, part)));

  const auto square = hn::Mul(r, r);
  // Both without their first term, which is added last.
  const auto sine_tail = power_series<constants::sin_terms - 1>(
      d, square, [](int n) { return static_cast<real>(math_series<real>::sine[2 * n + 3]); });
  const auto cosine_tail = power_series<constants::cos_terms - 1>(
      d, square, [](int n) { return static_cast<real>(math_series<real>::cosine[2 * n + 2]); });
  const auto sine = hn::Add(r, hn::Mul(hn::Mul(r, square), sine_tail));
  const auto cosine = hn::Add(hn::Set(d, 1), hn::Mul(square, cosine_tail));

  // A quarter turn k changes the two functions; bit 1 of k, and of k + 1, is their sign.
  const auto quarter = hn::BitCast(di, shifted);
  const auto one = hn::Set(di, 1);
  const auto odd = hn::RebindMask(d, hn::Eq(hn::And(quarter, one), one));
  const auto signed_by = [&](auto bits, auto value) {
    const auto sign = hn::ShiftLeft<8 * sizeof(real) - 2>(hn::AndNot(one, bits));
    return hn::Xor(value, hn::BitCast(d, sign));
  };
  // The shift leaves bit 1 alone as the sign: higher ones fall out at the top, bit 0 is cleared.
  return {signed_by(quarter, hn::IfThenElse(odd, cosine, sine)),
          signed_by(hn::Add(quarter, one), hn::IfThenElse(odd, sine, cosine))};
}

}  // namespace tarn::statistics::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif  // per target
