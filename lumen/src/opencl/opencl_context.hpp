// SPDX-License-Identifier: Apache-2.0
// An OpenCL context: its shared virtual memory, copies between that and the host's, and the clocks
// of its devices.
#pragma once

#include <map>
#include <memory>
#include <mutex>

#include "../native.hpp"
#include "opencl_library.hpp"
#include "sycl/detail/usm.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// What a device's clock says, in the time of now_nanoseconds. The clocks run freely against each
// other, but what happened did so between two moments that the host knows: these mend the
// difference each time.
class device_clock {
 public:
  // The host's time less the device's, in nanoseconds.
  explicit device_clock(std::int64_t difference) : difference_(difference) {}
  std::uint64_t host_time(std::uint64_t device_time, std::uint64_t not_before,
                          std::uint64_t not_after);

 private:
  std::mutex mutex_;
  std::int64_t difference_;
};

class opencl_context final : public native_context {
 public:
  explicit opencl_context(opencl_reference<cl_context> context) : context_(std::move(context)) {}

  void* handle() const noexcept override { return context_.get(); }
  cl_context get() const noexcept { return context_.get(); }

  // Null when there is not enough, or the device has no such memory.
  void* allocate(const device_record& device, usm::alloc kind, std::size_t alignment,
                 std::size_t bytes);
  void release(void* pointer) noexcept;
  // Done on return.
  void copy(const device_record& device, void* to, const void* from, std::size_t bytes);
  std::shared_ptr<device_clock> clock_of(const device_record& device);

  static opencl_context& of(const memory_place& place) {
    return static_cast<opencl_context&>(*place.context);
  }

 private:
  // The context's own queue on a device, made at first use.
  struct helper {
    opencl_reference<cl_command_queue> queue;
    std::shared_ptr<device_clock> clock;
  };
  helper& helper_of(const device_record& device);

  const opencl_reference<cl_context> context_;
  std::mutex mutex_;                                // guards what follows
  std::map<void*, void*> blocks_;                   // where aligned memory begins, by its address
  std::map<const device_record*, helper> helpers_;  // they stay where they are
};

// An in-order queue, which keeps times if that is asked for.
opencl_reference<cl_command_queue> make_opencl_queue(cl_context context,
                                                     const device_record& device, bool timed);

}  // namespace detail
LUMEN_NAMESPACE_END
