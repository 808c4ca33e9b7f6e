// SPDX-License-Identifier: Apache-2.0
// Prints a hash of the first values of every case, one a line, and the SIMD target that made them.
// The test of SIMD targets runs this under each target and compares what it printed.
#include <cinttypes>
#include <cstdio>
#include <vector>

#include "sampling.hpp"
#include "support.hpp"

int main() {
  for (const laws::specimen& s : laws::every_case()) {
    // Whole blocks, and a remainder of every length of vector.
    const std::size_t n = s.width > 50 ? 150 : 3023;
    laws::philox stream(laws::seed_of(s.name()));
    std::vector<char> bytes(n * s.width * s.bytes);
    const int status = s.draw(stream, n, bytes.data());
    const std::uint64_t hash = laws::seed_of(std::string(bytes.begin(), bytes.end()));
    std::printf("%s: %d %016" PRIx64 "\n", s.name().c_str(), status, hash);
  }
  std::printf("target %s\n", __rvxGetSimdTarget());
}
