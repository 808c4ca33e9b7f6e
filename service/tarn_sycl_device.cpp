// SPDX-License-Identifier: Apache-2.0
// Identification of devices, the layer on SYCL queues.
#include "tarn_sycl_device.hpp"

#include <string>
#include <tarn_level_zero.h>

#include "cl_device_context.hpp"
#include "detection_calls.hpp"
#include "opencl_binding.hpp"
#include "sycl_extensions.hpp"

namespace kestrel::tarn::gpu {
namespace {

void check(int code) {
  if (code != CL_SUCCESS) {
    throw sycl::exception(sycl::make_error_code(sycl::errc::runtime),
                          "OpenCL error " + std::to_string(code));
  }
}

tarn_gpu_backend_t backend_of(sycl::backend kind) {
  switch (service::code_of(kind)) {
    case service::backend_code::opencl:
      return TARN_GPU_BACKEND_OPENCL;
    case service::backend_code::level_zero:
      return TARN_GPU_BACKEND_LEVEL_ZERO;
    default:
      return TARN_GPU_BACKEND_UNKNOWN;
  }
}

/// SYCL gives a reference along with a handle, which is given back: the SYCL device has its own.
/// For a device that is no part of another one references mean nothing.
void drop_reference(cl_device_id device) {
  cl_device_id parent = nullptr;
  const cl_int asked =
      cl::clGetDeviceInfo(device, CL_DEVICE_PARENT_DEVICE, sizeof parent, &parent, nullptr);
  if (asked != CL_SUCCESS || parent != nullptr) {
    const cl_int released = cl::clReleaseDevice(device);
    check(asked != CL_SUCCESS ? asked : released);
  }
}

/// The native context of a queue, borrowed as long as this lives.
class borrowed_context {
 public:
  borrowed_context(const sycl::queue& queue, tarn_gpu_backend_t backend)
      : handle_(service::native_of(queue.get_context())), backend_(backend) {}
  borrowed_context(const borrowed_context&) = delete;
  borrowed_context& operator=(const borrowed_context&) = delete;
  ~borrowed_context() { give_back(); }

  void* get() const { return handle_; }
  cl_int give_back() {
    const bool counted = backend_ == TARN_GPU_BACKEND_OPENCL;
    backend_ = TARN_GPU_BACKEND_UNKNOWN;
    return counted ? cl::clReleaseContext(static_cast<cl_context>(handle_)) : CL_SUCCESS;
  }

