// SPDX-License-Identifier: Apache-2.0
// Where memory lies and streams run: a device within a native context. Platforms without contexts
// have one place a device, which all SYCL contexts share; elsewhere memory and events of one
// context mean nothing in another.
#pragma once

#include <memory>

#include "device_record.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class native_context;

struct memory_place : std::enable_shared_from_this<memory_place> {
  memory_place(const device_record& where, std::shared_ptr<native_context> owner)
      : device(where), context(std::move(owner)) {}

  const device_record& device;
  const std::shared_ptr<native_context> context;  // null where the platform has none
};

// Whether a stream of one place can wait for marks of the other.
inline bool reach_each_other(const memory_place& a, const memory_place& b) {
  return a.device.driver == b.device.driver && a.context == b.context;
}

// Whether it can copy from there, too. Between devices of Level Zero that holds only for peers;
// there the host's memory stands between.
inline bool copies_directly(const memory_place& a, const memory_place& b) {
  return reach_each_other(a, b) &&
         (&a.device == &b.device || a.device.platform->kind != backend::ext_kestrel_level_zero);
}

}  // namespace detail
LUMEN_NAMESPACE_END
