// SPDX-License-Identifier: Apache-2.0
// The function objects of SYCL 2020, section 4.17.2. Without a type argument each takes any
// operands, as those of the C++ standard library do.
#pragma once

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

#define LUMEN_FUNCTION_OBJECT(name, ...)                                 \
  template <typename T = void>                                           \
  struct name {                                                          \
    SYCL_EXTERNAL constexpr T operator()(const T& x, const T& y) const { \
      return static_cast<T>(__VA_ARGS__);                                \
    }                                                                    \
  };                                                                     \
  template <>                                                            \
  struct name<void> {                                                    \
    using is_transparent = void;                                         \
    template <typename T, typename U>                                    \
    SYCL_EXTERNAL constexpr auto operator()(T&& x, U&& y) const {        \
      return __VA_ARGS__;                                                \
    }                                                                    \
  };

LUMEN_FUNCTION_OBJECT(plus, x + y)
LUMEN_FUNCTION_OBJECT(multiplies, (x * y))
LUMEN_FUNCTION_OBJECT(bit_and, (x & y))
LUMEN_FUNCTION_OBJECT(bit_or, x | y)
LUMEN_FUNCTION_OBJECT(bit_xor, x ^ y)
LUMEN_FUNCTION_OBJECT(logical_and, (x && y))
LUMEN_FUNCTION_OBJECT(logical_or, x || y)
LUMEN_FUNCTION_OBJECT(minimum, y < x ? y : x)
LUMEN_FUNCTION_OBJECT(maximum, x < y ? y : x)
#undef LUMEN_FUNCTION_OBJECT

LUMEN_NAMESPACE_END
