// SPDX-License-Identifier: Apache-2.0
// Programs and kernels of OpenCL that were made elsewhere.
#pragma once

#include <memory>
#include <mutex>
#include <vector>

#include "../native.hpp"
#include "opencl_library.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class opencl_program final : public native_program {
 public:
  explicit opencl_program(opencl_reference<cl_program> program) : program_(std::move(program)) {}
  void* handle() const noexcept override { return program_.get(); }

 private:
  const opencl_reference<cl_program> program_;
};

class opencl_kernel final : public native_kernel {
 public:
  opencl_kernel(std::shared_ptr<native_context> context, opencl_reference<cl_kernel> kernel)
      : context_(std::move(context)), kernel_(std::move(kernel)) {}

  void* handle() const noexcept override { return kernel_.get(); }
  const native_context& context() const noexcept override { return *context_; }
  std::string function_name() const override;
  std::uint32_t argument_count() const override;
  std::size_t work_group_size(const device_record& device) const override;

  // Sets the arguments and calls what enqueues the kernel, as one step: a kernel has one set of
  // arguments, and a launch takes them as they are.
  template <typename Enqueue>
  void launch(const std::vector<kernel_argument>& arguments, const Enqueue& enqueue) {
    const std::lock_guard<std::mutex> lock(mutex_);
    set(arguments);
    enqueue(kernel_.get());
  }

 private:
  void set(const std::vector<kernel_argument>& arguments);

  const std::shared_ptr<native_context> context_;
  const opencl_reference<cl_kernel> kernel_;
  std::mutex mutex_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
