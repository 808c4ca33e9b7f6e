// SPDX-License-Identifier: Apache-2.0
// The record behind a context.
#pragma once

#include <memory>
#include <vector>

#include "sycl/detail/context.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

struct context_state {
  std::vector<device> devices;
  async_handler handler;

  static const context_state& of(const context& ctx) { return *ctx.state_; }
  static const std::shared_ptr<context_state>& shared(const context& ctx) { return ctx.state_; }
  static context make(std::shared_ptr<context_state> state) { return context(std::move(state)); }
};

// The context of queues that name only a device.
context default_context(const device& dev);

}  // namespace detail
LUMEN_NAMESPACE_END
