// SPDX-License-Identifier: Apache-2.0
// Parameters that a routine takes, for each of the list of routines under its name, in the types of
// its arguments; and, for each type, a value that no routine takes.
#pragma once

#include <cstdint>
#include <limits>
#include <tuple>
#include <type_traits>

namespace good {

template <class Real>
inline constexpr Real numbers[] = {Real(0.25), Real(0.75)};

template <class Real, class... Number>
constexpr auto reals(Number... x) {
  return std::make_tuple(static_cast<Real>(x)...);
}

#define TARN_GOOD_REALS(name, ...)                              \
  inline constexpr auto sRng##name = reals<float>(__VA_ARGS__); \
  inline constexpr auto dRng##name = reals<double>(__VA_ARGS__);

TARN_GOOD_REALS(Uniform, -1, 2)
TARN_GOOD_REALS(Gaussian, 0.5, 2)
TARN_GOOD_REALS(Lognormal, 0.5, 2, -1, 3)
TARN_GOOD_REALS(Exponential, -1, 2)
TARN_GOOD_REALS(Gamma, 2.5, -1, 2)
TARN_GOOD_REALS(Beta, 2.5, 1.5, -1, 2)
TARN_GOOD_REALS(Weibull, 2.5, -1, 2)
TARN_GOOD_REALS(Rayleigh, -1, 2)
TARN_GOOD_REALS(Gumbel, -1, 2)
TARN_GOOD_REALS(Laplace, -1, 2)
TARN_GOOD_REALS(Cauchy, -1, 2)
#undef TARN_GOOD_REALS

using int32 = std::int32_t;

inline constexpr std::tuple<int32> sRngChiSquare{5}, dRngChiSquare{5};
// Two dimensions, a diagonal factor.
inline constexpr std::tuple<int32, int32, const float*, const float*> sRngGaussianMV{
    2, 2, numbers<float>, numbers<float>};
inline constexpr std::tuple<int32, int32, const double*, const double*> dRngGaussianMV{
    2, 2, numbers<double>, numbers<double>};
inline constexpr std::tuple<> iRngUniformBits, iRngUniformBits32, iRngUniformBits64;
inline constexpr std::tuple<int32, int32> iRngUniform{0, 6};
inline constexpr std::tuple<double> iRngBernoulli{0.5}, iRngGeometric{0.5}, iRngPoisson{3};
inline constexpr std::tuple<int32, double> iRngBinomial{10, 0.5};
inline constexpr std::tuple<int32, int32, int32> iRngHypergeometric{10, 5, 5};
inline constexpr std::tuple<double, double> iRngNegbinomial{2.5, 0.5};
inline constexpr std::tuple<int32, int32, const double*> iRngMultinomial{5, 2, numbers<double>};

}  // namespace good

namespace bad {

template <class Parameter>
constexpr Parameter value() {
  if constexpr (std::is_pointer_v<Parameter>)
    return nullptr;
  else if constexpr (std::is_integral_v<Parameter>)
    return std::numeric_limits<Parameter>::min();
  else
    return std::numeric_limits<Parameter>::quiet_NaN();
}

}  // namespace bad
