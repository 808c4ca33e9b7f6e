// SPDX-License-Identifier: Apache-2.0
// The definitions of the entries. The units that include this file take a share of the routines by
// the type of the results: they define TARN_TAKE_<type>(...) as what it is given, or as nothing.
#pragma once

#include <cstdint>

#include "families.hpp"
#include "shapes.hpp"
#include "tarn_rvx_offload.h"

// By address: what Fortran passes.
#define TARN_OFFLOAD_PAIR(name, lower, suffix, lower_suffix, Int, family, value, shape, arguments) \
  int tarn_rvx_##name##_omp_offload_##suffix(                                                      \
      Int method, void* stream, Int n,                                                             \
      value* r TARN_OFFLOAD_APPLY(TARN_BY_VALUE_##shape, value, Int,                               \
                                  TARN_OFFLOAD_NAMES arguments),                                   \
      void* interop) {                                                                             \
    const kestrel::tarn::rng::detail::openmp::call<value> asked{method, stream, n, r, interop};    \
    return kestrel::tarn::rng::detail::openmp::family<value>(                                      \
        asked TARN_OFFLOAD_APPLY(TARN_VALUES_##shape, TARN_OFFLOAD_NAMES arguments));              \
  }                                                                                                \
  int tarn_rvx_##lower##_omp_offload##lower_suffix(                                                \
      const Int* method, void* const* stream, const Int* n,                                        \
      value* r TARN_OFFLOAD_APPLY(TARN_BY_ADDRESS_##shape, value, Int,                             \
                                  TARN_OFFLOAD_NAMES arguments),                                   \
      void* interop) {                                                                             \
    return tarn_rvx_##name##_omp_offload_##suffix(                                                 \
        *method, *stream, *n,                                                                      \
        r TARN_OFFLOAD_APPLY(TARN_CONTENTS_##shape, TARN_OFFLOAD_NAMES arguments), interop);       \
  }

#define TARN_OFFLOAD_ROUTINE(name, lower, family, value, shape, arguments, told)            \
  TARN_TAKE_##value(                                                                        \
      TARN_OFFLOAD_PAIR(name, lower, lp64, _lp64, int32_t, family, value, shape, arguments) \
          TARN_OFFLOAD_PAIR(name, lower, ilp64, , int64_t, family, value, shape, arguments))
#include "routines.def"
