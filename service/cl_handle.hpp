// SPDX-License-Identifier: Apache-2.0
// A queue with its device, its context and a table of kernels by name. Exported functions make and
// destroy a handle; the table's operations are for the library's own use.
#pragma once

#include <cstdint>

#include <CL/cl.h>

#include "tarn_gpu_kernel.h"

namespace kestrel::tarn::gpu {

struct named_kernel {
  char* name;  // owned, as is the kernel
  cl_kernel kernel;
  named_kernel* next;
};

struct kernel_names {
  static constexpr std::uint64_t bucket_total = 1021;

  std::uint64_t bucket_count;
  std::uint64_t count;
  named_kernel** buckets;
};
static_assert(sizeof(kernel_names) == 24);

/// Spreads names over buckets.
std::uint64_t name_hash(const char* name);

/// Finds a kernel, which stays the table's. \returns 0; -34 for a null handle or table, -46 for a
/// name that is not there, and `*kernel` as it was
int find_kernel(const cl_handle* handle, const char* name, cl_kernel* kernel);

/// Puts a kernel in, which then is the table's; one with the same name is released. \returns 0; -34
/// for a null handle or table, -6 when memory is exhausted, and the kernel stays the caller's
int insert_kernel(cl_handle* handle, const char* name, cl_kernel kernel);

}  // namespace kestrel::tarn::gpu

struct cl_handle {
  cl_command_queue queue;
  cl_device_id device;
  cl_context context;
  kestrel::tarn::gpu::kernel_names* kernels;
};
static_assert(sizeof(cl_handle) == 32);
