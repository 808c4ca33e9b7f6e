// SPDX-License-Identifier: Apache-2.0
// The runtime's way into a handler.
#pragma once

#include "sycl/detail/handler.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

struct handler_access {
  static command_group& group(handler& h) { return h.group_; }
  static void launch(handler& h, const launch_shape& shape, std::unique_ptr<kernel_command> work) {
    h.launch(shape, std::move(work));
  }
};

}  // namespace detail
LUMEN_NAMESPACE_END
