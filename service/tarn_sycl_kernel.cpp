// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on SYCL queues.
#include "tarn_sycl_kernel.hpp"

#include <new>
#include <string_view>

#include <kestrel/tarn/gpu/kernel.hpp>

#include "clean_up.hpp"
#include "kernel_failure.hpp"
#include "level_zero_kernels.hpp"
#include "tarn_sycl_device.hpp"

namespace kestrel::tarn::gpu {
namespace {

using layer_place = program_place<sycl_kernel_layer>;

struct opencl_objects {
  cl_device_id device = nullptr;
  cl_context context = nullptr;
};

opencl_objects opencl_objects_of(sycl::queue* queue) {
  int status = CL_SUCCESS;
  opencl_objects found;
  tarn_gpu_get_cl_device_context(&status, queue, &found.device, &found.context);
  return found;
}

/// None where nothing is built for the backend.
std::optional<sycl_kernel_layer> layer_of(sycl::queue* queue) {
  switch (get_backend(queue)) {
    case TARN_GPU_BACKEND_OPENCL: {
      const opencl_objects of_queue = opencl_objects_of(queue);
      return sycl_kernel_layer{
          {of_queue.device, {of_queue.context, queue->get_context()}, TARN_GPU_BACKEND_OPENCL},
          queue};
    }
    case TARN_GPU_BACKEND_LEVEL_ZERO: {
      int status = CL_SUCCESS;
      return sycl_kernel_layer{{get_device_id(&status, queue),
                                {nullptr, queue->get_context()},
                                TARN_GPU_BACKEND_LEVEL_ZERO},
                               queue};
    }
    default:
      return std::nullopt;
  }
}

/// What `work` makes of the layer's object for the queue, and what it throws as SYCL throws it.
template <typename Work>
auto on_queue(sycl::queue* queue, const kernel_of_domain& kernel, Work work)
    -> decltype(work(std::declval<const sycl_kernel_layer&>())) {
  try {
    const std::optional<sycl_kernel_layer> layer = layer_of(queue);
    return layer ? work(*layer) : nullptr;
  } catch (const build_error& error) {
    throw kernel_failure(error, queue->get_device(), kernel);
  } catch (const forge::opencl_error& error) {
    throw kernel_failure(error, queue->get_device(), kernel);
  } catch (const forge::level_zero_error& error) {
    throw kernel_failure(error, queue->get_device(), kernel);
  } catch (const std::bad_alloc&) {
    throw kernel_failure(forge::opencl_error(CL_OUT_OF_HOST_MEMORY), queue->get_device(), kernel);
  }
}

void clean_up_sycl_layer(void*) {
  int ignored = CL_SUCCESS;
  sycl_kernel_layer::cache().clear(&ignored);
  sycl_tables().clear();
}

/// For one use only: later tests of the driver are not to find what an earlier one has made.
bool is_self_test(const kernel_request& request) {
  return request.kernel_name != nullptr && request.kernel_name == std::string_view("binary_test");
}

/// By the queue's own device, which is OpenCL's.
opencl_program build_here(const layer_place& place, const program_code& code) {
  return build_program(static_cast<cl_device_id>(place.device),
                       static_cast<cl_context>(place.context.native), code);
}

/// Level Zero compiles no source, so the OpenCL device of the same hardware does. What is compiled
/// only for other code to take its place is not kept: the key is that of the program that comes
/// out.
forge::byte_vector compile_elsewhere(const kernel_request& request, const program_code& source,
                                     const opencl_objects& where) {
  const auto build = [&] { return build_program(where.device, where.context, source); };
  if (request.code.format != program_format::source || is_self_test(request)) {
    return binary_of(build(), where.device);
  }
  kernel_request alone = request;
  alone.payload = {};
  alone.use_cache = true;
  alone.want_cached_kernel = false;
  const layer_place place{where.device, {where.context, std::nullopt}, TARN_GPU_BACKEND_OPENCL};
  const auto found =
      provide_program<sycl_kernel_layer>(place, alone, [&] { return sycl_layer_program(build()); });
  return binary_of(opencl_program_of(found.reference), where.device);
}

}  // namespace

kernel_cache<sycl_kernel_layer>& sycl_kernel_layer::cache() {
  static kernel_cache<sycl_kernel_layer> all;
  return all;
}

sycl_layer_program sycl_kernel_layer::share(const sycl_layer_program& present) {
  if (const auto* const alone = std::get_if<opencl_program>(&present)) {
    return shared_program(*alone);
  }
  return std::get<service::kernel_bundle>(present);
}

void sycl_kernel_layer::give_back(int*, sycl_layer_program) {}

void sycl_kernel_layer::give_back_kernel(int*, void* last) {
  delete static_cast<service::kernel*>(last);
}

bool sycl_kernel_layer::table_made() {
  return register_sycl_destructor_nolock(clean_up_sycl_layer);
}

sycl_layer_program sycl_kernel_layer::build(const kernel_request& request) const {
  const sycl::context& owner = *place.context.owner;
  if (place.backend == TARN_GPU_BACKEND_OPENCL) {
    const opencl_program built = build_here(place, request.code);
    return service::make_kernel_bundle(built.get(), owner);
  }
  if (request.code.format != program_format::source) {
    return build_module(place.device, owner, request.code);
  }
  const forge::byte_vector binary = compile(request, request.code);
  return build_module(place.device, owner,
                      {program_format::binary, binary.data(), binary.size(), request.code.options});
}

sycl_kernel_layer::kernel sycl_kernel_layer::create_kernel(const sycl_layer_program& from,
                                                           const char* name) const {
  const sycl::context& owner = *place.context.owner;
  if (place.backend == TARN_GPU_BACKEND_LEVEL_ZERO) {
    return gpu::create_kernel(std::get<service::kernel_bundle>(from), owner, name);
  }
  const opencl_kernel native = gpu::create_kernel(opencl_program_of(from), name);
  return std::make_unique<service::kernel>(service::make_kernel(native.get(), owner, nullptr));
}

forge::byte_vector sycl_kernel_layer::compile(const kernel_request& request,
                                              const program_code& source) const {
  if (place.backend == TARN_GPU_BACKEND_LEVEL_ZERO) {
    return compile_elsewhere(request, source, opencl_objects_of(queue));
  }
  return binary_of(build_here(place, source), static_cast<cl_device_id>(place.device));
}

opencl_program opencl_program_of(const sycl_layer_program& program) {
  if (const auto* const alone = std::get_if<opencl_program>(&program)) {
    return shared_program(*alone);
  }
  const auto& bundle = std::get<service::kernel_bundle>(program);
  return opencl_program(static_cast<cl_program>(service::native_of(bundle)));
}

tarn_gpu_kernel_struct_t* get_OCL_kernel(int*, sycl::queue* queue, int domain, const char* source,
                                         const char* kernel_name, const char* build_options) {
  return on_queue(queue, {domain, kernel_name}, [&](const sycl_kernel_layer& layer) {
    return acquire(layer, source_request(domain, kernel_name, source, kernel_name, build_options));
  });
}

void* get_OCL_kernel_by_progname(int*, sycl::queue* queue, int domain, const char* program_name,
                                 const char* source, const char* kernel_name,
                                 const char* build_options) {
  return on_queue(queue, {domain, kernel_name}, [&](const sycl_kernel_layer& layer) {
    return acquire_plain(layer,
                         source_request(domain, program_name, source, kernel_name, build_options));
  });
}

tarn_gpu_kernel_struct_t* tarn_gpu_get_spirv_kernel(int*, sycl::queue* queue, int domain,
                                                    const tarn_gpu_spirv_kernel_t* spirv,
                                                    const char* kernel_name,
                                                    const char* build_options) {
  return on_queue(queue, {domain, kernel_name}, [&](const sycl_kernel_layer& layer) {
    return acquire(layer, spirv_request(domain, *spirv, kernel_name, build_options));
  });
}

tarn_gpu_kernel_struct_t* get_binary_kernel(int* status, sycl::queue* queue, int domain,
                                            const tarn_gpu_binary_kernel_t* binary,
                                            const char* kernel_name) {
  return tarn_gpu_get_binary_kernel_ext(status, queue, domain, binary, kernel_name, nullptr, 0,
                                        nullptr, 0);
}

tarn_gpu_kernel_struct_t* tarn_gpu_get_binary_kernel_ext(int*, sycl::queue* queue, int domain,
                                                         const tarn_gpu_binary_kernel_t* binary,
                                                         const char* kernel_name, const void* key,
                                                         std::size_t key_len, const void* payload,
                                                         std::size_t payload_len) {
  return on_queue(queue, {domain, kernel_name}, [&](const sycl_kernel_layer& layer) {
    kernel_request request = keyed_request(domain, kernel_name, bytes_of(key, key_len));
    request.payload = bytes_of(payload, payload_len);
    return acquire_binary(layer, request, *binary);
  });
}

tarn_gpu_kernel_struct_t* tarn_gpu_get_cached_kernel(int*, sycl::queue* queue, int domain,
                                                     const char* kernel_name, const void* key,
                                                     std::size_t key_len, const void** payload_out,
                                                     std::size_t* payload_len_out) {
  forge::byte_view payload;
  tarn_gpu_kernel_struct_t* const handle =
      on_queue(queue, {domain, kernel_name}, [&](const sycl_kernel_layer& layer) {
        return acquire_cached(layer, keyed_request(domain, kernel_name, bytes_of(key, key_len)),
                              payload);
      });
  hand_out(payload, payload_out, payload_len_out);
  return handle;
}

void release_kernel(int* status, tarn_gpu_kernel_struct_t* handle) {
  release_handle<sycl_kernel_layer>(status, handle);
}

void release_kernel_obj(int* status, void* kernel) {
  sycl_kernel_layer::give_back_kernel(status, kernel);
}

}  // namespace kestrel::tarn::gpu
