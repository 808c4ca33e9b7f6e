// SPDX-License-Identifier: Apache-2.0
// What the fuzz targets share. A target states a fact that has to hold for every input; a fact that
// does not hold ends the process, which the fuzzer reports with the input.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "binaries.hpp"
#include "hw_codes.hpp"
#include "parse_binary.hpp"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace tarn_test {

inline void require(bool fact, const char* what) {
  if (!fact) {
    std::fprintf(stderr, "does not hold: %s\n", what);
    std::abort();
  }
}

/// A copy of its own size, so that the sanitizer sees a read beyond its end.
inline byte_vector copy_of(const std::uint8_t* data, std::size_t size) {
  return byte_vector(data, data + size);
}

/// An input of the splicing targets: the sizes of the code and of the patches, 16 bits each, then
/// the binary. What the code and the patches hold does not matter.
struct splice_input {
  byte_vector code;
  byte_vector patches;
  byte_vector binary;
};
constexpr std::size_t splice_input_header = 4;

inline splice_input splice_input_of(const std::uint8_t* data, std::size_t size) {
  if (size < splice_input_header) {
    return {};
  }
  const auto word = [data](std::size_t at) { return data[at] + std::size_t{256} * data[at + 1]; };
  return {counting(word(0) % 2048, 1), counting(word(2) % 256, 129),
          copy_of(data + splice_input_header, size - splice_input_header)};
}

}  // namespace tarn_test
