// SPDX-License-Identifier: Apache-2.0
// The record behind a context.
#pragma once

#include <memory>
#include <vector>

#include "sycl/detail/context.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class native_context;
struct memory_place;

struct context_state : std::enable_shared_from_this<context_state> {
  std::vector<device> devices;
  async_handler handler;
  // Null where the platform has no contexts.
  std::shared_ptr<native_context> native;
  // One for each of the devices, in their order.
  std::vector<std::shared_ptr<memory_place>> places;

  // To be called once, when the rest is there.
  void make_places();
  // Throws errc::invalid for a device of another context.
  const std::shared_ptr<memory_place>& place_of(const device& dev) const;

  static const context_state& of(const context& ctx) { return *ctx.state_; }
  static const std::shared_ptr<context_state>& shared(const context& ctx) { return ctx.state_; }
  static context make(std::shared_ptr<context_state> state) { return context(std::move(state)); }
};

// The context of queues that name only a device.
context default_context(const device& dev);

}  // namespace detail
LUMEN_NAMESPACE_END
