// SPDX-License-Identifier: Apache-2.0
// The OpenCL backend: devices of every platform that the loader finds. They run kernels of OpenCL
// programs, which make_kernel brings in; unified shared memory and buffers lie in shared virtual
// memory (OpenCL 3.0, section 5.6), whose addresses are the same on device and host.
#include <algorithm>
#include <mutex>

#include "../backend.hpp"
#include "opencl_context.hpp"
#include "opencl_devices.hpp"
#include "opencl_kernel.hpp"
#include "opencl_stream.hpp"
#include "sycl/detail/exception.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

namespace {

// A handle of one kind of object, with the reference that the owner has from now on.
template <typename Handle>
opencl_reference<Handle> adopted(void* handle, ownership owner) {
  const auto object = static_cast<Handle>(handle);
  return owner == ownership::keep ? opencl_reference<Handle>::another(object)
                                  : opencl_reference<Handle>(object);
}

template <typename T, typename Handle>
T queue_answer(Handle queue, cl_command_queue_info query) {
  T answer{};
  check_opencl(cl().clGetCommandQueueInfo(queue, query, sizeof answer, &answer, nullptr),
               "clGetCommandQueueInfo");
  return answer;
}

template <typename T>
T device_answer(cl_device_id device, cl_device_info query) {
  T answer{};
  check_opencl(cl().clGetDeviceInfo(device, query, sizeof answer, &answer, nullptr),
               "clGetDeviceInfo");
  return answer;
}

// The handles that a function gives as a list; empty when it fails.
template <typename Handle, typename Ask>
std::vector<Handle> handles(const Ask& ask) {
  cl_uint count = 0;
  if (ask(0, nullptr, &count) != CL_SUCCESS || count == 0) {
    return {};
  }
  std::vector<Handle> all(count);
  return ask(count, all.data(), nullptr) == CL_SUCCESS ? all : std::vector<Handle>();
}

class opencl_driver final : public backend_driver, public native_platform {
 public:
  std::vector<std::unique_ptr<device_record>> enumerate() override;
  void* allocate(const memory_place& place, usm::alloc kind, std::size_t alignment,
                 std::size_t bytes) override {
    return opencl_context::of(place).allocate(place.device, kind, alignment, bytes);
  }
  void release(const memory_place& place, usm::alloc, void* pointer) noexcept override {
    opencl_context::of(place).release(pointer);
  }
  std::unique_ptr<command_stream> make_stream(const memory_place& place, bool timed) override {
    opencl_context& context = opencl_context::of(place);
    return stream_over(make_opencl_queue(context.get(), place.device, timed), place, true, timed);
  }
  void copy(const memory_place& place, void* to, const void* from, std::size_t bytes) override {
    opencl_context::of(place).copy(place.device, to, from, bytes);
  }
  native_platform* native() noexcept override { return has_opencl() ? this : nullptr; }

  const device_record& device_of(void* handle) override;
  std::shared_ptr<native_context> make_context(
      const std::vector<const device_record*>& devices) override;
  std::shared_ptr<native_context> adopt_context(void* handle, ownership owner) override {
    return std::make_shared<opencl_context>(adopted<cl_context>(handle, owner));
  }
  std::vector<const device_record*> devices_of(const native_context& context) override;
  std::unique_ptr<command_stream> adopt_queue(const memory_place& place, void* handle,
                                              ownership owner, bool timed) override;
  queue_traits traits_of_queue(void* handle) override;
  std::shared_ptr<native_program> adopt_program(const std::shared_ptr<native_context>&,
                                                void* handle, ownership owner) override {
    return std::make_shared<opencl_program>(adopted<cl_program>(handle, owner));
  }
  std::shared_ptr<native_kernel> adopt_kernel(const std::shared_ptr<native_context>& context,
                                              const std::shared_ptr<native_program>&, void* handle,
                                              ownership owner) override;
  void share(native_kind kind, void* handle) override;

 private:
  struct sub_device {
    opencl_reference<cl_device_id> id;
    std::unique_ptr<device_record> record;
  };

  void add_devices(cl_platform_id id, std::vector<std::unique_ptr<device_record>>& devices);
  const device_record& record_of(cl_device_id id);
  std::unique_ptr<command_stream> stream_over(opencl_reference<cl_command_queue> queue,
                                              const memory_place& place, bool in_order,
                                              bool timed) {
    return std::make_unique<opencl_stream>(
        place.device, std::move(queue), in_order,
        timed ? opencl_context::of(place).clock_of(place.device) : nullptr);
  }

