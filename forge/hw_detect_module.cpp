// SPDX-License-Identifier: Apache-2.0
// The module, word for word (Khronos, SPIR-V 1.0, sections 2.3 and 3.32). It
// is what a translator makes of `kernel void _() {}`.
#include "hw_detect_module.hpp"

namespace kestrel::tarn::forge {
namespace {

/// The first word of an instruction: its length in words, and its number.
constexpr std::uint32_t instruction(std::uint32_t words, std::uint32_t opcode) {
  return words << 16 | opcode;
}

/// Four characters of a text, which ends with a NUL and zeros up to a whole word.
constexpr std::uint32_t text(char a, char b = 0, char c = 0, char d = 0) {
  return static_cast<std::uint32_t>(a) | static_cast<std::uint32_t>(b) << 8 |
         static_cast<std::uint32_t>(c) << 16 | static_cast<std::uint32_t>(d) << 24;
}

enum id : std::uint32_t {
  id_opencl_std = 1,
  id_void,
  id_function_type,
  id_kernel,
  id_entry,
  id_argument_types,
  id_bound
};

}  // namespace

// clang-format off
const std::uint32_t hw_detect_module[hw_detect_module_words] = {
    0x07230203,  // magic number
    0x00010000,  // version 1.0
    0x0006000E,  // generator
    id_bound,
    0,  // reserved
    instruction(2, 17), 4,  // OpCapability Addresses
    instruction(2, 17), 6,  // OpCapability Kernel
    instruction(5, 11), id_opencl_std,  // OpExtInstImport
        text('O', 'p', 'e', 'n'), text('C', 'L', '.', 's'), text('t', 'd'),
    instruction(3, 14), 2, 2,  // OpMemoryModel Physical64 OpenCL
    instruction(4, 15), 6, id_kernel, text('_'),  // OpEntryPoint Kernel
    instruction(7, 7), id_argument_types,  // OpString
        text('k', 'e', 'r', 'n'), text('e', 'l', '_', 'a'), text('r', 'g', '_', 't'),
        text('y', 'p', 'e', '.'), text('_', '.'),
    instruction(3, 3), 3, 102000,  // OpSource OpenCL_C 1.2
    instruction(4, 5), id_entry, text('e', 'n', 't', 'r'), text('y'),  // OpName
    instruction(2, 19), id_void,  // OpTypeVoid
    instruction(3, 33), id_function_type, id_void,  // OpTypeFunction
    instruction(5, 54), id_void, id_kernel, 0, id_function_type,  // OpFunction
    instruction(2, 248), id_entry,  // OpLabel
    instruction(1, 253),  // OpReturn
    instruction(1, 56),  // OpFunctionEnd
};
// clang-format on

}  // namespace kestrel::tarn::forge
