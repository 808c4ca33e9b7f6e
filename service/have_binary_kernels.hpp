// SPDX-License-Identifier: Apache-2.0
// The test of a device with precompiled kernels, with code from elsewhere: what the functions in
// tarn_gpu_kernel.h and kestrel/tarn/gpu/kernel.hpp do with the library's own.
#pragma once

#include <sycl/sycl.hpp>

#include "binary_generator.hpp"

struct _cl_command_queue;

namespace kestrel::tarn::gpu {

bool test_binary_kernels(int* status, _cl_command_queue* queue, forge::code_source generate);
bool test_binary_kernels(int* status, sycl::queue* queue, forge::code_source generate);

}  // namespace kestrel::tarn::gpu
