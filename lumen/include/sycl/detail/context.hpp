// SPDX-License-Identifier: Apache-2.0
// context (SYCL 2020, section 4.6.3): devices of one platform that share memory, and the
// handler of asynchronous errors for queues that have none.
#pragma once

#include "device.hpp"

LUMEN_NAMESPACE_BEGIN

class LUMEN_EXPORT context {
 public:
  explicit context(const property_list& properties = {});
  explicit context(async_handler handler, const property_list& properties = {});
  explicit context(const device& dev, const property_list& properties = {});
  context(const device& dev, async_handler handler, const property_list& properties = {});
  // Throws errc::invalid for an empty list or devices of several platforms.
  explicit context(const std::vector<device>& devices, const property_list& properties = {});
  context(const std::vector<device>& devices, async_handler handler,
          const property_list& properties = {});

  sycl::backend get_backend() const noexcept;
  platform get_platform() const;
  std::vector<device> get_devices() const;
  template <typename Param>
  typename Param::return_type get_info() const;
  template <typename Property>
  bool has_property() const noexcept {
    return false;
  }

  friend bool operator==(const context& a, const context& b) { return a.state_ == b.state_; }
  friend bool operator!=(const context& a, const context& b) { return a.state_ != b.state_; }

 private:
  friend struct detail::context_state;
  friend struct std::hash<context>;
  explicit context(std::shared_ptr<detail::context_state> state) : state_(std::move(state)) {}
  std::shared_ptr<detail::context_state> state_;
};

LUMEN_NAMESPACE_END

namespace std {
template <>
struct hash<sycl::context> {
  size_t operator()(const sycl::context& c) const noexcept {
    return hash<const void*>()(c.state_.get());
  }
};
}  // namespace std
