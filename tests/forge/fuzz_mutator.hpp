// SPDX-License-Identifier: Apache-2.0
// The mutator of the splicing targets: few of the fuzzer's own changes would get past the checksum,
// so that it is mostly made right again.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "binary_hash.hpp"
#include "elf_view.hpp"
#include "fuzz_support.hpp"
#include "older_binary.hpp"

extern "C" std::size_t LLVMFuzzerMutate(std::uint8_t* data, std::size_t size, std::size_t max_size);

namespace tarn_test {

inline void make_checksum_right(std::uint8_t* binary, std::size_t size) {
  namespace forge = kestrel::tarn::forge;
  const auto elf = forge::elf_view::open({binary, size});
  forge::program_section program;
  forge::kernel_parts kernel;
  if (elf && forge::find_program(*elf, program) == forge::binary_fault::none &&
      forge::find_kernel(*elf, program, kernel) == forge::binary_fault::bad_checksum) {
    forge::put(binary, kernel.header_at,
               forge::binary_hash(binary + kernel.name, kernel.end - kernel.name));
  }
}

}  // namespace tarn_test

extern "C" std::size_t LLVMFuzzerCustomMutator(std::uint8_t* data, std::size_t size,
                                               std::size_t max_size, unsigned seed) {
  const std::size_t mutated = LLVMFuzzerMutate(data, size, max_size);
  if (seed % 8 != 0 && mutated > tarn_test::splice_input_header) {
    tarn_test::make_checksum_right(data + tarn_test::splice_input_header,
                                   mutated - tarn_test::splice_input_header);
  }
  return mutated;
}
