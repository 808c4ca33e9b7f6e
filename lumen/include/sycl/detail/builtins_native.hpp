// SPDX-License-Identifier: Apache-2.0
// The native and half-precision functions of SYCL 2020, section 4.17.5: float only. The host has
// no faster forms, and GPUs are not to differ from it by more than they must, so that these are
// the full ones in both namespaces.
#pragma once

#include "builtins_lift.hpp"
#include "builtins_math.hpp"
#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

#define LUMEN_FLOAT_1(name, ...)           \
  LUMEN_SCALAR_1(float, name, __VA_ARGS__) \
  LUMEN_LIFT_1(float_vec, name)
#define LUMEN_FLOAT_2(name, ...)           \
  LUMEN_SCALAR_2(float, name, __VA_ARGS__) \
  LUMEN_LIFT_2(float_vec, name)

#define LUMEN_REDUCED_PRECISION         \
  LUMEN_FLOAT_1(cos, sycl::cos(x))      \
  LUMEN_FLOAT_2(divide, x / y)          \
  LUMEN_FLOAT_1(exp, sycl::exp(x))      \
  LUMEN_FLOAT_1(exp2, sycl::exp2(x))    \
  LUMEN_FLOAT_1(exp10, sycl::exp10(x))  \
  LUMEN_FLOAT_1(log, sycl::log(x))      \
  LUMEN_FLOAT_1(log2, sycl::log2(x))    \
  LUMEN_FLOAT_1(log10, sycl::log10(x))  \
  LUMEN_FLOAT_2(powr, sycl::powr(x, y)) \
  LUMEN_FLOAT_1(recip, 1.0F / x)        \
  LUMEN_FLOAT_1(rsqrt, sycl::rsqrt(x))  \
  LUMEN_FLOAT_1(sin, sycl::sin(x))      \
  LUMEN_FLOAT_1(sqrt, sycl::sqrt(x))    \
  LUMEN_FLOAT_1(tan, sycl::tan(x))

namespace native {
LUMEN_REDUCED_PRECISION
}
namespace half_precision {
LUMEN_REDUCED_PRECISION
}

#undef LUMEN_REDUCED_PRECISION
#undef LUMEN_FLOAT_1
#undef LUMEN_FLOAT_2

LUMEN_NAMESPACE_END
