// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on OpenCL queues.
#include "tarn_gpu_kernel.hpp"

#include <new>
#include <optional>

#include "first_status.hpp"
#include "tarn_gpu_int.hpp"

namespace kestrel::tarn::gpu::c_layer {
namespace {

/// None where nothing is built for the backend.
std::optional<kernel_layer> layer_of(cl_command_queue queue) {
  int status = CL_SUCCESS;
  cl_device_id device = nullptr;
  cl_context context = nullptr;
  tarn_gpu_get_cl_device_context(&status, queue, &device, &context);
  check_opencl(status);
  if (device == nullptr) {
    return std::nullopt;
  }
  return kernel_layer{{device, context, TARN_GPU_BACKEND_OPENCL}};
}

/// What `work` makes of the layer's object for the queue; null, and a status, for what it throws.
template <typename Work>
auto on_queue(int* status, cl_command_queue queue, Work work)
    -> decltype(work(std::declval<const kernel_layer&>())) {
  try {
    const std::optional<kernel_layer> layer = layer_of(queue);
    return layer ? work(*layer) : nullptr;
  } catch (const forge::opencl_error& failure) {
    keep_first(status, failure.status);
  } catch (const std::bad_alloc&) {
    keep_first(status, CL_OUT_OF_HOST_MEMORY);
  }
  return nullptr;
}

}  // namespace

kernel_cache<kernel_layer>& kernel_layer::cache() {
  static kernel_cache<kernel_layer> all;
  return all;
}

void kernel_layer::give_back(int* status, opencl_program last) {
  keep_first(status, last.give_back());
}

void kernel_layer::give_back_kernel(int* status, void* kernel) {
  keep_first(status, release_object(static_cast<cl_kernel>(kernel)));
}

opencl_program kernel_layer::build(const kernel_request& request) const {
  return build_program(static_cast<cl_device_id>(place.device), place.context, request.code);
}

opencl_kernel kernel_layer::create_kernel(const opencl_program& from, const char* name) const {
  return gpu::create_kernel(from, name);
}

forge::byte_vector kernel_layer::compile(const kernel_request&, const program_code& source) const {
  const auto device = static_cast<cl_device_id>(place.device);
  return binary_of(build_program(device, place.context, source), device);
}

void clean_up(int* status) {
  kernel_layer::cache().clear(status);
  tables().clear();
}

}  // namespace kestrel::tarn::gpu::c_layer

using namespace kestrel::tarn::gpu;
using c_layer::kernel_layer;

tarn_gpu_kernel_struct_t* tarn_serv_gpu_get_OCL_kernel(int* status, cl_command_queue queue,
                                                       int domain, const char* source,
                                                       const char* kernel_name,
                                                       const char* build_options) {
  return c_layer::on_queue(status, queue, [&](const kernel_layer& layer) {
    return acquire(layer, source_request(domain, kernel_name, source, kernel_name, build_options));
  });
}

cl_kernel tarn_serv_gpu_get_OCL_kernel_by_progname(int* status, cl_command_queue queue, int domain,
                                                   const char* program_name, const char* source,
                                                   const char* kernel_name,
                                                   const char* build_options) {
  return c_layer::on_queue(status, queue, [&](const kernel_layer& layer) {
    return static_cast<cl_kernel>(acquire_plain(
        layer, source_request(domain, program_name, source, kernel_name, build_options)));
  });
}

tarn_gpu_kernel_struct_t* tarn_gpu_get_spirv_kernel(int* status, cl_command_queue queue, int domain,
                                                    const tarn_gpu_spirv_kernel_t* spirv,
                                                    const char* kernel_name,
                                                    const char* build_options) {
  return c_layer::on_queue(status, queue, [&](const kernel_layer& layer) {
    return acquire(layer, spirv_request(domain, *spirv, kernel_name, build_options));
  });
}

tarn_gpu_kernel_struct_t* tarn_serv_gpu_get_binary_kernel(int* status, cl_command_queue queue,
                                                          int domain,
                                                          const tarn_gpu_binary_kernel_t* binary,
                                                          const char* kernel_name) {
  return tarn_gpu_get_binary_kernel_ext(status, queue, domain, binary, kernel_name, nullptr, 0,
                                        nullptr, 0);
}

tarn_gpu_kernel_struct_t* tarn_gpu_get_binary_kernel_ext(int* status, cl_command_queue queue,
                                                         int domain,
                                                         const tarn_gpu_binary_kernel_t* binary,
                                                         const char* kernel_name, const void* key,
                                                         std::size_t key_len, const void* payload,
                                                         std::size_t payload_len) {
  return c_layer::on_queue(status, queue, [&](const kernel_layer& layer) {
    kernel_request request = keyed_request(domain, kernel_name, bytes_of(key, key_len));
    request.payload = bytes_of(payload, payload_len);
    return acquire_binary(layer, request, *binary);
  });
}

tarn_gpu_kernel_struct_t* tarn_gpu_get_cached_kernel(int* status, cl_command_queue queue,
                                                     int domain, const char* kernel_name,
                                                     const void* key, std::size_t key_len,
                                                     const void** payload_out,
                                                     std::size_t* payload_len_out) {
  kestrel::tarn::forge::byte_view payload;
  tarn_gpu_kernel_struct_t* const handle =
      c_layer::on_queue(status, queue, [&](const kernel_layer& layer) {
        return acquire_cached(layer, keyed_request(domain, kernel_name, bytes_of(key, key_len)),
                              payload);
      });
  hand_out(payload, payload_out, payload_len_out);
  return handle;
}

void tarn_serv_gpu_release_kernel(int* status, tarn_gpu_kernel_struct_t* handle) {
  release_handle<kernel_layer>(status, handle);
}

void tarn_serv_gpu_release_kernel_obj(int* status, cl_kernel kernel) {
  if (kernel != nullptr) {
    kernel_layer::give_back_kernel(status, kernel);
  }
}
