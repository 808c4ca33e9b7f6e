// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on SYCL queues: what the library itself uses besides
// kestrel/tarn/gpu/kernel.hpp.
#pragma once

#include <memory>
#include <optional>
#include <variant>

#include <sycl/sycl.hpp>

#include "kernel_acquisition.hpp"
#include "sycl_extensions.hpp"

namespace kestrel::tarn::gpu {

/// By the native handle, which is OpenCL's, or else by the SYCL context. An entry of the cache
/// keeps the SYCL context alive, so that no other one comes to its place.
struct sycl_layer_context {
  void* native;
  std::optional<sycl::context> owner;  // none for programs that stand by themselves

  bool operator==(const sycl_layer_context& other) const {
    return native == other.native && (native != nullptr || owner == other.owner);
  }
};

/// A bundle. Or a program alone: OpenCL's, for what a Level Zero device is given.
using sycl_layer_program = std::variant<opencl_program, service::kernel_bundle>;

struct sycl_kernel_layer {
  using context = sycl_layer_context;
  using program = sycl_layer_program;
  using kernel = std::unique_ptr<service::kernel>;

  static kernel_cache<sycl_kernel_layer>& cache();
  static program share(const program& present);
  static void give_back(int* status, program last);
  static void give_back_kernel(int* status, void* kernel);
  static bool table_made();

  program build(const kernel_request& request) const;
  kernel create_kernel(const program& from, const char* name) const;
  forge::byte_vector compile(const kernel_request& request, const program_code& source) const;

  program_place<sycl_kernel_layer> place;
  sycl::queue* queue;
};

/// The program of OpenCL, with a reference for the caller.
opencl_program opencl_program_of(const sycl_layer_program& program);

}  // namespace kestrel::tarn::gpu
