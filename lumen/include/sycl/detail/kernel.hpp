// SPDX-License-Identifier: Apache-2.0
// kernel and kernel_bundle (SYCL 2020, sections 4.11.7 and 4.11.12) over kernels and programs of a
// native platform, which make_kernel and make_kernel_bundle bring in. Kernels made from C++
// functions have no such objects here. Both classes are handles.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "context.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
class native_kernel;
class native_program;
struct kernel_state;
struct bundle_state_record;
struct native_access;
}  // namespace detail

enum class bundle_state : char { input, object, executable };

namespace info {
namespace kernel {
struct num_args {
  using return_type = std::uint32_t;
};
struct function_name {
  using return_type = std::string;
};
}  // namespace kernel
namespace kernel_device_specific {
struct work_group_size {
  using return_type = std::size_t;
};
}  // namespace kernel_device_specific
}  // namespace info

template <bundle_state State>
class kernel_bundle;

template <>
class LUMEN_EXPORT kernel_bundle<bundle_state::executable> {
 public:
  kernel_bundle() = delete;

  bool empty() const noexcept { return false; }
  sycl::backend get_backend() const noexcept;
  context get_context() const noexcept;
  std::vector<device> get_devices() const noexcept;

  friend bool operator==(const kernel_bundle& a, const kernel_bundle& b) {
    return a.state_ == b.state_;
  }
  friend bool operator!=(const kernel_bundle& a, const kernel_bundle& b) { return !(a == b); }

 private:
  friend struct detail::native_access;
  explicit kernel_bundle(std::shared_ptr<detail::bundle_state_record> state)
      : state_(std::move(state)) {}
  std::shared_ptr<detail::bundle_state_record> state_;
};

class LUMEN_EXPORT kernel {
 public:
  kernel() = delete;

  sycl::backend get_backend() const noexcept;
  context get_context() const;
  template <typename Param>
  typename Param::return_type get_info() const;
  // Throws errc::invalid for a device that is not of the kernel's context.
  template <typename Param>
  typename Param::return_type get_info(const device& dev) const;

  friend bool operator==(const kernel& a, const kernel& b) { return a.state_ == b.state_; }
  friend bool operator!=(const kernel& a, const kernel& b) { return !(a == b); }

 private:
  friend class handler;
  friend struct detail::native_access;
  friend struct std::hash<kernel>;
  explicit kernel(std::shared_ptr<detail::kernel_state> state) : state_(std::move(state)) {}
  std::shared_ptr<detail::kernel_state> state_;
};

LUMEN_NAMESPACE_END

namespace std {
template <>
struct hash<sycl::kernel> {
  size_t operator()(const sycl::kernel& k) const noexcept {
    return hash<const void*>()(k.state_.get());
  }
};
}  // namespace std
