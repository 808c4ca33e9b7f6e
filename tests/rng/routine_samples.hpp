// SPDX-License-Identifier: Apache-2.0
// A distribution of each row with parameters of its own, and the routine of the statistics library
// that draws it on the host. Parameters and codes are written here as that library documents them,
// so that a wrong code or two swapped parameters show.
#pragma once

#include <cstdint>
#include <string>
#include <tarn_rvx.h>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

namespace tarn_test {

/// The code of a method by the names of its family and its tag.
inline std::int64_t code_of(const std::string& family, const std::string& method) {
  const bool accurate = method.find("accurate") != std::string::npos;
  std::int64_t code = accurate ? 0x40000000 : 0;
  if (family == "gaussian" || family == "gaussian_mv") {
    code = method == "box_muller" ? 0 : method == "box_muller2" ? 1 : 2;
  } else if (family == "lognormal") {
    code |= method.find("icdf") == 0 ? 1 : 0;
  } else if (family == "poisson") {
    code = method == "ptpe" ? 0 : 1;
  }
  return code;
}

/// make(n): the distribution for n results. draw(code, stream, n, r): the routine; `entry` is its
/// name after the letter of the type.
template <typename Distr>
struct sample;

#define TARN_REAL_SAMPLE(family, name, ...)                                                       \
  template <typename T, typename Method>                                                          \
  struct sample<kestrel::tarn::rng::family<T, Method>> {                                          \
    static constexpr const char* entry =                                                          \
        std::is_same_v<T, float> ? "_rvxsRng" #name : "_rvxdRng" #name;                           \
    static auto make(std::int64_t) { return kestrel::tarn::rng::family<T, Method>(__VA_ARGS__); } \
    static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, T* r) {                 \
      if constexpr (std::is_same_v<T, float>) {                                                   \
        return rvxsRng##name(code, stream, n, r, __VA_ARGS__);                                    \
      } else {                                                                                    \
        return rvxdRng##name(code, stream, n, r, __VA_ARGS__);                                    \
      }                                                                                           \
    }                                                                                             \
  };
TARN_REAL_SAMPLE(gaussian, Gaussian, T(1.5), T(0.25))
TARN_REAL_SAMPLE(lognormal, Lognormal, T(0.5), T(0.25), T(-3), T(2))
TARN_REAL_SAMPLE(exponential, Exponential, T(-1), T(2.5))
TARN_REAL_SAMPLE(gamma, Gamma, T(2.5), T(0.25), T(1.75))
TARN_REAL_SAMPLE(beta, Beta, T(2.5), T(0.75), T(-1), T(3))
TARN_REAL_SAMPLE(chi_square, ChiSquare, 5)
TARN_REAL_SAMPLE(weibull, Weibull, T(1.5), T(-2), T(0.75))
TARN_REAL_SAMPLE(rayleigh, Rayleigh, T(-1), T(2.5))
TARN_REAL_SAMPLE(gumbel, Gumbel, T(-1), T(2.5))
TARN_REAL_SAMPLE(laplace, Laplace, T(-1), T(2.5))
TARN_REAL_SAMPLE(cauchy, Cauchy, T(-1), T(2.5))

#define TARN_INTEGER_SAMPLE(family, name, ...)                                                    \
  template <typename T, typename Method>                                                          \
  struct sample<kestrel::tarn::rng::family<T, Method>> {                                          \
    static constexpr const char* entry = "_rvxiRng" #name;                                        \
    static auto make(std::int64_t) { return kestrel::tarn::rng::family<T, Method>(__VA_ARGS__); } \
    static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, T* r) {                 \
      return rvxiRng##name(code, stream, n, reinterpret_cast<std::int32_t*>(r), __VA_ARGS__);     \
    }                                                                                             \
  };
TARN_INTEGER_SAMPLE(poisson, Poisson, 40.5)
TARN_INTEGER_SAMPLE(binomial, Binomial, 200, 0.3)
TARN_INTEGER_SAMPLE(negative_binomial, Negbinomial, 3.5, 0.4)
TARN_INTEGER_SAMPLE(hypergeometric, Hypergeometric, 500, 200, 150)
TARN_INTEGER_SAMPLE(geometric, Geometric, 0.2)
TARN_INTEGER_SAMPLE(bernoulli, Bernoulli, 0.3)

template <typename T, typename Method>
struct sample<kestrel::tarn::rng::poisson_v<T, Method>> {
  static constexpr const char* entry = "_rvxiRngPoissonV";
  static std::vector<double> rates(std::int64_t n) {
    std::vector<double> all;
    for (std::int64_t i = 0; i < n; ++i) {
      all.push_back(0.5 + static_cast<double>(i % 50));
    }
    return all;
  }
  static auto make(std::int64_t n) { return kestrel::tarn::rng::poisson_v<T, Method>(rates(n)); }
  static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, T* r) {
    return rvxiRngPoissonV(code, stream, n, reinterpret_cast<std::int32_t*>(r), rates(n).data());
  }
};

