// SPDX-License-Identifier: Apache-2.0
// How a family is drawn on the host: by a routine of the statistics library, with the method's
// code.
#pragma once

#include <cstdint>
#include <tarn_rvx.h>
#include <type_traits>

#include "frame/engine_backend.hpp"

namespace kestrel::tarn::rng::detail {

/// The code of a method tag; 0 is that of a family's first or only method.
template <typename Method>
inline constexpr std::int64_t method_code = RVX_RNG_METHOD_STANDARD;

/// The routine of a real family for the result type.
template <typename T, typename Single, typename Double>
constexpr auto real_routine(Single single_precision, Double double_precision) {
  if constexpr (std::is_same_v<T, float>) {
    return single_precision;
  } else {
    return double_precision;
  }
}

}  // namespace kestrel::tarn::rng::detail

/// distribution_impl of family<T, Method> on the host. The call is over before the distribution's
/// owner returns, so it is referred to; the last arguments are the routine's parameters, read from
/// `distr`.
#define TARN_HOST_ROUTINE(family, routine, results, ...)                       \
  template <typename T, typename Method>                                       \
  struct distribution_impl<T, family<T, Method>, device_type::cpu> {           \
    const family<T, Method>& distr;                                            \
                                                                               \
    int generate(rvx_stream stream, std::int64_t n, T* r) const {              \
      return routine(method_code<Method>, stream, n, results(r), __VA_ARGS__); \
    }                                                                          \
  };
#define TARN_REAL_ROUTINE(family, name, ...) \
  TARN_HOST_ROUTINE(family, real_routine<T>(rvxsRng##name, rvxdRng##name), , __VA_ARGS__)
/// Counts fit either integer type, whose values lie alike in memory.
#define TARN_INTEGER_ROUTINE(family, name, ...) \
  TARN_HOST_ROUTINE(family, rvxiRng##name, reinterpret_cast<std::int32_t*>, __VA_ARGS__)
