// SPDX-License-Identifier: Apache-2.0
// A program is built for one device, and its binary for that device read.
#include "opencl_program.hpp"

#include <algorithm>
#include <cstddef>
#include <vector>

#include "exceptions.hpp"

namespace kestrel::tarn::forge {
namespace {

void check(cl_int status) {
  if (status != CL_SUCCESS) {
    throw opencl_error(status);
  }
}

/// Owns a program, so that it is released on every road out.
class owned_program {
 public:
  owned_program(const opencl_calls& opencl, cl_program program)
      : opencl_(opencl), program_(program) {}
  owned_program(const owned_program&) = delete;
  owned_program& operator=(const owned_program&) = delete;
  ~owned_program() {
    if (program_ != nullptr) {
      opencl_.clReleaseProgram(program_);
    }
  }

  cl_program get() const { return program_; }
  cl_int release() {
    const cl_program program = program_;
    program_ = nullptr;
    return opencl_.clReleaseProgram(program);
  }

 private:
  const opencl_calls& opencl_;
  cl_program program_;
};

/// A list that the program keeps with one entry for each of its devices.
template <typename T>
std::vector<T> per_device(const opencl_calls& opencl, cl_program program, cl_program_info what,
                          cl_uint devices) {
  std::vector<T> list(devices);
  check(opencl.clGetProgramInfo(program, what, devices * sizeof(T), list.data(), nullptr));
  return list;
}

// Numbers beyond these are a fault of the driver, and no memory is taken for them.
constexpr cl_uint most_devices = 4096;
constexpr std::size_t largest_binary = std::size_t{1} << 30;

}  // namespace

byte_vector program_binary(const opencl_calls& opencl, cl_program program, cl_device_id device) {
  cl_uint count = 0;
  check(opencl.clGetProgramInfo(program, CL_PROGRAM_NUM_DEVICES, sizeof count, &count, nullptr));
  if (count > most_devices) {
    throw opencl_error(CL_INVALID_VALUE);
  }
  const auto devices = per_device<cl_device_id>(opencl, program, CL_PROGRAM_DEVICES, count);
  const auto found = std::find(devices.begin(), devices.end(), device);
  if (found == devices.end()) {
    throw opencl_error(CL_INVALID_VALUE);
  }
  const auto at = static_cast<std::size_t>(found - devices.begin());
  const auto sizes = per_device<std::size_t>(opencl, program, CL_PROGRAM_BINARY_SIZES, count);
  if (sizes[at] > largest_binary) {
    throw opencl_error(CL_INVALID_VALUE);
  }
  byte_vector binary(sizes[at]);
  // The binaries of devices with a null pointer are left out.
  std::vector<unsigned char*> places(count);
  places[at] = binary.data();
  check(opencl.clGetProgramInfo(program, CL_PROGRAM_BINARIES, count * sizeof places[0],
                                places.data(), nullptr));
  return binary;
}

byte_vector compile_program(const opencl_calls& opencl, cl_context context, cl_device_id device,
                            const char* source, const char* options) {
  cl_int status = CL_SUCCESS;
  const cl_program made = opencl.clCreateProgramWithSource(context, 1, &source, nullptr, &status);
  check(status);
  owned_program program(opencl, made);
  check(opencl.clBuildProgram(made, 1, &device, options, nullptr, nullptr));
  byte_vector binary = program_binary(opencl, made, device);
  check(program.release());
  return binary;
}

}  // namespace kestrel::tarn::forge
