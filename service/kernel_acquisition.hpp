// SPDX-License-Identifier: Apache-2.0
// The road from a caller's source, SPIR-V or device code to a kernel, for both layers.
//
// A `Layer` has what kernel_cache.hpp asks of it, and is an object for a queue, with
//   cache()                           static; the layer's table
//   place                             of the queue
//   build(request)                    a program from request.code
//   create_kernel(program, name)
//   compile(request, code)            the binary of a source, for the device
#pragma once

#include <memory>
#include <utility>

#include "kernel_cache.hpp"
#include "opencl_kernels.hpp"

namespace kestrel::tarn::gpu {

struct kernel_request {
  kernel_key key;
  const char* kernel_name;  // null: the name of the program
  program_code code{};
  forge::byte_view payload{};
  bool use_cache = true;           // look for the program before it is built
  bool want_cached_kernel = true;  // a handle of the cache, and not a private one
};

kernel_request source_request(std::int32_t domain, const char* program_name, const char* source,
                              const char* kernel_name, const char* options);
kernel_request spirv_request(std::int32_t domain, const tarn_gpu_spirv_kernel_t& spirv,
                             const char* kernel_name, const char* options);
kernel_request keyed_request(std::int32_t domain, const char* kernel_name, forge::byte_view blob);

struct serv_free {
  void operator()(void* block) const { tarn_serv_free(block); }
};

struct spliced_binary {
  std::unique_ptr<void, serv_free> data;
  std::size_t size;
};

/// Device code in a container that a driver made. \throws forge::opencl_error with the code of
/// forge::splice_kernel less 2,000, an empty container being no ELF file
spliced_binary splice(forge::byte_view container, forge::byte_view code);

/// A payload as callers get it; either pointer may be null.
void hand_out(forge::byte_view payload, const void** data, std::size_t* size);

/// A program from the cache, or one that `build` makes and that is cached then.
template <typename Layer, typename Build>
typename kernel_cache<Layer>::found_program provide_program(const program_place<Layer>& at,
                                                            const kernel_request& request,
                                                            Build build) {
  kernel_cache<Layer>& cache = Layer::cache();
  typename kernel_cache<Layer>::found_program found;
  if (request.use_cache) {
    found = cache.fetch(at, request.key, request.want_cached_kernel);
  }
  if (found.where == nullptr) {
    found.reference = build();
    found.where = cache.insert(at, request.key, request.payload, found.reference);
  }
  return found;
}

template <typename Layer>
tarn_gpu_kernel_struct_t* kernel_of(const Layer& layer,
                                    const typename kernel_cache<Layer>::found_program& found,
                                    const kernel_request& request) {
  if (found.kernel != nullptr) {
    return found.kernel;
  }
  const char* const name = request.kernel_name != nullptr ? request.kernel_name : found.where->name;
  typename Layer::kernel kernel = layer.create_kernel(found.reference, name);
  return request.want_cached_kernel
             ? Layer::cache().add(*found.where, std::move(kernel))
             : kernel_cache<Layer>::make_handle(std::move(kernel), TARN_GPU_KERNEL_PRIVATE);
}

template <typename Layer>
tarn_gpu_kernel_struct_t* acquire(const Layer& layer, const kernel_request& request) {
  const auto found =
      provide_program<Layer>(layer.place, request, [&] { return layer.build(request); });
  return kernel_of(layer, found, request);
}

/// The kernel itself; its handle is given up.
template <typename Layer>
void* acquire_plain(const Layer& layer, kernel_request request) {
  request.want_cached_kernel = false;
  tarn_gpu_kernel_struct_t* const handle = acquire(layer, request);
  void* const kernel = handle->kernel;
  tarn_serv_free(handle);
  return kernel;
}

/// With a dummy source the payload is not kept, as callers of that road expect.
template <typename Layer>
tarn_gpu_kernel_struct_t* acquire_binary(const Layer& layer, kernel_request request,
                                         const tarn_gpu_binary_kernel_t& binary) {
  request.code = {program_format::binary, binary.code, binary.code_size, ""};
  if (binary.dummy_source == nullptr) {
    return acquire(layer, request);
  }
  const auto found = Layer::cache().fetch(layer.place, request.key, true);
  if (found.where != nullptr) {
    return kernel_of(layer, found, request);
  }
  const forge::byte_vector container = layer.compile(
      request, {program_format::source, binary.dummy_source, 0, binary.build_options});
  const spliced_binary spliced = splice(container, {binary.code, binary.code_size});
  request.code.data = spliced.data.get();
  request.code.size = spliced.size;
  request.payload = {};
  request.use_cache = false;
  return acquire(layer, request);
}

/// Null if there is no program.
template <typename Layer>
tarn_gpu_kernel_struct_t* acquire_cached(const Layer& layer, const kernel_request& request,
                                         forge::byte_view& payload) {
  const auto found = Layer::cache().fetch(layer.place, request.key, true);
  if (found.where == nullptr) {
    return nullptr;
  }
  payload = {found.where->payload, found.where->payload_len};
  return kernel_of(layer, found, request);
}

}  // namespace kestrel::tarn::gpu