  std::vector<std::unique_ptr<platform_record>> platforms_;
  std::mutex mutex_;  // guards what follows, once devices are enumerated
  std::vector<sub_device> sub_devices_;
  std::vector<const device_record*> known_;
};

std::vector<std::unique_ptr<device_record>> opencl_driver::enumerate() {
  std::vector<std::unique_ptr<device_record>> devices;
  if (has_opencl()) {
    for (const cl_platform_id id : handles<cl_platform_id>(cl().clGetPlatformIDs)) {
      add_devices(id, devices);
    }
  }
  return devices;
}

// A platform or device that does not answer is left out.
void opencl_driver::add_devices(cl_platform_id id,
                                std::vector<std::unique_ptr<device_record>>& devices) {
  const auto ask = [id](cl_uint entries, cl_device_id* found, cl_uint* count) {
    return cl().clGetDeviceIDs(id, CL_DEVICE_TYPE_ALL, entries, found, count);
  };
  try {
    platforms_.push_back(describe_platform(id));
  } catch (const exception&) {
    return;
  }
  int number = 0;
  for (const cl_device_id each : handles<cl_device_id>(ask)) {
    try {
      std::unique_ptr<device_record> record = describe_device(each, *platforms_.back());
      record->number = number++;
      known_.push_back(record.get());
      devices.push_back(std::move(record));
    } catch (const exception&) {
    }
  }
}

const device_record& opencl_driver::device_of(void* handle) {
  const std::lock_guard<std::mutex> lock(mutex_);
  return record_of(static_cast<cl_device_id>(handle));
}

const device_record& opencl_driver::record_of(cl_device_id id) {
  const auto found = std::find_if(known_.begin(), known_.end(),
                                  [id](const auto* each) { return each->native == id; });
  if (found != known_.end()) {
    return **found;
  }
  const auto parent_id = device_answer<cl_device_id>(id, CL_DEVICE_PARENT_DEVICE);
  if (parent_id == nullptr) {
    throw_invalid("the native handle is that of no device");
  }
  const device_record& parent = record_of(parent_id);
  sub_device made{opencl_reference<cl_device_id>::another(id),
                  describe_device(id, *parent.platform)};
  made.record->driver = this;
  made.record->parent = &parent;
  made.record->number = parent.number;
  sub_devices_.push_back(std::move(made));
  known_.push_back(sub_devices_.back().record.get());
  return *known_.back();
}

std::shared_ptr<native_context> opencl_driver::make_context(
    const std::vector<const device_record*>& devices) {
  std::vector<cl_device_id> ids;
  for (const device_record* each : devices) {
    ids.push_back(id_of(*each));
  }
  const cl_context_properties properties[] = {
      CL_CONTEXT_PLATFORM,
      reinterpret_cast<cl_context_properties>(devices.front()->platform->native), 0};
  cl_int code = CL_SUCCESS;
  opencl_reference<cl_context> made(cl().clCreateContext(
      properties, static_cast<cl_uint>(ids.size()), ids.data(), nullptr, nullptr, &code));
  check_opencl(code, "clCreateContext");
  return std::make_shared<opencl_context>(std::move(made));
}

std::vector<const device_record*> opencl_driver::devices_of(const native_context& context) {
  const auto id = static_cast<cl_context>(context.handle());
  std::size_t size = 0;
  check_opencl(cl().clGetContextInfo(id, CL_CONTEXT_DEVICES, 0, nullptr, &size),
               "clGetContextInfo");
  std::vector<cl_device_id> ids(size / sizeof(cl_device_id));
  check_opencl(cl().clGetContextInfo(id, CL_CONTEXT_DEVICES, size, ids.data(), nullptr),
               "clGetContextInfo");
  std::vector<const device_record*> devices;
  for (const cl_device_id each : ids) {
    devices.push_back(&device_of(each));
  }
  return devices;
}

queue_traits opencl_driver::traits_of_queue(void* handle) {
  const auto queue = static_cast<cl_command_queue>(handle);
  const auto properties = queue_answer<cl_command_queue_properties>(queue, CL_QUEUE_PROPERTIES);
  return {(properties & CL_QUEUE_OUT_OF_ORDER_EXEC_MODE_ENABLE) == 0,
          (properties & CL_QUEUE_PROFILING_ENABLE) != 0,
          &device_of(queue_answer<cl_device_id>(queue, CL_QUEUE_DEVICE))};
}

// What is handed over belongs to lumen from here on, also where it is refused.
std::unique_ptr<command_stream> opencl_driver::adopt_queue(const memory_place& place, void* handle,
                                                           ownership owner, bool timed) {
  opencl_reference<cl_command_queue> queue = adopted<cl_command_queue>(handle, owner);
  if (queue_answer<cl_context>(queue.get(), CL_QUEUE_CONTEXT) != opencl_context::of(place).get()) {
    throw_invalid("the native queue is not of the context");
  }
  const queue_traits traits = traits_of_queue(handle);
  if (timed && !traits.timed) {
    throw_invalid("the native queue keeps no times");
  }
  return stream_over(std::move(queue), place, traits.in_order, timed);
}

std::shared_ptr<native_kernel> opencl_driver::adopt_kernel(
    const std::shared_ptr<native_context>& context, const std::shared_ptr<native_program>&,
    void* handle, ownership owner) {
  opencl_reference<cl_kernel> kernel = adopted<cl_kernel>(handle, owner);
  cl_context its = nullptr;
  check_opencl(cl().clGetKernelInfo(kernel.get(), CL_KERNEL_CONTEXT, sizeof its, &its, nullptr),
               "clGetKernelInfo");
  if (its != context->handle()) {
    throw_invalid("the native kernel is not of the context");
  }
  return std::make_shared<opencl_kernel>(context, std::move(kernel));
}

void opencl_driver::share(native_kind kind, void* handle) {
  switch (kind) {
    case native_kind::device:
      return retain_object(static_cast<cl_device_id>(handle));
    case native_kind::context:
      return retain_object(static_cast<cl_context>(handle));
    case native_kind::queue:
      return retain_object(static_cast<cl_command_queue>(handle));
    case native_kind::kernel:
      return retain_object(static_cast<cl_kernel>(handle));
    case native_kind::program:
      return retain_object(static_cast<cl_program>(handle));
    case native_kind::event:
      return retain_object(static_cast<cl_event>(handle));
  }
}

}  // namespace

std::unique_ptr<backend_driver> make_opencl_driver() {
  return std::make_unique<opencl_driver>();
}

}  // namespace detail
LUMEN_NAMESPACE_END
