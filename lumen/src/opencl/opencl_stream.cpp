// SPDX-License-Identifier: Apache-2.0
// Commands of OpenCL queues.
#include "opencl_stream.hpp"

#include <algorithm>

#include "../clock.hpp"
#include "opencl_devices.hpp"
#include "opencl_kernel.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

class opencl_mark final : public stream_mark {
 public:
  opencl_mark(opencl_reference<cl_event> event, std::shared_ptr<device_clock> clock)
      : event_(std::move(event)), clock_(std::move(clock)), made_(now_nanoseconds()) {}

  // A failure counts as the end: wait tells of it.
  bool reached() noexcept override {
    cl_int status = CL_COMPLETE;
    return state(status) != CL_SUCCESS || status <= CL_COMPLETE;
  }
  void wait() override {
    const cl_event event = event_.get();
    cl_int code = cl().clWaitForEvents(1, &event);
    cl_int status = CL_COMPLETE;
    if (code == CL_EXEC_STATUS_ERROR_FOR_EVENTS_IN_WAIT_LIST && state(status) == CL_SUCCESS &&
        status < CL_COMPLETE) {
      code = status;  // of the command itself
    }
    check_opencl(code, "clWaitForEvents");
  }
  std::uint64_t time() override {
    cl_ulong time = 0;
    check_opencl(cl().clGetEventProfilingInfo(event_.get(), CL_PROFILING_COMMAND_END, sizeof time,
                                              &time, nullptr),
                 "clGetEventProfilingInfo");
    return clock_->host_time(time, made_, now_nanoseconds());
  }
  void* native_handle() const noexcept override { return event_.get(); }

 private:
  cl_int state(cl_int& status) const noexcept {
    return cl().clGetEventInfo(event_.get(), CL_EVENT_COMMAND_EXECUTION_STATUS, sizeof status,
                               &status, nullptr);
  }

  const opencl_reference<cl_event> event_;
  const std::shared_ptr<device_clock> clock_;
  const std::uint64_t made_;
};

// Sizes in the order of OpenCL, whose first dimension varies fastest.
struct reversed_sizes {
  std::size_t values[3] = {1, 1, 1};
  reversed_sizes(const std::size_t (&sizes)[3], int dimensions) {
    std::reverse_copy(sizes, sizes + dimensions, values);
  }
};

// What clEnqueueSVMMemFill takes.
bool is_plain_pattern(const void* to, std::size_t pattern_bytes) {
  return pattern_bytes <= 128 && (pattern_bytes & (pattern_bytes - 1)) == 0 &&
         reinterpret_cast<std::uintptr_t>(to) % pattern_bytes == 0;
}

}  // namespace

void wait_list::add(cl_event event) {
  reserve();
  retain_object(event);
  events_.push_back(event);
}

void wait_list::become(cl_event event) noexcept {
  clear();
  events_.push_back(event);
}

void wait_list::clear() noexcept {
  for (const cl_event event : events_) {
    release_object(event);
  }
  events_.clear();
}

// The command is called with the events that it waits for and the place of its own event, or null.
template <typename Command>
void opencl_stream::enqueue(const char* name, const Command& command) {
  before_.reserve();
  cl_event made = nullptr;
  check_opencl(command(before_.count(), before_.data(), in_order_ ? nullptr : &made), name);
  if (in_order_) {
    before_.clear();
  } else {
    before_.become(made);
  }
}

void opencl_stream::launch(const launch_shape&, kernel_command&) {
  throw exception(make_error_code(errc::kernel_not_supported),
                  "OpenCL devices run native kernels only");
}

void opencl_stream::launch(const native_shape& shape, native_kernel& kernel,
                           const std::vector<kernel_argument>& arguments) {
  const launch_shape& sizes = shape.sizes;
  if (sizes.total() == 0) {  // not every version of OpenCL takes that
    return;
  }
  const reversed_sizes offset(sizes.offset, sizes.dimensions);
  const reversed_sizes global(sizes.global_range, sizes.dimensions);
  const reversed_sizes local(sizes.local_range, sizes.dimensions);
  static_cast<opencl_kernel&>(kernel).launch(arguments, [&](cl_kernel native) {
    enqueue("clEnqueueNDRangeKernel", [&](cl_uint count, const cl_event* events, cl_event* made) {
      return cl().clEnqueueNDRangeKernel(
          queue_.get(), native, static_cast<cl_uint>(sizes.dimensions), offset.values,
          global.values, shape.grouped ? local.values : nullptr, count, events, made);
    });
  });
}

// The drivers of older devices lack the functions, and the loader goes where they are not.
void opencl_stream::check_shared_memory() const {
  if (opencl_version(device_) < 200) {
    throw exception(make_error_code(errc::feature_not_supported),
                    device_.properties.name + " has no shared virtual memory: nothing is copied");
  }
}

// Either side may be ordinary memory of the host.
void opencl_stream::copy(void* to, const void* from, std::size_t bytes) {
  if (bytes != 0) {
    check_shared_memory();
    enqueue("clEnqueueSVMMemcpy", [&](cl_uint count, const cl_event* events, cl_event* made) {
      return cl().clEnqueueSVMMemcpy(queue_.get(), CL_FALSE, to, from, bytes, count, events, made);
    });
  }
}

void opencl_stream::fill(void* to, const void* pattern, std::size_t pattern_bytes,
                         std::size_t count) {
  const std::size_t bytes = pattern_bytes * count;
  if (bytes == 0) {
    return;
  }
  check_shared_memory();
  if (is_plain_pattern(to, pattern_bytes)) {
    enqueue("clEnqueueSVMMemFill", [&](cl_uint number, const cl_event* events, cl_event* made) {
      return cl().clEnqueueSVMMemFill(queue_.get(), to, pattern, pattern_bytes, bytes, number,
                                      events, made);
    });
    return;
  }
  // The filled part doubles with every copy.
  auto* const place = static_cast<char*>(to);
  copy(place, pattern, pattern_bytes);
  for (std::size_t done = pattern_bytes; done < bytes; done *= 2) {
    copy(place + done, place, std::min(done, bytes - done));
  }
}

// A hint, which drivers before version 2.1 do not take.
void opencl_stream::prefetch(void* pointer, std::size_t bytes) {
  if (bytes == 0 || opencl_version(device_) < 210) {
    return;
  }
  const void* place = pointer;
  enqueue("clEnqueueSVMMigrateMem", [&](cl_uint count, const cl_event* events, cl_event* made) {
    return cl().clEnqueueSVMMigrateMem(queue_.get(), 1, &place, &bytes, 0, count, events, made);
  });
}

void opencl_stream::wait_for(stream_mark& mark) {
  before_.add(static_cast<cl_event>(mark.native_handle()));
}

void opencl_stream::drain() noexcept {
  static_cast<void>(cl().clFinish(queue_.get()));
  before_.clear();
}

std::shared_ptr<stream_mark> opencl_stream::mark() {
  cl_event made = nullptr;
  check_opencl(
      cl().clEnqueueMarkerWithWaitList(queue_.get(), before_.count(), before_.data(), &made),
      "clEnqueueMarkerWithWaitList");
  opencl_reference<cl_event> event(made);
  before_.clear();
  if (!in_order_) {
    before_.add(made);
  }
  // Who waits for an event in another queue, or asks how far it is, needs it to be under way.
  check_opencl(cl().clFlush(queue_.get()), "clFlush");
  return std::make_shared<opencl_mark>(std::move(event), clock_);
}

}  // namespace detail
LUMEN_NAMESPACE_END
