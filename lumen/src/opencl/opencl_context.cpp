// SPDX-License-Identifier: Apache-2.0
// Memory, copies and clocks of an OpenCL context.
#include "opencl_context.hpp"

#include <algorithm>

#include "../clock.hpp"
#include "opencl_devices.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// What every device aligns shared virtual memory to when nothing is asked for: its largest type.
constexpr std::size_t plain_alignment = 128;

bool has(const device_record& device, aspect wanted) {
  const std::vector<aspect>& all = device.properties.aspects;
  return std::find(all.begin(), all.end(), wanted) != all.end();
}

aspect aspect_for(usm::alloc kind) {
  return kind == usm::alloc::device ? aspect::usm_device_allocations
         : kind == usm::alloc::host ? aspect::usm_host_allocations
                                    : aspect::usm_shared_allocations;
}

// The moment of a device that the host learns of soonest: a marker of an idle queue.
std::int64_t measured_difference(cl_command_queue queue) {
  cl_event event = nullptr;
  check_opencl(cl().clEnqueueMarkerWithWaitList(queue, 0, nullptr, &event),
               "clEnqueueMarkerWithWaitList");
  const opencl_reference<cl_event> marker(event);
  check_opencl(cl().clWaitForEvents(1, &event), "clWaitForEvents");
  const std::uint64_t now = now_nanoseconds();
  cl_ulong device_time = 0;
  check_opencl(cl().clGetEventProfilingInfo(event, CL_PROFILING_COMMAND_END, sizeof device_time,
                                            &device_time, nullptr),
               "clGetEventProfilingInfo");
  return static_cast<std::int64_t>(now - device_time);
}

}  // namespace

std::uint64_t device_clock::host_time(std::uint64_t device_time, std::uint64_t not_before,
                                      std::uint64_t not_after) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const std::uint64_t told = device_time + static_cast<std::uint64_t>(difference_);
  const std::uint64_t time = std::clamp(told, not_before, not_after);
  difference_ += static_cast<std::int64_t>(time - told);
  return time;
}

opencl_reference<cl_command_queue> make_opencl_queue(cl_context context,
                                                     const device_record& device, bool timed) {
  const cl_command_queue_properties wanted = timed ? CL_QUEUE_PROFILING_ENABLE : 0;
  cl_int code = CL_SUCCESS;
  if (opencl_version(device) < 200) {
    opencl_reference<cl_command_queue> made(
        cl().clCreateCommandQueue(context, id_of(device), wanted, &code));
    check_opencl(code, "clCreateCommandQueue");
    return made;
  }
  const cl_queue_properties properties[] = {CL_QUEUE_PROPERTIES, wanted, 0};
  opencl_reference<cl_command_queue> made(
      cl().clCreateCommandQueueWithProperties(context, id_of(device), properties, &code));
  check_opencl(code, "clCreateCommandQueueWithProperties");
  return made;
}

void* opencl_context::allocate(const device_record& device, usm::alloc kind, std::size_t alignment,
                               std::size_t bytes) {
  if (!has(device, aspect_for(kind))) {
    return nullptr;
  }
  const cl_svm_mem_flags flags =
      CL_MEM_READ_WRITE | (kind == usm::alloc::device ? 0 : CL_MEM_SVM_FINE_GRAIN_BUFFER);
  if (alignment <= plain_alignment) {
    return cl().clSVMAlloc(context_.get(), flags, bytes, 0);
  }
  void* const block = cl().clSVMAlloc(context_.get(), flags, bytes + alignment, 0);
  if (block == nullptr) {
    return nullptr;
  }
  const auto start = reinterpret_cast<std::uintptr_t>(block);
  void* const place = static_cast<char*>(block) + (alignment - start % alignment) % alignment;
  try {
    const std::lock_guard<std::mutex> lock(mutex_);
    blocks_[place] = block;
  } catch (...) {
    cl().clSVMFree(context_.get(), block);
    throw;
  }
  return place;
}

void opencl_context::release(void* pointer) noexcept {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    const auto found = blocks_.find(pointer);
    if (found != blocks_.end()) {
      pointer = found->second;
      blocks_.erase(found);
    }
  }
  cl().clSVMFree(context_.get(), pointer);
}

opencl_context::helper& opencl_context::helper_of(const device_record& device) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto found = helpers_.find(&device);
  if (found != helpers_.end()) {
    return found->second;
  }
  helper made;
  made.queue = make_opencl_queue(context_.get(), device, device.properties.queue_profiling);
  if (device.properties.queue_profiling) {
    made.clock = std::make_shared<device_clock>(measured_difference(made.queue.get()));
  }
  return helpers_.emplace(&device, std::move(made)).first->second;
}

void opencl_context::copy(const device_record& device, void* to, const void* from,
                          std::size_t bytes) {
  if (bytes != 0) {
    check_opencl(cl().clEnqueueSVMMemcpy(helper_of(device).queue.get(), CL_TRUE, to, from, bytes, 0,
                                         nullptr, nullptr),
                 "clEnqueueSVMMemcpy");
  }
}

std::shared_ptr<device_clock> opencl_context::clock_of(const device_record& device) {
  return helper_of(device).clock;
}

}  // namespace detail
LUMEN_NAMESPACE_END
