// SPDX-License-Identifier: Apache-2.0
// What the OpenCL layer for tests changes of what the driver says: its CPU is a GPU, and more where
// a test asks for it. opencl_gpu_layer.hpp says what each control does.
#pragma once

#include <CL/cl_layer.h>

#include "opencl_gpu_layer.hpp"

// The functions of the driver with the changes; the driver's own have to stay.
cl_icd_dispatch change_driver(const cl_icd_dispatch& below);

void answer(unsigned query, const void* bytes, std::size_t size);
void answer_fails(unsigned query, int code);
void take_source_as_il(bool on);
void fail_commands(int code);
void shift_clock(std::int64_t nanoseconds);
void reset_changes();