template <typename T, typename Method>
struct sample<kestrel::tarn::rng::multinomial<T, Method>> {
  static constexpr const char* entry = "_rvxiRngMultinomial";
  static auto make(std::int64_t) {
    return kestrel::tarn::rng::multinomial<T, Method>(30, {0.125, 0.375, 0.5});
  }
  static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, T* r) {
    const double p[] = {0.125, 0.375, 0.5};
    return rvxiRngMultinomial(code, stream, n, reinterpret_cast<std::int32_t*>(r), 30, 3, p);
  }
};

template <typename T, kestrel::tarn::rng::matrix_layout layout, typename Method>
struct sample<kestrel::tarn::rng::gaussian_mv<T, layout, Method>> {
  static constexpr const char* entry =
      std::is_same_v<T, float> ? "_rvxsRngGaussianMV" : "_rvxdRngGaussianMV";
  static std::vector<T> mean() { return {T(-1), T(2)}; }
  static std::vector<T> factor() {
    using kestrel::tarn::rng::matrix_layout;
    if constexpr (layout == matrix_layout::full) {
      return {T(1.5), T(0), T(0.5), T(0.75)};
    } else if constexpr (layout == matrix_layout::packed) {
      return {T(1.5), T(0.5), T(0.75)};
    } else {
      return {T(1.5), T(0.75)};
    }
  }
  static auto make(std::int64_t) {
    return kestrel::tarn::rng::gaussian_mv<T, layout, Method>(2, mean(), factor());
  }
  static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, T* r) {
    constexpr int stored = static_cast<int>(layout);
    if constexpr (std::is_same_v<T, float>) {
      return rvxsRngGaussianMV(code, stream, n, r, 2, stored, mean().data(), factor().data());
    } else {
      return rvxdRngGaussianMV(code, stream, n, r, 2, stored, mean().data(), factor().data());
    }
  }
};

template <typename T, typename Method>
struct sample<kestrel::tarn::rng::uniform<T, Method>> {
  static constexpr bool by_single = std::is_same_v<T, float>;
  static constexpr bool by_integer =
      std::is_same_v<T, std::int32_t> &&
      std::is_same_v<Method, kestrel::tarn::rng::uniform_method::standard>;
  static constexpr const char* entry = by_single    ? "_rvxsRngUniform"
                                       : by_integer ? "_rvxiRngUniform"
                                                    : "_rvxdRngUniform";
  static auto make(std::int64_t) { return kestrel::tarn::rng::uniform<T, Method>(T(3), T(1000)); }
  static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, T* r) {
    if constexpr (by_single) {
      return rvxsRngUniform(code, stream, n, r, 3.0f, 1000.0f);
    } else if constexpr (by_integer) {
      return rvxiRngUniform(code, stream, n, r, 3, 1000);
    } else if constexpr (std::is_same_v<T, double>) {
      return rvxdRngUniform(code, stream, n, r, 3.0, 1000.0);
    } else {  // double uniforms, truncated
      std::vector<double> reals(static_cast<std::size_t>(n));
      const int status = rvxdRngUniform(0, stream, n, reals.data(), 3.0, 1000.0);
      for (const double real : reals) {
        *r++ = static_cast<T>(real);
      }
      return status;
    }
  }
};

template <>
struct sample<kestrel::tarn::rng::bits<std::uint32_t>> {
  static constexpr const char* entry = "_rvxiRngUniformBits";
  static auto make(std::int64_t) { return kestrel::tarn::rng::bits<std::uint32_t>(); }
  static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, std::uint32_t* r) {
    return rvxiRngUniformBits(code, stream, n, r);
  }
};

template <typename T>
struct sample<kestrel::tarn::rng::uniform_bits<T>> {
  static constexpr bool narrow = std::is_same_v<T, std::uint32_t>;
  static constexpr const char* entry = narrow ? "_rvxiRngUniformBits32" : "_rvxiRngUniformBits64";
  static auto make(std::int64_t) { return kestrel::tarn::rng::uniform_bits<T>(); }
  static int draw(std::int64_t code, rvx_stream stream, std::int64_t n, T* r) {
    if constexpr (narrow) {
      return rvxiRngUniformBits32(code, stream, n, r);
    } else {
      return rvxiRngUniformBits64(code, stream, n, r);
    }
  }
};

/// Values of one result.
inline std::int64_t width_of(const std::string& family, std::int64_t engine_code) {
  return family == "gaussian_mv"                             ? 2
         : family == "multinomial"                           ? 3
         : family == "bits" && engine_code == RVX_BRNG_MCG59 ? 2
                                                             : 1;
}

}  // namespace tarn_test