 private:
  void* handle_;
  tarn_gpu_backend_t backend_;
};

void fill(device_record& record, const sycl::queue& queue) {
  record.backend = backend_of(queue.get_backend());
  if (record.backend == TARN_GPU_BACKEND_OPENCL) {
    fill_opencl_counts(record);
  } else if (record.backend == TARN_GPU_BACKEND_LEVEL_ZERO) {
    std::uint32_t sub_devices = 0;
    if (tarn_zeDeviceGetSubDevices(static_cast<ze_device_handle_t>(record.device_id), &sub_devices,
                                   nullptr) == ZE_RESULT_SUCCESS) {
      record.tile_count = tiles_of(sub_devices);
    }
    const sycl::device device = queue.get_device();
    record.max_workgroup_size =
        static_cast<std::int32_t>(device.get_info<sycl::info::device::max_work_group_size>());
    record.eu_count =
        static_cast<std::int32_t>(device.get_info<sycl::info::device::max_compute_units>());
  }
}

forge::detected_hw detect(const device_record& record, const sycl::queue& queue) {
  if (record.backend == TARN_GPU_BACKEND_UNKNOWN) {
    return {};
  }
  const borrowed_context context(queue, record.backend);
  return forge::detect_hw({record.device_id, context.get()},
                          static_cast<forge::native_backend>(record.backend),
                          bound_detection_calls());
}

void* device_of(const sycl::queue& queue) {
  // An ask that fails throws, so there is always a device.
  return *sycl_tables().queues.device_of(service::state_of(queue), [&] {
    return std::optional<void*>(native_device(queue, TARN_GPU_BACKEND_OF_QUEUE));
  });
}

opencl_counterpart opencl_objects(const sycl::queue& queue) {
  const device_record& record = record_of(queue);
  if (record.backend == TARN_GPU_BACKEND_OPENCL) {
    borrowed_context context(queue, record.backend);
    check(context.give_back());
    return {static_cast<cl_device_id>(record.device_id), static_cast<cl_context>(context.get())};
  }
  if (record.backend == TARN_GPU_BACKEND_LEVEL_ZERO) {
    int status = 0;
    const opencl_counterpart found =
        counterpart_of(&status, static_cast<ze_device_handle_t>(record.device_id));
    check(status);
    return found;
  }
  return {};
}

}  // namespace

sycl_layer_tables& sycl_tables() {
  static sycl_layer_tables all;
  return all;
}

void* native_device(const sycl::queue& queue, tarn_gpu_backend_t backend) {
  const tarn_gpu_backend_t path =
      backend == TARN_GPU_BACKEND_OF_QUEUE ? backend_of(queue.get_backend()) : backend;
  if (path == TARN_GPU_BACKEND_UNKNOWN) {
    return nullptr;
  }
  const sycl::device device = queue.get_device();
  if (backend_of(device.get_backend()) != path) {
    throw sycl::exception(sycl::make_error_code(sycl::errc::backend_mismatch), "Backends mismatch");
  }
  void* const handle = service::native_of(device);
  if (path == TARN_GPU_BACKEND_OPENCL) {
    drop_reference(static_cast<cl_device_id>(handle));
  }
  return handle;
}

device_record& record_of(const sycl::queue& queue) {
  device_record* const record = sycl_tables().infos.record_of(
      device_of(queue), [&](device_record& made) { fill(made, queue); });
  check(record == nullptr ? CL_OUT_OF_HOST_MEMORY : CL_SUCCESS);
  return *record;
}

device_record& record_with_arch(const sycl::queue& queue) {
  device_record& record = record_of(queue);
  decide_architecture(record, [&] { return detect(record, queue); });
  return record;
}

tarn_gpu_backend_t get_backend(sycl::queue* queue) {
  return record_of(*queue).backend;
}

void* get_device_id(int*, sycl::queue* queue) {
  return device_of(*queue);
}

int get_device_info(sycl::queue* queue, tarn_gpu_device_info_t* info) {
  *info = copy_of(record_of(*queue));
  return 0;
}

int get_device_info_with_arch(sycl::queue* queue, tarn_gpu_device_info_t* info) {
  *info = copy_of(record_with_arch(*queue));
  return 0;
}

namespace {
/// Where the caller wants it.
template <typename T>
void store(T* place, T value) {
  if (place != nullptr) {
    *place = value;
  }
}
}  // namespace

tarn_gpu_arch_t get_architecture(int*, sycl::queue* queue) {
  return record_with_arch(*queue).arch;
}

void get_architecture_and_stepping(int*, sycl::queue* queue, tarn_gpu_arch_t* arch,
                                   std::uint32_t* stepping) {
  store(arch, TARN_GPU_ARCH_UNKNOWN);
  store(stepping, 0u);
  const device_record& record = record_with_arch(*queue);
  store(arch, record.arch);
  store(stepping, record.stepping);
}

std::uint32_t get_device_flags(int*, sycl::queue* queue) {
  return record_with_arch(*queue).flags;
}

int get_tile_count(sycl::queue* queue) {
  return record_of(*queue).tile_count;
}

int get_eu_count(sycl::queue* queue) {
  return record_of(*queue).eu_count;
}

int tarn_gpu_get_max_workgroup_size(sycl::queue* queue) {
  return record_of(*queue).max_workgroup_size;
}

void tarn_gpu_get_cl_device_context(int*, sycl::queue* queue, cl_device_id* device,
                                    cl_context* context) {
  store<cl_device_id>(device, nullptr);
  store<cl_context>(context, nullptr);
  const opencl_counterpart found = opencl_objects(*queue);
  store(device, found.device);
  store(context, found.context);
}

}  // namespace kestrel::tarn::gpu
