// SPDX-License-Identifier: Apache-2.0
// The vocabulary of memory access: modes, targets, address spaces and the deduction tags.
#pragma once

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

enum class access_mode {
  read,
  write,
  read_write,
  discard_write,
  discard_read_write,
  atomic,
};

enum class target {
  device,
  host_task,
  global_buffer = device,
};

namespace access {
using mode = sycl::access_mode;
using target = sycl::target;
enum class address_space : int {
  global_space,
  local_space,
  constant_space,
  private_space,
  generic_space,
};
enum class decorated : int { no, yes, legacy };
enum class fence_space : char { local_space, global_space, global_and_local };
enum class placeholder { false_t, true_t };
}  // namespace access

template <access_mode Mode>
struct mode_tag_t {
  explicit mode_tag_t() = default;
};
inline constexpr mode_tag_t<access_mode::read> read_only{};
inline constexpr mode_tag_t<access_mode::read_write> read_write{};
inline constexpr mode_tag_t<access_mode::write> write_only{};

template <access_mode Mode, target Target>
struct mode_target_tag_t {
  explicit mode_target_tag_t() = default;
};
inline constexpr mode_target_tag_t<access_mode::read, target::host_task> read_only_host_task{};
inline constexpr mode_target_tag_t<access_mode::read_write, target::host_task>
    read_write_host_task{};
inline constexpr mode_target_tag_t<access_mode::write, target::host_task> write_only_host_task{};

namespace detail {
// What a tag says about the accessor to deduce.
template <typename Tag>
struct tag_traits {
  static constexpr bool is_tag = false;
};
template <access_mode Mode>
struct tag_traits<mode_tag_t<Mode>> {
  static constexpr bool is_tag = true;
  static constexpr access_mode mode = Mode;
  static constexpr sycl::target target = sycl::target::device;
};
template <access_mode Mode, sycl::target Target>
struct tag_traits<mode_target_tag_t<Mode, Target>> {
  static constexpr bool is_tag = true;
  static constexpr access_mode mode = Mode;
  static constexpr sycl::target target = Target;
};

constexpr bool mode_writes(access_mode mode) {
  return mode != access_mode::read;
}
}  // namespace detail

LUMEN_NAMESPACE_END
