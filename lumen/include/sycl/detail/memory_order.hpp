// SPDX-License-Identifier: Apache-2.0
// Memory orders and scopes of SYCL 2020, section 4.15.3.
#pragma once

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

enum class memory_order : int { relaxed, acquire, release, acq_rel, seq_cst };
inline constexpr auto memory_order_relaxed = memory_order::relaxed;
inline constexpr auto memory_order_acquire = memory_order::acquire;
inline constexpr auto memory_order_release = memory_order::release;
inline constexpr auto memory_order_acq_rel = memory_order::acq_rel;
inline constexpr auto memory_order_seq_cst = memory_order::seq_cst;

enum class memory_scope : int { work_item, sub_group, work_group, device, system };
inline constexpr auto memory_scope_work_item = memory_scope::work_item;
inline constexpr auto memory_scope_sub_group = memory_scope::sub_group;
inline constexpr auto memory_scope_work_group = memory_scope::work_group;
inline constexpr auto memory_scope_device = memory_scope::device;
inline constexpr auto memory_scope_system = memory_scope::system;

namespace detail {

// The orders that a load, and the failing side of a compare-exchange, may have.
SYCL_EXTERNAL constexpr memory_order read_order_of(memory_order order) {
  return order == memory_order::acq_rel   ? memory_order::acquire
         : order == memory_order::release ? memory_order::relaxed
                                          : order;
}
SYCL_EXTERNAL constexpr memory_order write_order_of(memory_order order) {
  return order == memory_order::acq_rel   ? memory_order::release
         : order == memory_order::acquire ? memory_order::relaxed
                                          : order;
}

}  // namespace detail

LUMEN_NAMESPACE_END
