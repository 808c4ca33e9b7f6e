// SPDX-License-Identifier: Apache-2.0
// bit_cast (SYCL 2020, section 4.17.9): the bits of one value as another type of the same size.
#pragma once

#include <type_traits>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

template <typename To, typename From>
SYCL_EXTERNAL constexpr To bit_cast(const From& from) noexcept {
  static_assert(sizeof(To) == sizeof(From), "bit_cast needs two types of the same size");
  static_assert(std::is_trivially_copyable_v<To> && std::is_trivially_copyable_v<From>,
                "bit_cast needs trivially copyable types");
  return __builtin_bit_cast(To, from);
}

LUMEN_NAMESPACE_END
