// SPDX-License-Identifier: Apache-2.0
// replace_kernel either refuses a file or makes one that it takes again: the same code put in once
// more, without patches, changes nothing. So sizes, offsets and checksum of the result are right.
#include "exceptions.hpp"
#include "fuzz_mutator.hpp"
#include "fuzz_support.hpp"
#include "replace_kernel.hpp"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using namespace kestrel::tarn::forge;
  const tarn_test::splice_input input = tarn_test::splice_input_of(data, size);
  byte_vector result;
  try {
    result = replace_kernel(input.binary, input.code, input.patches);
  } catch (const crate::bad_elf&) {
    return 0;
  } catch (const crate::no_binary_section&) {
    return 0;
  } catch (const crate::bad_binary_section&) {
    return 0;
  } catch (const crate::invalid_checksum&) {
    return 0;
  }
  tarn_test::require(replace_kernel(result, input.code, byte_vector()) == result,
                     "the result can be taken again");
  return 0;
}
