// SPDX-License-Identifier: Apache-2.0
// is_device_copyable (SYCL 2020, section 3.13.1): what kernels may capture.
#pragma once

#include <array>
#include <optional>
#include <tuple>
#include <type_traits>
#include <utility>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

template <typename T>
struct is_device_copyable : std::is_trivially_copyable<T> {};
template <typename T>
inline constexpr bool is_device_copyable_v = is_device_copyable<T>::value;

template <typename T, std::size_t N>
struct is_device_copyable<std::array<T, N>> : is_device_copyable<T> {};
template <typename T>
struct is_device_copyable<std::optional<T>> : is_device_copyable<T> {};
template <typename A, typename B>
struct is_device_copyable<std::pair<A, B>>
    : std::bool_constant<is_device_copyable_v<A> && is_device_copyable_v<B>> {};
template <typename... Types>
struct is_device_copyable<std::tuple<Types...>>
    : std::bool_constant<(is_device_copyable_v<Types> && ...)> {};

LUMEN_NAMESPACE_END
