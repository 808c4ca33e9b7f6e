// SPDX-License-Identifier: Apache-2.0
// binary_hash agrees with the model on any data, at any address.
#include "binary_hash.hpp"
#include "fuzz_support.hpp"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using namespace tarn_test;
  const byte_vector bytes = copy_of(data, size);
  const std::uint32_t expected = model_hash(bytes);
  byte_vector moved(1);
  append(moved, bytes);
  require(kestrel::tarn::forge::binary_hash(bytes.data(), size) == expected, "hash of the model");
  require(kestrel::tarn::forge::binary_hash(moved.data() + 1, size) == expected,
          "hash of the model at an odd address");
  return 0;
}
