// SPDX-License-Identifier: Apache-2.0
// splice_kernel does what replace_kernel does, with the number of each fault, and differs at most
// in the checksum, the former patch list, and types of sections.
#include <tarn_serv.h>

#include "exceptions.hpp"
#include "fuzz_mutator.hpp"
#include "fuzz_support.hpp"
#include "replace_kernel.hpp"
#include "splice_kernel.hpp"

namespace {

using namespace kestrel::tarn::forge;

int status_of_replacing(const tarn_test::splice_input& input, byte_vector& result) {
  try {
    result = replace_kernel(input.binary, input.code, input.patches);
    return 0;
  } catch (const crate::bad_elf&) {
    return splice_no_elf;
  } catch (const crate::no_binary_section&) {
    return splice_no_program;
  } catch (const crate::bad_binary_section&) {
    return splice_bad_program;
  } catch (const crate::invalid_checksum&) {
    return splice_bad_checksum;
  }
}

void fill(byte_vector& bytes, std::uint64_t at, std::uint64_t count) {
  std::fill_n(bytes.begin() + static_cast<std::ptrdiff_t>(at), count, std::uint8_t{0});
}

/// Zeros for all that the two results may differ in.
byte_vector without_differences(byte_vector result, std::uint64_t patches_size) {
  const elf_view elf = *elf_view::open(byte_view(result));
  program_section program;
  kernel_parts kernel;
  tarn_test::require(find_program(elf, program) == binary_fault::none &&
                         find_kernel(elf, program, kernel) == binary_fault::none,
                     "the result is a binary again");
  fill(result, kernel.header_at, sizeof kernel.header.checksum);
  fill(result, kernel.patches, kernel.end - kernel.patches - patches_size);
  for (unsigned i = 0; i < elf.header().e_shnum; ++i) {
    const std::uint32_t type = elf.section(i).sh_type;
    if (type == SHT_STRTAB || type == section_type_driver_own) {
      fill(result, elf.section_at(i) + offsetof(Elf64_Shdr, sh_type), sizeof type);
    }
  }
  return result;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const tarn_test::splice_input input = tarn_test::splice_input_of(data, size);
  void* out = nullptr;
  std::size_t out_size = 1;
  const int status =
      splice_kernel(input.binary.data(), input.binary.size(), input.code.data(), input.code.size(),
                    input.patches.data(), input.patches.size(), &out, &out_size);
  byte_vector replaced;
  tarn_test::require(status == status_of_replacing(input, replaced), "status as the exception");
  tarn_test::require((out != nullptr) == (status == 0), "a block if and only if all went well");
  if (status == 0) {
    const byte_vector spliced = tarn_test::copy_of(static_cast<std::uint8_t*>(out), out_size);
    tarn_serv_free(out);
    tarn_test::require(without_differences(spliced, input.patches.size()) ==
                           without_differences(replaced, input.patches.size()),
                       "result as that of replace_kernel");
  } else {
    tarn_test::require(out_size == 0, "no size without a block");
  }
  return 0;
}
