// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on OpenCL queues: what the library itself uses besides
// tarn_gpu_kernel.h.
#pragma once

#include "kernel_acquisition.hpp"

namespace kestrel::tarn::gpu::c_layer {

struct kernel_layer {
  using context = cl_context;
  using program = opencl_program;
  using kernel = opencl_kernel;

  static kernel_cache<kernel_layer>& cache();
  static opencl_program share(const opencl_program& present) { return shared_program(present); }
  static void give_back(int* status, opencl_program last);
  static void give_back_kernel(int* status, void* kernel);
  static bool table_made() { return true; }  // this layer's tables stay until the process ends

  opencl_program build(const kernel_request& request) const;
  opencl_kernel create_kernel(const opencl_program& from, const char* name) const;
  forge::byte_vector compile(const kernel_request& request, const program_code& source) const;

  program_place<kernel_layer> place;
};
static_assert(sizeof(program_entry<kernel_layer>) == 88, "eleven words");

/// Empties the tables of the layer: programs with their kernels, records of devices, and queues.
/// Nobody is known to call it in time, before the drivers have gone, so the library does not.
void clean_up(int* status);

}  // namespace kestrel::tarn::gpu::c_layer
