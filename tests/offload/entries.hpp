// SPDX-License-Identifier: Apache-2.0
// The four entries of each offload routine: offload::vsUniform::each(visit) calls
// visit(form, entry) for each of them, offload::vsUniform::wide takes values with 64-bit integers,
// offload::Uniform<float> is vsUniform.
#pragma once

#include <cstdint>
#include <tarn_rvx_offload.h>
#include <type_traits>

namespace tarn_test::offload {

#define TARN_ENTRIES(letters, Value, name, lower)                                    \
  struct letters##name {                                                             \
    using value = Value;                                                             \
    static constexpr const char* routine = #letters "Rng" #name;                     \
    static constexpr auto wide = &tarn_rvx_##letters##Rng##name##_omp_offload_ilp64; \
    template <typename Visit>                                                        \
    static void each(const Visit& visit) {                                           \
      visit("lp64", &tarn_rvx_##letters##Rng##name##_omp_offload_lp64);              \
      visit("ilp64", &tarn_rvx_##letters##Rng##name##_omp_offload_ilp64);            \
      visit("lp64, by address", &tarn_rvx_##letters##lower##_omp_offload_lp64);      \
      visit("ilp64, by address", &tarn_rvx_##letters##lower##_omp_offload);          \
    }                                                                                \
  };

#define TARN_REAL_ENTRIES(name, lower)  \
  TARN_ENTRIES(vs, float, name, lower)  \
  TARN_ENTRIES(vd, double, name, lower) \
  template <typename Real>              \
  using name = std::conditional_t<std::is_same_v<Real, float>, vs##name, vd##name>;

TARN_REAL_ENTRIES(Uniform, rnguniform)
TARN_REAL_ENTRIES(Gaussian, rnggaussian)
TARN_REAL_ENTRIES(GaussianMV, rnggaussianmv)
TARN_REAL_ENTRIES(Lognormal, rnglognormal)
TARN_REAL_ENTRIES(Exponential, rngexponential)
TARN_REAL_ENTRIES(Gamma, rnggamma)
TARN_REAL_ENTRIES(Beta, rngbeta)
TARN_REAL_ENTRIES(ChiSquare, rngchisquare)
TARN_REAL_ENTRIES(Weibull, rngweibull)
TARN_REAL_ENTRIES(Rayleigh, rngrayleigh)
TARN_REAL_ENTRIES(Gumbel, rnggumbel)
TARN_REAL_ENTRIES(Laplace, rnglaplace)
TARN_REAL_ENTRIES(Cauchy, rngcauchy)
TARN_ENTRIES(vi, std::int32_t, Uniform, rnguniform)
TARN_ENTRIES(vi, std::uint32_t, UniformBits, rnguniformbits)
TARN_ENTRIES(vi, std::uint32_t, UniformBits32, rnguniformbits32)
TARN_ENTRIES(vi, std::uint64_t, UniformBits64, rnguniformbits64)
TARN_ENTRIES(vi, std::int32_t, Bernoulli, rngbernoulli)
TARN_ENTRIES(vi, std::int32_t, Binomial, rngbinomial)
TARN_ENTRIES(vi, std::int32_t, Geometric, rnggeometric)
TARN_ENTRIES(vi, std::int32_t, Hypergeometric, rnghypergeometric)
TARN_ENTRIES(vi, std::int32_t, Multinomial, rngmultinomial)
TARN_ENTRIES(vi, std::int32_t, Negbinomial, rngnegbinomial)
TARN_ENTRIES(vi, std::int32_t, Poisson, rngpoisson)
TARN_ENTRIES(vi, std::int32_t, PoissonV, rngpoissonv)
#undef TARN_REAL_ENTRIES
#undef TARN_ENTRIES

}  // namespace tarn_test::offload
