// SPDX-License-Identifier: Apache-2.0
// Makes the program binary of the self-test's kernel: an interface, code for it, and a container
// around both that the driver at hand accepts.
#pragma once

#include <atomic>
#include <cstdint>

#include "bytes.hpp"
#include "kernel_interface.hpp"
#include "opencl_calls.hpp"

namespace kestrel::tarn::forge {

/// The architectures as the device services number them.
enum class gpu_arch : std::int32_t { unknown, fir, elm, ash, oak, yew, pine, larch };

/// Makes code for the hardware and the interface that `kernel` has. May settle on the way what only
/// the code decides: grf_count, skip_per_thread_offset. Empty where it has no encodings for the
/// hardware; throws what goes wrong.
using code_source = byte_vector (*)(kernel_interface& kernel);

/// The encodings of instructions belong to each generation's own tables, and none are at hand:
/// empty for all hardware. A generator for one would be asked here.
byte_vector generate_code(kernel_interface& kernel);

/// The interface of the self-test's kernel, finalized.
kernel_interface binary_test_interface(hw_code hw);

/// What is known of the driver's taste. Threads that find out at the same time do no more harm than
/// a trial build too many.
struct binary_formats {
  std::atomic<bool> prefer_elf{false};     // the newer format is tried first
  std::atomic<bool> elf_confirmed{false};  // it has been accepted before
};

/// The one of this process.
binary_formats& process_formats();

/// A device as OpenCL knows it.
struct opencl_device {
  const opencl_calls& calls;
  cl_context context;
  cl_device_id device;
};

/// A complete program binary of the kernel "binary_test": either format, in the order and after the
/// trials that `formats` says. Empty if `arch` is none that code is made for, if `generate` has
/// none, or if the driver accepts neither format; throws what goes wrong beside the driver.
byte_vector generate_binary(gpu_arch arch, const opencl_device& target, code_source generate,
                            binary_formats& formats);

}  // namespace kestrel::tarn::forge
