// SPDX-License-Identifier: Apache-2.0
// Native kernels and programs as SYCL objects.
#include "sycl/detail/kernel.hpp"

#include "native_access.hpp"

LUMEN_NAMESPACE_BEGIN

backend kernel_bundle<bundle_state::executable>::get_backend() const noexcept {
  return state_->owner.get_backend();
}
context kernel_bundle<bundle_state::executable>::get_context() const noexcept {
  return state_->owner;
}
std::vector<device> kernel_bundle<bundle_state::executable>::get_devices() const noexcept {
  return state_->owner.get_devices();
}

backend kernel::get_backend() const noexcept {
  return state_->owner.get_backend();
}
context kernel::get_context() const {
  return state_->owner;
}
template <>
LUMEN_EXPORT std::uint32_t kernel::get_info<info::kernel::num_args>() const {
  return state_->native->argument_count();
}
template <>
LUMEN_EXPORT std::string kernel::get_info<info::kernel::function_name>() const {
  return state_->native->function_name();
}
template <>
LUMEN_EXPORT std::size_t kernel::get_info<info::kernel_device_specific::work_group_size>(
    const device& dev) const {
  const auto& place = detail::context_state::of(state_->owner).place_of(dev);
  return state_->native->work_group_size(place->device);
}

LUMEN_NAMESPACE_END
