// SPDX-License-Identifier: Apache-2.0
// Compile-time checks of the arguments of distribution templates.
#pragma once

#include <cstdint>
#include <type_traits>

namespace kestrel::tarn::rng::detail {

template <typename Type, typename... Offered>
inline constexpr bool is_one_of = (std::is_same_v<Type, Offered> || ...);

template <typename Type>
inline constexpr bool is_real_result = is_one_of<Type, float, double>;

template <typename Type>
inline constexpr bool is_integer_result = is_one_of<Type, std::int32_t, std::uint32_t>;

}  // namespace kestrel::tarn::rng::detail
