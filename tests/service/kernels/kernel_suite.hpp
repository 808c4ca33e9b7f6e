// SPDX-License-Identifier: Apache-2.0
// Kernels that tell which one they are, and what the suites of both layers share.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "../devices/opencl_gpu.hpp"
#include "../devices/serv_memory.hpp"
#include "tarn_gpu_kernel.h"

/// A program with a kernel `name` that has so many arguments and stores their number.
inline std::string taking(const std::string& name, int arguments) {
  std::string text = "kernel void " + name + "(global int* out";
  for (int i = 1; i < arguments; ++i) {
    text += ", int a" + std::to_string(i);
  }
  return text + ") { *out = " + std::to_string(arguments) + "; }\n";
}

/// By which kernels are told apart: drivers take long to get one ready to be launched.
inline int arguments_of(cl_kernel kernel) {
  cl_uint count = 0;
  const cl_int code = opencl_loader::get().clGetKernelInfo(kernel, CL_KERNEL_NUM_ARGS, sizeof count,
                                                           &count, nullptr);
  EXPECT_EQ(code, CL_SUCCESS);
  return static_cast<int>(count);
}

/// The binary of a program that is made of `source`.
inline std::vector<unsigned char> compiled(cl_context context, cl_device_id device,
                                           const std::string& source) {
  const opencl_loader::functions& cl = opencl_loader::get();
  const char* text = source.c_str();
  cl_program program = cl.clCreateProgramWithSource(context, 1, &text, nullptr, nullptr);
  EXPECT_EQ(cl.clBuildProgram(program, 1, &device, "", nullptr, nullptr), CL_SUCCESS);
  std::size_t size = 0;
  EXPECT_EQ(cl.clGetProgramInfo(program, CL_PROGRAM_BINARY_SIZES, sizeof size, &size, nullptr),
            CL_SUCCESS);
  std::vector<unsigned char> bytes(size);
  unsigned char* place = bytes.data();
  EXPECT_EQ(cl.clGetProgramInfo(program, CL_PROGRAM_BINARIES, sizeof place,
                                static_cast<void*>(&place), nullptr),
            CL_SUCCESS);
  cl.clReleaseProgram(program);
  return bytes;
}
