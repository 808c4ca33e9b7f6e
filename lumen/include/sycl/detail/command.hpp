// SPDX-License-Identifier: Apache-2.0
// Closure records: what a command group asks to run, owned by its task. The templates hold the
// user's function and the loop over items, which thus inlines; all else sees the base classes.
// In a unit compiled by nvcc they hold the kernel's CUDA code as well.
#pragma once

#include <cstddef>
#include <type_traits>
#include <utility>

#include "call_kernel.hpp"
#include "device_copyable.hpp"
#include "info.hpp"
#include "launch_shape.hpp"
#if defined(__CUDACC__)
#include "cuda_launch.hpp"
#endif

LUMEN_NAMESPACE_BEGIN

class interop_handle;

namespace detail {

class command_stream;

// Kernels carry bytes only: closures that own something (strings, containers, buffers, queues)
// do not go to a device. Types declared device copyable may say otherwise of themselves.
template <typename Function>
constexpr void check_kernel_type() {
  static_assert(is_device_copyable_v<Function> || std::is_trivially_destructible_v<Function>,
                "what a kernel captures must be device copyable");
}

class LUMEN_EXPORT command {
 public:
  command() = default;
  command(const command&) = delete;
  command& operator=(const command&) = delete;
  virtual ~command();
};

// Runs once on the host, on whatever thread claims it.
class LUMEN_EXPORT host_command : public command {
 public:
  ~host_command() override;
  virtual void run(const interop_handle& handle) = 0;
};

// Goes into a stream of the device.
class LUMEN_EXPORT device_command : public command {
 public:
  ~device_command() override;
  virtual void enqueue(command_stream& stream, const launch_shape& shape) = 0;
  // Called once when the work is done, before its closure goes.
  virtual void finish();
  // Whether finish does something that later commands may read.
  virtual bool ends_on_host() const;
};

// Runs over items on a device; each kind of launch overrides its own function.
class LUMEN_EXPORT kernel_command : public device_command {
 public:
  ~kernel_command() override;
  void enqueue(command_stream& stream, const launch_shape& shape) override;
  // The items [begin, end) of a range, in row-major order.
  virtual void run_items(std::size_t begin, std::size_t end) const;
  // Items of one group, from frame.next_item on, until none is left or the group diverged.
  virtual void run_group(group_frame& frame) const;
  // True for a launch over an nd_range.
  virtual bool needs_groups() const;
  // Whether the program holds code of this kernel for devices of a backend.
  virtual bool serves(backend kind) const;
  // Puts the native code into the stream; throws what the platform said.
  virtual void launch_native(const native_launch& launch) const;
};

// What a unit's compiler makes of a kernel. It is part of the types below, so that what two
// compilers made of one kernel is never taken for one class. A kernel that is to run on CUDA
// devices is launched from units compiled by nvcc alone.
enum class code_for { host, host_and_cuda };
#if defined(__CUDACC__)
#define LUMEN_UNIT_CODE code_for::host_and_cuda
#define LUMEN_NATIVE_KERNEL(...)                                   \
  bool serves(backend kind) const override {                       \
    return kind == backend::host || kind == backend::cuda;         \
  }                                                                \
  void launch_native(const native_launch& launch) const override { \
    __VA_ARGS__;                                                   \
  }
#else
#define LUMEN_UNIT_CODE code_for::host
#define LUMEN_NATIVE_KERNEL(...)
#endif

template <typename Function>
class host_function final : public host_command {
 public:
  explicit host_function(Function&& function) : function_(std::move(function)) {}
  explicit host_function(const Function& function) : function_(function) {}
  void run(const interop_handle& handle) override {
    if constexpr (std::is_invocable_v<Function&, const interop_handle&>) {
      function_(handle);
    } else {
      (void)handle;
      function_();
    }
  }

 private:
  Function function_;
};

template <typename Function, code_for Code = LUMEN_UNIT_CODE>
class single_kernel final : public kernel_command {
 public:
  explicit single_kernel(const Function& function) : function_(function) {}
  void run_items(std::size_t, std::size_t) const override { function_(); }
  LUMEN_NATIVE_KERNEL(launch_cuda_single(launch, function_))

 private:
  Function function_;
};

template <int Dimensions, typename Function, code_for Code = LUMEN_UNIT_CODE>
class range_kernel final : public kernel_command {
 public:
  range_kernel(const range<Dimensions>& sizes, const id<Dimensions>& offset,
               const Function& function)
      : sizes_(sizes), offset_(offset), function_(function) {}
  // Everything that a kernel calls is inlined, as compilers for devices do: what does not vary from
  // item to item then leaves the loop.
  [[gnu::flatten]] void run_items(std::size_t begin, std::size_t end) const override {
    for_items<Dimensions>(sizes_, offset_, begin, end, [this](const item<Dimensions>& position) {
      call_with_item(function_, position);
    });
  }
  LUMEN_NATIVE_KERNEL(launch_cuda_range(launch, function_, sizes_, offset_))

 private:
  range<Dimensions> sizes_;
  id<Dimensions> offset_;
  Function function_;
};

template <int Dimensions, typename Function, code_for Code = LUMEN_UNIT_CODE>
class nd_range_kernel final : public kernel_command {
 public:
  explicit nd_range_kernel(const Function& function) : function_(function) {}
  bool needs_groups() const override { return true; }
  void run_group(group_frame& frame) const override {
    while (frame.next_item < frame.item_count) {
      function_(nd_item_maker::make<Dimensions>(frame, frame.next_item++));
      if (!frame.end_item()) {
        return;
      }
    }
  }
  LUMEN_NATIVE_KERNEL(launch_cuda_groups<Dimensions>(launch, function_))

 private:
  Function function_;
};

#undef LUMEN_NATIVE_KERNEL
#undef LUMEN_UNIT_CODE

}  // namespace detail

LUMEN_NAMESPACE_END
