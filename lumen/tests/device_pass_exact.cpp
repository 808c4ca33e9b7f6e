// SPDX-License-Identifier: Apache-2.0
// The functions that give the same bits on every device: real functions that are exact or rounded
// once, relations, conversions, and everything on integers and vecs.
#include "device_pass.hpp"

namespace {

class device_pass_exact : public on_every_device {};

#define LUMEN_TEST_NAMED(name) LUMEN_TEST_FUNCTION(of_##name, return sycl::name(x);)
#define LUMEN_TEST_NAMED_2(name) LUMEN_TEST_FUNCTION(of_##name, return sycl::name(x, y);)
#define LUMEN_TEST_NAMED_3(name) LUMEN_TEST_FUNCTION(of_##name, return sycl::name(x, y, z);)

LUMEN_TEST_NAMED(ceil)
LUMEN_TEST_NAMED(degrees)
LUMEN_TEST_NAMED(fabs)
LUMEN_TEST_NAMED(floor)
LUMEN_TEST_NAMED(logb)
LUMEN_TEST_NAMED(radians)
LUMEN_TEST_NAMED(rint)
LUMEN_TEST_NAMED(round)
LUMEN_TEST_NAMED(sign)
LUMEN_TEST_NAMED(sqrt)
LUMEN_TEST_NAMED(trunc)
LUMEN_TEST_NAMED_2(copysign)
LUMEN_TEST_NAMED_2(fdim)
LUMEN_TEST_NAMED_2(fmod)
LUMEN_TEST_NAMED_2(nextafter)
LUMEN_TEST_NAMED_2(remainder)
LUMEN_TEST_NAMED_2(step)
LUMEN_TEST_NAMED_3(fma)
LUMEN_TEST_NAMED_3(mad)
LUMEN_TEST_NAMED_3(mix)
LUMEN_TEST_NAMED_3(smoothstep)
LUMEN_TEST_FUNCTION(quotient, return x / y;)
LUMEN_TEST_FUNCTION(product_and_sum, return x * y + z;)
LUMEN_TEST_FUNCTION(of_ldexp,
                    return sycl::ldexp(x, to_ints(sycl::fmin(sycl::fmax(y, V(-99)), V(99))));)
// Of two zeros either may be the greater one, and where one argument is a number it is taken.
LUMEN_TEST_FUNCTION(of_fmax, return sycl::fmax(x, y) + V(0);)
LUMEN_TEST_FUNCTION(of_fmin, return sycl::fmin(x, y) + V(0);)
LUMEN_TEST_FUNCTION(of_maxmag, return sycl::maxmag(x, y) + V(0);)
LUMEN_TEST_FUNCTION(of_minmag, return sycl::minmag(x, y) + V(0);)
LUMEN_TEST_FUNCTION(of_clamp, return sycl::clamp(x, y, z) + V(0);)

// Numbers and second results. ilogb of what has no exponent is not the same everywhere.
LUMEN_TEST_FUNCTION(of_ilogb, return to_reals<V>(sycl::ilogb(sycl::fma(x, x, V(1))));)
LUMEN_TEST_FUNCTION(fraction_of_frexp, {
  typename shape<V>::template of<int> exponent{};
  return sycl::frexp(x, private_to(exponent));
})
LUMEN_TEST_FUNCTION(exponent_of_frexp, {
  typename shape<V>::template of<int> exponent{};
  sycl::frexp(x, private_to(exponent));
  return to_reals<V>(exponent);
})
LUMEN_TEST_FUNCTION(part_of_fract, {
  V floor{};
  return sycl::fract(x, private_to(floor));
})
LUMEN_TEST_FUNCTION(whole_of_fract, {
  V floor{};
  sycl::fract(x, private_to(floor));
  return floor;
})
LUMEN_TEST_FUNCTION(part_of_modf, {
  V whole{};
  return sycl::modf(x, private_to(whole));
})
LUMEN_TEST_FUNCTION(whole_of_modf, {
  V whole{};
  sycl::modf(x, private_to(whole));
  return whole;
})
LUMEN_TEST_FUNCTION(rest_of_remquo, {
  typename shape<V>::template of<int> quotient{};
  return sycl::remquo(x, y, private_to(quotient));
})
// The sign and three bits of the quotient are promised, for finite numbers.
LUMEN_TEST_FUNCTION(quotient_of_remquo, {
  typename shape<V>::template of<int> quotient{};
  const V a = sycl::clamp(x, V(-1000), V(1000));
  sycl::remquo(a, V(3), private_to(quotient));
  return to_reals<V>(quotient % 8);
})
LUMEN_TEST_FUNCTION(sign_of_lgamma_r, {
  typename shape<V>::template of<int> sign{};
  sycl::lgamma_r(x, private_to(sign));
  return to_reals<V>(sign);
})
#define LUMEN_TEST_TRUTH(name) LUMEN_TEST_FUNCTION(of_##name, return truth<V>(sycl::name(x));)
#define LUMEN_TEST_TRUTH_2(name) LUMEN_TEST_FUNCTION(of_##name, return truth<V>(sycl::name(x, y));)
LUMEN_TEST_TRUTH(isfinite)
LUMEN_TEST_TRUTH(isinf)
LUMEN_TEST_TRUTH(isnan)
LUMEN_TEST_TRUTH(isnormal)
LUMEN_TEST_TRUTH(signbit)
LUMEN_TEST_TRUTH_2(isequal)
LUMEN_TEST_TRUTH_2(isgreater)
LUMEN_TEST_TRUTH_2(isgreaterequal)
LUMEN_TEST_TRUTH_2(isless)
LUMEN_TEST_TRUTH_2(islessequal)
LUMEN_TEST_TRUTH_2(islessgreater)
LUMEN_TEST_TRUTH_2(isnotequal)
LUMEN_TEST_TRUTH_2(isordered)
LUMEN_TEST_TRUTH_2(isunordered)
LUMEN_TEST_NAMED_3(bitselect)
LUMEN_TEST_FUNCTION(of_select, return sycl::select(x, y, sycl::isless(y, z));)

// Conversions: x within the range of int, and the bits of x as 64-bit numbers of either sign.
template <sycl::rounding_mode Mode, typename V>
SYCL_EXTERNAL V by_way_of_int(const V& x) {
  return to_reals<V>(shape<V>::template convert<int, Mode>(sycl::clamp(x, V(-1e9), V(1e9))));
}
template <typename Via, sycl::rounding_mode Mode, typename V>
SYCL_EXTERNAL V from_bits(const V& x) {
  using T = typename shape<V>::element;
  using word = std::make_unsigned_t<sycl::detail::mask_of<T>>;
  using words = typename shape<V>::template of<word>;
  const auto wide = shape<words>::template convert<std::uint64_t>(shape<V>::template bits<word>(x));
  const auto spread = wide * std::uint64_t{0x10000000F};
  using wides = typename shape<V>::template of<std::uint64_t>;
  const auto number = shape<wides>::template convert<Via>(spread);
  return shape<typename shape<V>::template of<Via>>::template convert<T, Mode>(number);
}
// The bits of the float, without NaN, whose bits are not the same everywhere. (GCC 12 vectorizes
// the way to float and back to double into nothing.)
template <sycl::rounding_mode Mode, typename V>
SYCL_EXTERNAL V bits_of_float(const V& x) {
  constexpr auto infinity = std::numeric_limits<typename shape<V>::element>::infinity();
  const auto narrow =
      shape<V>::template convert<float, Mode>(sycl::clamp(x, V(-infinity), V(infinity)));
  return to_reals<V>(shape<typename shape<V>::template of<float>>::template bits<int>(narrow));
}
#define LUMEN_TEST_ROUNDINGS(mode)                                                          \
  LUMEN_TEST_FUNCTION(to_int_##mode, return by_way_of_int<sycl::rounding_mode::mode>(x);)   \
  LUMEN_TEST_FUNCTION(to_float_##mode, return bits_of_float<sycl::rounding_mode::mode>(x);) \
  LUMEN_TEST_FUNCTION(from_signed_##mode,                                                   \
                      return from_bits<std::int64_t, sycl::rounding_mode::mode>(x);)        \
  LUMEN_TEST_FUNCTION(from_unsigned_##mode,                                                 \
                      return from_bits<std::uint64_t, sycl::rounding_mode::mode>(x);)
LUMEN_TEST_ROUNDINGS(rte)
LUMEN_TEST_ROUNDINGS(rtz)
LUMEN_TEST_ROUNDINGS(rtp)
LUMEN_TEST_ROUNDINGS(rtn)

// Special values in all pairs, then numbers of all magnitudes.
template <typename T>
arguments<T> reals() {
  using limits = std::numeric_limits<T>;
  const T special[] = {T(0),
                       T(-0.0),
                       T(1),
                       T(-1),
                       T(0.5),
                       T(-2.5),
                       T(3),
                       T(1000.5),
                       T(-7.25),
                       limits::min(),
                       limits::max(),
                       limits::lowest(),
                       limits::denorm_min(),
                       limits::infinity(),
                       -limits::infinity(),
                       limits::quiet_NaN()};
  arguments<T> given;
  for (const T x : special) {
    for (const T y : special) {
      given.add(x, y, special[given.x.size() % 13]);
    }
  }
  const auto xs = lumen_test::spread<T>(-1e6, 1e6, 2000);
  const auto ys = lumen_test::spread<T>(-30, 30, 2000);
  for (std::size_t i = 0; i < xs.size(); ++i) {
    given.add(xs[i], ys[i], ys[xs.size() - 1 - i]);
  }
  return given;
}

template <typename T>
void check_reals(const sycl::queue& q) {
  const arguments<T> given = reals<T>();
  expect_like_host<T, of_ceil, of_degrees, of_fabs, of_floor, of_logb, of_radians, of_rint,
                   of_round, of_sign, of_sqrt, of_trunc, of_copysign, of_fdim, of_nextafter,
                   of_step, of_fma, of_mad, of_mix, of_smoothstep, quotient, product_and_sum,
                   of_ldexp, of_fmax, of_fmin, of_maxmag, of_minmag, of_clamp>(q, given);
  expect_like_host<T, of_fmod, of_remainder, of_ilogb, fraction_of_frexp, exponent_of_frexp,
                   part_of_fract, whole_of_fract, part_of_modf, whole_of_modf, rest_of_remquo,
                   quotient_of_remquo, sign_of_lgamma_r>(q, given);
  expect_like_host<T, of_isfinite, of_isinf, of_isnan, of_isnormal, of_signbit, of_isequal,
                   of_isgreater, of_isgreaterequal, of_isless, of_islessequal, of_islessgreater,
                   of_isnotequal, of_isordered, of_isunordered, of_bitselect, of_select>(q, given);
  expect_like_host<T, to_int_rte, to_int_rtz, to_int_rtp, to_int_rtn, to_float_rte, to_float_rtz,
                   to_float_rtp, to_float_rtn, from_signed_rte, from_signed_rtz, from_signed_rtp,
                   from_signed_rtn, from_unsigned_rte, from_unsigned_rtz, from_unsigned_rtp,
                   from_unsigned_rtn>(q, given);
}

TEST_P(device_pass_exact, real_functions) {
  const sycl::queue q(device());
  check_reals<float>(q);
  check_reals<double>(q);
}

LUMEN_TEST_NAMED(abs)
LUMEN_TEST_NAMED(clz)
LUMEN_TEST_NAMED(ctz)
LUMEN_TEST_NAMED(popcount)
LUMEN_TEST_NAMED_2(abs_diff)
LUMEN_TEST_NAMED_2(add_sat)
LUMEN_TEST_NAMED_2(hadd)
LUMEN_TEST_NAMED_2(max)
LUMEN_TEST_NAMED_2(min)
LUMEN_TEST_NAMED_2(mul_hi)
LUMEN_TEST_NAMED_2(rhadd)
LUMEN_TEST_NAMED_2(rotate)
LUMEN_TEST_NAMED_2(sub_sat)
LUMEN_TEST_NAMED_3(mad_hi)
LUMEN_TEST_NAMED_3(mad_sat)
LUMEN_TEST_NAMED_3(mad24)
LUMEN_TEST_NAMED_2(mul24)
LUMEN_TEST_FUNCTION(integer_clamp, return sycl::clamp(x, sycl::min(y, z), sycl::max(y, z));)
LUMEN_TEST_FUNCTION(of_upsample, {
  using low = std::make_unsigned_t<T>;
  const auto joined = sycl::upsample(x, shape<V>::template convert<low>(y));
  using wide = std::decay_t<decltype(joined)>;
  constexpr int bits = 8 * sizeof(T);
  const auto halves = static_cast<wide>(joined ^ (joined >> bits));
  return shape<wide>::template convert<T>(halves);
})
template <typename T>
void check_integers(const sycl::queue& q) {
  using limits = std::numeric_limits<T>;
  const T ends[] = {limits::min(),        T(limits::min() + 1), T(-1),        T(0), T(1), T(2),
                    T(limits::max() / 2), T(limits::max() - 1), limits::max()};
  arguments<T> given;
  for (const T x : ends) {
    for (const T y : ends) {
      given.add(x, y, ends[given.x.size() % 7]);
    }
  }
  std::uint64_t state = 42;
  const auto next = [&state] {
    state = state * 6364136223846793005U + 1442695040888963407U;
    return static_cast<T>(state >> (state % 48));
  };
  while (given.x.size() < 2000) {
    given.add(next(), next(), next());
  }
  expect_like_host<T, of_abs, of_clz, of_ctz, of_popcount, of_abs_diff, of_add_sat, of_hadd, of_max,
                   of_min, of_mul_hi, of_rhadd, of_rotate, of_sub_sat, of_mad_hi, of_mad_sat,
                   integer_clamp, of_bitselect>(q, given);
  if constexpr (sizeof(T) < 8) {
    expect_like_host<T, of_upsample>(q, given);
  }
  if constexpr (sizeof(T) == 4) {
    expect_like_host<T, of_mul24, of_mad24>(q, given);
  }
}

TEST_P(device_pass_exact, integer_functions) {
  const sycl::queue q(device());
  check_integers<std::int8_t>(q);
  check_integers<std::uint16_t>(q);
  check_integers<std::int32_t>(q);
  check_integers<std::uint32_t>(q);
  check_integers<std::int64_t>(q);
  check_integers<std::uint64_t>(q);
}

LUMEN_ON_EVERY_DEVICE(device_pass_exact);
LUMEN_REPORTS_CUDA(device_pass_exact)

}  // namespace
