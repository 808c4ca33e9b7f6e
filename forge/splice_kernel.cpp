// SPDX-License-Identifier: Apache-2.0
// The splice with faults as numbers, and memory from the core.
#include "splice_kernel.hpp"

#include <cstdint>
#include <tarn_serv.h>

#include "kernel_splice.hpp"
#include "older_binary.hpp"

namespace kestrel::tarn::forge {
namespace {

constexpr std::size_t block_alignment = 16;

int status_of(binary_fault fault) {
  switch (fault) {
    case binary_fault::none:
      return 0;
    case binary_fault::no_elf:
      return splice_no_elf;
    case binary_fault::no_program:
      return splice_no_program;
    case binary_fault::bad_program:
      return splice_bad_program;
    case binary_fault::bad_checksum:
      return splice_bad_checksum;
    case binary_fault::too_large:
      return splice_no_memory;
  }
  return splice_bad_program;
}

bool is_missing(const void* data, std::size_t size) {
  return data == nullptr && size != 0;
}

}  // namespace

int splice_kernel(const void* binary, std::size_t size, const void* code, std::size_t code_size,
                  const void* patches, std::size_t patches_size, void** out,
                  std::size_t* out_size) noexcept {
  if (out == nullptr || out_size == nullptr) {
    return splice_no_elf;
  }
  *out = nullptr;
  *out_size = 0;
  if (binary == nullptr || is_missing(code, code_size) || is_missing(patches, patches_size)) {
    return splice_no_elf;
  }
  kernel_splice splice;
  const binary_fault fault =
      splice.plan({binary, size}, {code, code_size}, {patches, patches_size});
  if (fault != binary_fault::none) {
    return status_of(fault);
  }
  void* const block = tarn_serv_malloc(splice.size(), block_alignment);
  if (block == nullptr) {
    return splice_no_memory;
  }
  splice.write_neutral(static_cast<std::uint8_t*>(block));
  *out = block;
  *out_size = splice.size();
  return 0;
}

}  // namespace kestrel::tarn::forge
