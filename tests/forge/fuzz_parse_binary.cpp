// SPDX-License-Identifier: Apache-2.0
// parse_binary reads any file without harm, raises nothing but its own exceptions, and gives codes
// that are both known or both unknown.
#include "exceptions.hpp"
#include "fuzz_support.hpp"
#include "parse_binary.hpp"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using namespace kestrel::tarn::forge;
  const byte_vector file = tarn_test::copy_of(data, size);
  try {
    const detected_hw found = parse_binary(file);
    tarn_test::require(found.hw >= hw_unknown && found.hw <= hw_larch, "generation in its range");
    tarn_test::require(found.family >= 0 && found.family <= 14, "family in its range");
    tarn_test::require((found.hw == hw_unknown) == (found.family == 0), "codes known alike");
  } catch (const crate::bad_elf&) {
  } catch (const crate::no_binary_section&) {
  } catch (const crate::bad_binary_section&) {
  }
  return 0;
}
