// SPDX-License-Identifier: Apache-2.0
// The dummy kernel in OpenCL C. Its body is never run: it only makes a compiler reserve what the
// code that takes its place needs.
#include <iterator>
#include <ostream>
#include <string>

#include "kernel_interface.hpp"

namespace kestrel::tarn::forge {
namespace {

using std::to_string;

constexpr const char* type_names[] = {"uint",   "int",   "ushort", "short", "uchar", "char",
                                      "double", "float", "ulong",  "long",  "half",  "ushort"};

std::string type_name(argument_type type) {
  const std::size_t base = type & 0x0F;
  return base < std::size(type_names) ? type_names[base] : "INVALID";
}

std::string attributes(const kernel_interface& kernel) {
  std::string text;
  if (kernel.has_work_group_size()) {
    const auto& size = kernel.work_group_size;
    text += "__attribute__((reqd_work_group_size(" + to_string(size[0]) + "," + to_string(size[1]) +
            "," + to_string(size[2]) + ")))\n";
  }
  const auto& order = kernel.walk_order;
  if (order[0] >= 0) {
    text += "__attribute__((brine_reqd_workgroup_walk_order(" + to_string(order[0]) + "," +
            to_string(order[1]) + (order[2] >= 0 ? "," + to_string(order[2]) : "") + ")))\n";
  }
  return text + "__attribute__((brine_reqd_sub_group_size(" + to_string(kernel.simd) + ")))\n";
}

std::string parameter(const kernel_argument& argument) {
  switch (argument.kind) {
    case argument_kind::global_pointer:
      return "global uint *" + argument.name;
    case argument_kind::local_pointer:
      return "local uint *" + argument.name;
    default:
      return type_name(argument.type) + " " + argument.name;
  }
}

std::string signature(const kernel_interface& kernel) {
  std::string parameters;
  for (const kernel_argument& argument : kernel.arguments) {
    if (argument.kind != argument_kind::hidden) {
      parameters += (parameters.empty() ? "" : ", ") + parameter(argument);
    }
  }
  return "kernel void " + kernel.kernel_name + "(" + parameters + ") {\n";
}

std::string barriers(std::int32_t count) {
  std::string text;
  if (count > 0) {
    text += "    __asm__ volatile(\"barrier\");\n";
  }
  for (std::int32_t i = 1; i < count; ++i) {
    const std::string name = "bar" + to_string(i);
    text += "    local NamedBarrier_t *" + name + " = named_barrier_init(1);\n" +
            "    work_group_named_barrier(" + name + ", 0);\n";
  }
  return text;
}

// Things of the device that a compiler provides for only if it sees them used.
std::string features(const kernel_interface& kernel) {
  std::string text;
  if (kernel.need_local_id) {
    text += "    (void) ____[get_local_id(0)];\n";
  }
  if (kernel.use_enqueued_local_size) {
    text += "    (void) ____[get_enqueued_local_size(0)];\n";
  }
  text += barriers(kernel.barrier_count);
  if (kernel.use_dpas) {
    // The result is stored, lest the call be dropped.
    text +=
        "    int __builtin_IB_sub_group_idpas_s8_s8_8_1(int, int, int8) "
        "__attribute__((const));\n"
        "    int z = __builtin_IB_sub_group_idpas_s8_s8_8_1(0, ____[0], "
        "(int8)(0)); ____[0] = z;\n";
  }
  if (kernel.use_global_atomics) {
    text += "    atomic_inc(____);\n";
  }
  if (kernel.scratch_size != 0) {
    text += "    volatile char scratch[" + to_string(kernel.scratch_size) + "] = {0};\n";
  }
  if (kernel.slm_size != 0) {
    text += "    volatile local char slm[" + to_string(kernel.slm_size) + "]; slm[0]++;\n";
  }
  if (kernel.disable_preemption && kernel.hw == hw_fir) {
    text += "    volatile double *__df; *__df = 1.1 / *__df;\n";
  }
  return text;
}

// Each way to a pointer's memory is used once, so that the container provides for it.
std::string accesses(const kernel_interface& kernel) {
  std::string text;
  for (const kernel_argument& argument : kernel.arguments) {
    if (kernel.hw >= hw_oak && has_access(argument, stateless_access)) {
      text += "    __asm__ volatile(\"\" :: \"rw.u\"(" + argument.name + "));\n";
    }
  }
  for (const kernel_argument& argument : kernel.arguments) {
    if (has_access(argument, surface_access)) {
      text += "    { volatile uchar __load = ((global uchar *) " + argument.name +
              ")[get_local_id(0)];}\n";
    }
  }
  return text;
}

}  // namespace

void kernel_interface::emit_dummy_source(std::ostream& stream) const {
  require_finalized();
  const std::string text =
      std::string(need_half ? "#pragma OPENCL EXTENSION cl_khr_fp16 : enable\n" : "") +
      (need_double ? "#pragma OPENCL EXTENSION cl_khr_fp64 : enable\n" : "") + attributes(*this) +
      signature(*this) + "    global volatile int *____;\n" + features(*this) + accesses(*this) +
      "}\n";
  stream.write(text.data(), static_cast<std::streamsize>(text.size()));
}

}  // namespace kestrel::tarn::forge
