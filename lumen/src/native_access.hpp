// SPDX-License-Identifier: Apache-2.0
// The runtime's way between the objects of the interface and what a platform has for them.
#pragma once

#include <memory>

#include "context_state.hpp"
#include "native.hpp"
#include "queue_core.hpp"
#include "sycl/detail/backend.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

struct bundle_state_record {
  context owner;
  std::shared_ptr<native_program> native;
};

struct kernel_state {
  context owner;
  std::shared_ptr<native_kernel> native;
};

struct native_access {
  static const std::shared_ptr<native_kernel>& kernel_of(const kernel& k) {
    return k.state_->native;
  }
  static const kernel_state& state(const kernel& k) { return *k.state_; }
  static kernel make(std::shared_ptr<kernel_state> state) { return kernel(std::move(state)); }

  static const bundle_state_record& state(const executable_bundle& b) { return *b.state_; }
  static executable_bundle make(std::shared_ptr<bundle_state_record> state) {
    return executable_bundle(std::move(state));
  }

  static const std::shared_ptr<queue_handle>& handle(const queue& q) { return q.handle_; }
  static queue make(std::shared_ptr<queue_handle> handle) { return queue(std::move(handle)); }
};

}  // namespace detail
LUMEN_NAMESPACE_END
