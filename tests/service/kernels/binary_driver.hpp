// SPDX-License-Identifier: Apache-2.0
// A driver whose programs have a binary of the test's choice, and take any: stands between the
// library and the OpenCL loader, by the library's own table of entry points.
#pragma once

#include <algorithm>
#include <atomic>
#include <string>
#include <vector>

#include "kernel_suite.hpp"
#include "opencl_binding.hpp"

/// Another function in an entry of the table, until the end of the block.
class replaced_entry {
 public:
  replaced_entry(kestrel::tarn::gpu::opencl_function name, void* function)
      : place_(kestrel::tarn::gpu::opencl_runtime::functions[static_cast<std::size_t>(name)]) {
    kestrel::tarn::gpu::bind_opencl();
    usual_ = place_.exchange(function);
  }
  replaced_entry(const replaced_entry&) = delete;
  replaced_entry& operator=(const replaced_entry&) = delete;
  ~replaced_entry() { place_.store(usual_); }

 private:
  std::atomic<void*>& place_;
  void* usual_;
};

class binary_driver {
 public:
  using byte_vector = std::vector<unsigned char>;

  /// All programs have `binary`; from device code a program of `source` is made.
  binary_driver(byte_vector binary, std::string source) {
    all() = {std::move(binary), std::move(source), {}, {}};
  }

  /// The device code of each program that was made from some.
  const std::vector<byte_vector>& taken() const { return all().taken; }
  /// The options of each build.
  const std::vector<std::string>& options() const { return all().options; }

 private:
  using index = kestrel::tarn::gpu::opencl_function;

  struct state {
    byte_vector binary;
    std::string source;
    std::vector<byte_vector> taken;
    std::vector<std::string> options;
  };

  static state& all() {
    static state present;
    return present;
  }
  static cl_int CL_API_CALL program_info(cl_program program, cl_program_info what, std::size_t size,
                                         void* value, std::size_t* size_ret) {
    const byte_vector& binary = all().binary;
    // The driver does not write its own binary to where there is room for another one.
    const bool of_driver = what != CL_PROGRAM_BINARIES;
    const cl_int code = opencl_loader::get().clGetProgramInfo(
        program, what, of_driver ? size : 0, of_driver ? value : nullptr, size_ret);
    if (code == CL_SUCCESS && what == CL_PROGRAM_BINARY_SIZES) {
      *static_cast<std::size_t*>(value) = binary.size();
    } else if (code == CL_SUCCESS && what == CL_PROGRAM_BINARIES) {
      std::copy(binary.begin(), binary.end(), *static_cast<unsigned char**>(value));
    }
    return code;
  }

  static cl_program CL_API_CALL program_with_binary(cl_context context, cl_uint count,
                                                    const cl_device_id*, const std::size_t* sizes,
                                                    const unsigned char** binaries, cl_int*,
                                                    cl_int* code) {
    EXPECT_EQ(count, 1U);
    all().taken.emplace_back(*binaries, *binaries + *sizes);
    const char* text = all().source.c_str();
    return opencl_loader::get().clCreateProgramWithSource(context, 1, &text, nullptr, code);
  }

  static cl_int CL_API_CALL build_program(cl_program program, cl_uint count,
                                          const cl_device_id* devices, const char* options,
                                          void(CL_CALLBACK* notify)(cl_program, void*),
                                          void* data) {
    all().options.emplace_back(options == nullptr ? "(null)" : options);
    return opencl_loader::get().clBuildProgram(program, count, devices, options, notify, data);
  }

  replaced_entry program_info_{index::clGetProgramInfo, reinterpret_cast<void*>(&program_info)};
  replaced_entry program_with_binary_{index::clCreateProgramWithBinary,
                                      reinterpret_cast<void*>(&program_with_binary)};
  replaced_entry build_program_{index::clBuildProgram, reinterpret_cast<void*>(&build_program)};
};
