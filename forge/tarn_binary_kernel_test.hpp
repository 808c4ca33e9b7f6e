// SPDX-License-Identifier: Apache-2.0
// The self-test of native kernel support: is code that did not come from the driver's own compiler
// safe on this driver? One kernel compares its arguments and work-group size with what it expects.
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>

#include "binary_generator.hpp"

namespace kestrel::tarn::forge {

/// What the self-test uses of a device's record. It lives as long as the process.
struct self_test_record {
  int* lock;  // of the record; null where there is no record
  std::atomic<bool>* binary_checked;
  std::atomic<bool>* binary_usable;
  gpu_arch arch;
};

/// A kernel in device code, for the kernel service.
struct binary_kernel {
  std::size_t code_size;
  const void* code;
  const char* dummy_source;  // null: the code is a complete program binary
  const char* build_options;
};

enum class buffer_access : std::int32_t { read, write, read_write };

/// An argument of a launch.
struct launch_argument {
  void* buffer;          // null for a scalar
  buffer_access access;  // to the buffer
  std::uint64_t value;   // of a scalar, in the low bytes
  std::uint32_t size;    // of a scalar, in bytes
};

constexpr std::size_t test_argument_count = 8;
using launch_arguments = std::array<launch_argument, test_argument_count>;

/// The device services that the self-test calls; `queue`, kernels, buffers and events are theirs,
/// and are only passed on. A call that fails stores its code in `*status` if that is still 0, or
/// throws what derives from std::exception; it then returns null or false.
class device_services {
 public:
  virtual ~device_services() = default;

  /// The record of the queue's device, its architecture decided. The self-test then holds the
  /// record's lock while it makes the other calls.
  virtual self_test_record get_record(int* status, void* queue) = 0;

  /// Two nulls where the queue has no counterpart in OpenCL.
  virtual void get_cl_device_context(int* status, void* queue, cl_device_id* device,
                                     cl_context* context) = 0;

  /// The OpenCL functions; asked for only when the call above has given a device.
  virtual const opencl_calls& opencl() = 0;

  virtual void* get_binary_kernel(int* status, void* queue, int domain, const binary_kernel& binary,
                                  const char* kernel_name) = 0;

  /// A buffer of zeros.
  virtual void* calloc_temp_buffer(int* status, void* queue, std::size_t bytes) = 0;

  /// Fills a buffer of 4 bytes; done when it returns.
  virtual void write_buffer(int* status, void* queue, void* buffer, std::uint32_t value) = 0;

  /// Whether a buffer of 4 bytes holds something. What a passed test stores is seen by a look at
  /// the word as by one at the first byte.
  virtual bool is_non_zero(int* status, void* queue, void* buffer) = 0;

  /// `global` and `local` are three sizes each. The event of the launch.
  virtual void* launch_kernel_3D(int* status, void* queue, void* kernel,
                                 const launch_arguments& arguments, const std::size_t* global,
                                 const std::size_t* local) = 0;

  virtual void host_wait(int* status, void* event) = 0;
  virtual void release_event(int* status, void* event) = 0;
  virtual void free_buffer(int* status, void* buffer) = 0;
  virtual void release_kernel(int* status, void* kernel) = 0;
};

/// Whether precompiled kernels are safe on the queue's device. Found out once for each device, by
/// the first caller, while others wait; kept in the record. A failed test prints a warning on
/// standard output, unless there was nothing to test. Nothing that fails in the test itself is
/// reported otherwise: `*status` and exceptions tell only of a device without a record, whose
/// answer is false.
bool have_binary_kernels(int* status, void* queue, device_services& services,
                         code_source generate = generate_code);

}  // namespace kestrel::tarn::forge
