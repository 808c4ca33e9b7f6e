// SPDX-License-Identifier: Apache-2.0
// The interface of the self-test's kernel, and the two attempts at a container for its code.
#include "binary_generator.hpp"

#include <exception>
#include <sstream>
#include <string>

#include "elf_writer.hpp"
#include "opencl_program.hpp"
#include "replace_kernel.hpp"

namespace kestrel::tarn::forge {
namespace {

/// hw_unknown for architectures without generators.
hw_code hw_of_arch(gpu_arch arch) {
  switch (arch) {
    case gpu_arch::fir:
      return hw_fir;
    case gpu_arch::elm:
      return hw_elm;
    case gpu_arch::ash:
      return hw_ash;
    case gpu_arch::yew:
      return hw_yew;
    case gpu_arch::pine:
      return hw_pine;
    case gpu_arch::larch:
      return hw_larch;
    default:
      return hw_unknown;
  }
}

std::string build_options(const kernel_interface& kernel) {
  const bool many_registers = kernel.hw >= hw_yew && kernel.grf_count > 128;
  return many_registers ? "-cl-std=CL2.0 -cl-brine-256-GRF-per-thread" : "-cl-std=CL2.0";
}

/// Older format: the driver's own container for the dummy source, with our code in it. Empty
/// whatever goes wrong, since any failure shows that this driver makes another format.
byte_vector make_older(const kernel_interface& kernel, const byte_vector& code,
                       const opencl_device& target) {
  try {
    std::ostringstream source;
    kernel.emit_dummy_source(source);
    const byte_vector container =
        compile_program(target.calls, target.context, target.device, source.str().c_str(),
                        build_options(kernel).c_str());
    return replace_kernel(container, code, byte_vector());
  } catch (const std::exception&) {
    return {};
  }
}

/// Whether the driver takes the binary and builds it.
bool is_accepted(const byte_vector& binary, const opencl_device& target) {
  const unsigned char* data = binary.data();
  const std::size_t size = binary.size();
  cl_int binary_status = CL_SUCCESS;
  cl_int status = CL_SUCCESS;
  const cl_program program = target.calls.clCreateProgramWithBinary(
      target.context, 1, &target.device, &size, &data, &binary_status, &status);
  if (status != CL_SUCCESS && program != nullptr) {
    target.calls.clReleaseProgram(program);
  }
  if (program == nullptr || status != CL_SUCCESS) {
    return false;
  }
  status = target.calls.clBuildProgram(program, 1, &target.device, "", nullptr, nullptr);
  target.calls.clReleaseProgram(program);
  return binary_status == CL_SUCCESS && status == CL_SUCCESS;
}

/// Newer format: a container of our own, tried once for each process.
byte_vector make_newer(const kernel_interface& kernel, const byte_vector& code,
                       const opencl_device& target, binary_formats& formats) {
  std::ostringstream metadata;
  kernel.emit_metadata(metadata);
  byte_vector binary =
      write_binary(core_family_of_hw(kernel.hw), kernel.kernel_name, metadata.str(), code);
  if (formats.elf_confirmed) {
    return binary;
  }
  if (!is_accepted(binary, target)) {
    formats.prefer_elf = false;
    return {};
  }
  formats.elf_confirmed = true;
  return binary;
}

}  // namespace

byte_vector generate_code(kernel_interface&) {
  return {};
}

kernel_interface binary_test_interface(hw_code hw) {
  kernel_interface kernel(hw);
  kernel.kernel_name = "binary_test";
  kernel.need_local_size = true;
  kernel.simd = 1;
  kernel.new_argument("src0", type_uint);
  kernel.new_argument("src1", type_ulong);
  kernel.new_argument("src2", type_ushort);
  kernel.new_argument("src3", type_ushort);
  kernel.new_argument("src4", type_ulong);
  kernel.new_argument("src5", type_ulong);
  kernel.new_argument("src_ptr", type_ulong, argument_kind::global_pointer, default_access);
  kernel.new_argument("ok", type_ulong, argument_kind::global_pointer, default_access);
  kernel.finalize();
  return kernel;
}

binary_formats& process_formats() {
  static binary_formats formats;
  return formats;
}

byte_vector generate_binary(gpu_arch arch, const opencl_device& target, code_source generate,
                            binary_formats& formats) {
  const hw_code hw = hw_of_arch(arch);
  if (hw == hw_unknown) {
    return {};
  }
  kernel_interface kernel = binary_test_interface(hw);
  const byte_vector code = generate(kernel);
  if (code.empty()) {
    return {};
  }
  const bool newer_first = formats.prefer_elf;
  byte_vector binary =
      newer_first ? make_newer(kernel, code, target, formats) : make_older(kernel, code, target);
  if (binary.empty()) {
    binary =
        newer_first ? make_older(kernel, code, target) : make_newer(kernel, code, target, formats);
  }
  return binary;
}

}  // namespace kestrel::tarn::forge
