// SPDX-License-Identifier: Apache-2.0
// Level Zero modules and kernels that come in by their handles.
#pragma once

#include <memory>
#include <mutex>
#include <vector>

#include "level_zero_context.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class level_zero_program final : public native_program {
 public:
  level_zero_program(std::shared_ptr<native_context> context,
                     level_zero_object<ze_module_handle_t> object)
      : context_(std::move(context)), object_(std::move(object)) {}
  void* handle() const noexcept override { return object_.get(); }

 private:
  const std::shared_ptr<native_context> context_;
  const level_zero_object<ze_module_handle_t> object_;
};

class level_zero_kernel final : public native_kernel {
 public:
  // The kernel may follow pointers in memory of every kind, as kernels of SYCL do.
  level_zero_kernel(std::shared_ptr<native_context> context,
                    std::shared_ptr<native_program> program,
                    level_zero_object<ze_kernel_handle_t> object);

  void* handle() const noexcept override { return object_.get(); }
  const native_context& context() const noexcept override { return *context_; }
  std::string function_name() const override;
  std::uint32_t argument_count() const override;
  std::size_t work_group_size(const device_record& device) const override;

  // Appends a launch to a list, with the kernel as the arguments and sizes make it. Throws
  // errc::nd_range for sizes beyond 32 bits.
  void append_to(ze_command_list_handle_t list, const native_shape& shape,
                 const std::vector<kernel_argument>& arguments);

 private:
  ze_kernel_properties_t properties() const;
  void set(const kernel_argument& argument);

  const std::shared_ptr<native_context> context_;
  const std::shared_ptr<native_program> program_;
  const level_zero_object<ze_kernel_handle_t> object_;
  std::mutex mutex_;            // held while a launch is put together
  bool offset_is_set_ = false;  // other than 0
};

}  // namespace detail
LUMEN_NAMESPACE_END
