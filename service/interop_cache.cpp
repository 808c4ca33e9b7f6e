// SPDX-License-Identifier: Apache-2.0
// Reading of interop objects, and the two caches.
#include "interop_cache.hpp"

#include <cstdint>
#include <optional>

#include "handle_cache.hpp"
#include "openmp_binding.hpp"
#include "sycl_extensions.hpp"

namespace kestrel::tarn::gpu {
namespace {

// Constructed when the library is loaded, gone when the process exits.
handle_cache<sycl::context> contexts;
handle_cache<sycl::queue> queues;

/// Numbers of properties that the offload runtime knows.
enum interop_property : int {
  context_property = 5,
  device_property = 6,
  queue_property = 7,
  kind_property = 8,  // the value itself, not where it stands
  device_of_kind_2_property = 9,
  in_order_property = 10
};

/// What the runtime calls Level Zero.
constexpr std::uintptr_t kind_2 = 2;

struct interop_handles {
  tarn_gpu_backend_t backend;
  void* device;
  void* context;
  void* queue;
};

std::optional<interop_handles> read_handles(void* interop) {
  const auto read = [interop](int property, void** value) {
    return omp_interop::__tgt_get_interop_property(interop, property, value) == 0;
  };
  void* kind = nullptr;
  if (!read(kind_property, &kind)) {
    return std::nullopt;
  }
  const bool is_kind_2 = reinterpret_cast<std::uintptr_t>(kind) == kind_2;
  interop_handles handles{is_kind_2 ? TARN_GPU_BACKEND_LEVEL_ZERO : TARN_GPU_BACKEND_OPENCL,
                          nullptr, nullptr, nullptr};
  if (!read(is_kind_2 ? device_of_kind_2_property : device_property, &handles.device) ||
      !read(context_property, &handles.context) || !read(queue_property, &handles.queue)) {
    return std::nullopt;
  }
  return handles;
}

bool is_in_order(const void* interop) {
  int status = 0;
  return interop != nullptr &&
         omp_interop::omp_get_interop_int(interop, in_order_property, &status) != 0 && status == 0;
}

/// Devices of OpenCL have kinds of their own, so that no reference to one needs to be taken.
sycl::device device_behind(const void* native) {
  for (const sycl::platform& platform : sycl::platform::get_platforms()) {
    for (const sycl::device& device : platform.get_devices()) {
      if (service::code_of(device.get_backend()) != service::backend_code::opencl &&
          service::native_of(device) == native) {
        return device;
      }
    }
  }
  throw sycl::exception(sycl::make_error_code(sycl::errc::invalid),
                        "Native device isn't exposed to SYCL.");
}

}  // namespace

sycl::context* lookup_and_cache_lumen_context(void* native_context, void* native_device_or_null,
                                              tarn_gpu_backend_t backend, sycl::device* device) {
  if (sycl::context* const known = contexts.find(native_context)) {
    return known;
  }
  if (backend != TARN_GPU_BACKEND_LEVEL_ZERO) {
    return contexts.insert(native_context, service::make_opencl_context(native_context));
  }
  const sycl::device only = device != nullptr ? *device : device_behind(native_device_or_null);
  return contexts.insert(native_context, service::make_context(native_context, only));
}

sycl::queue* lookup_and_cache_lumen_queue(void* native_queue, tarn_gpu_backend_t /*backend*/,
                                          sycl::context context, void* interop) {
  if (sycl::queue* const known = queues.find(native_queue)) {
    return known;
  }
  const bool in_order = is_in_order(interop);
  const sycl::device first = context.get_devices().front();
  return queues.insert(native_queue, service::make_queue(native_queue, context, first, in_order));
}

sycl::queue* lookup_and_cache_lumen_queue_and_context(void* interop) {
  const std::optional<interop_handles> handles = read_handles(interop);
  if (!handles) {
    return nullptr;
  }
  if (sycl::queue* const known = queues.find(handles->queue)) {
    return known;
  }
  const sycl::context* const context =
      lookup_and_cache_lumen_context(handles->context, handles->device, handles->backend, nullptr);
  return lookup_and_cache_lumen_queue(handles->queue, handles->backend, *context, interop);
}

}  // namespace kestrel::tarn::gpu
