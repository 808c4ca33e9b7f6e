// SPDX-License-Identifier: Apache-2.0
// Identification of devices, the layer on OpenCL queues.
#include "tarn_gpu_int.hpp"

#include "detection_calls.hpp"
#include "first_status.hpp"
#include "opencl_binding.hpp"

namespace kestrel::tarn::gpu::c_layer {
namespace {

template <typename Handle>
std::optional<Handle> ask(int* status, cl_command_queue queue, cl_command_queue_info what) {
  Handle handle = nullptr;
  const cl_int code =
      cl::clGetCommandQueueInfo(queue, what, sizeof handle, static_cast<void*>(&handle), nullptr);
  if (code != CL_SUCCESS) {
    keep_first(status, code);
    return std::nullopt;
  }
  return handle;
}

std::optional<void*> device_of(int* status, cl_command_queue queue) {
  return tables().queues.device_of(queue, [&] {
    return std::optional<void*>(ask<cl_device_id>(status, queue, CL_QUEUE_DEVICE));
  });
}

forge::detected_hw detect(const device_record& record, cl_command_queue queue) {
  int status = 0;
  const std::optional<cl_context> context = ask<cl_context>(&status, queue, CL_QUEUE_CONTEXT);
  if (!context) {
    return {};
  }
  return forge::detect_hw({record.device_id, *context}, forge::native_backend::opencl,
                          bound_detection_calls());
}

int copy_info(const device_record* record, tarn_gpu_device_info_t* info) {
  if (record == nullptr) {
    return 1;
  }
  *info = copy_of(*record);
  return 0;
}

}  // namespace

layer_tables& tables() {
  static layer_tables all;
  return all;
}

device_record* record_of(int* status, cl_command_queue queue) {
  const std::optional<void*> device = device_of(status, queue);
  if (!device) {
    return nullptr;
  }
  device_record* const record = tables().infos.record_of(*device, [](device_record& made) {
    made.backend = TARN_GPU_BACKEND_OPENCL;
    fill_opencl_counts(made);
  });
  if (record == nullptr) {
    keep_first(status, CL_OUT_OF_HOST_MEMORY);
  }
  return record;
}

device_record* record_with_arch(int* status, cl_command_queue queue) {
  device_record* const record = record_of(status, queue);
  if (record != nullptr) {
    decide_architecture(*record, [&] { return detect(*record, queue); });
  }
  return record;
}

tarn_gpu_backend_t get_backend(cl_command_queue queue) {
  int status = 0;
  const device_record* const record = record_of(&status, queue);
  return record == nullptr ? TARN_GPU_BACKEND_UNKNOWN : record->backend;
}

}  // namespace kestrel::tarn::gpu::c_layer

using namespace kestrel::tarn::gpu;

// Keeps what fails to itself, as callers of this function expect: they look at the result.
void* tarn_serv_gpu_get_device_id(int*, cl_command_queue queue) {
  int status = 0;
  return c_layer::device_of(&status, queue).value_or(nullptr);
}

int tarn_serv_gpu_get_device_info(cl_command_queue queue, tarn_gpu_device_info_t* info) {
  int status = 0;
  return c_layer::copy_info(c_layer::record_of(&status, queue), info);
}

int tarn_serv_gpu_get_device_info_with_arch(cl_command_queue queue, tarn_gpu_device_info_t* info) {
  int status = 0;
  return c_layer::copy_info(c_layer::record_with_arch(&status, queue), info);
}

tarn_gpu_arch_t tarn_serv_gpu_get_architecture(int* status, cl_command_queue queue) {
  const device_record* const record = c_layer::record_with_arch(status, queue);
  return record == nullptr ? TARN_GPU_ARCH_UNKNOWN : record->arch;
}

void tarn_serv_gpu_get_architecture_and_stepping(int* status, cl_command_queue queue,
                                                 tarn_gpu_arch_t* arch, std::uint32_t* stepping) {
  const device_record* const record = c_layer::record_with_arch(status, queue);
  if (arch != nullptr) {
    *arch = record == nullptr ? TARN_GPU_ARCH_UNKNOWN : record->arch;
  }
  if (stepping != nullptr) {
    *stepping = record == nullptr ? 0 : record->stepping;
  }
}

std::uint32_t tarn_serv_gpu_get_device_flags(int* status, cl_command_queue queue) {
  const device_record* const record = c_layer::record_with_arch(status, queue);
  return record == nullptr ? 0 : record->flags;
}

int tarn_serv_gpu_get_tile_count(cl_command_queue queue) {
  int status = 0;
  const device_record* const record = c_layer::record_of(&status, queue);
  return record == nullptr ? 1 : record->tile_count;
}

int tarn_serv_gpu_get_eu_count(cl_command_queue queue) {
  int status = 0;
  const device_record* const record = c_layer::record_of(&status, queue);
  return record == nullptr ? 0 : record->eu_count;
}

int tarn_gpu_get_max_workgroup_size(cl_command_queue queue) {
  int status = 0;
  const device_record* const record = c_layer::record_of(&status, queue);
  return record == nullptr ? 0 : record->max_workgroup_size;
}

void tarn_gpu_get_cl_device_context(int* status, cl_command_queue queue, cl_device_id* device,
                                    cl_context* context) {
  cl_device_id found_device = nullptr;
  cl_context found_context = nullptr;
  const device_record* const record = c_layer::record_of(status, queue);
  if (record != nullptr && record->backend == TARN_GPU_BACKEND_OPENCL) {
    const auto asked = c_layer::ask<cl_context>(status, queue, CL_QUEUE_CONTEXT);
    found_device = asked ? static_cast<cl_device_id>(record->device_id) : nullptr;
    found_context = asked.value_or(nullptr);
  }
  if (device != nullptr) {
    *device = found_device;
  }
  if (context != nullptr) {
    *context = found_context;
  }
}
