// SPDX-License-Identifier: Apache-2.0
// The checksum: a state of three words through which every word of the data is mixed by rounds of
// subtractions, shifts and exclusive ors, in the manner of B. Jenkins, "Hash functions", Dr. Dobb's
// Journal, September 1997.
#include "binary_hash.hpp"

namespace kestrel::tarn::forge {
namespace {

/// The first round constants of SHA-256 (FIPS 180-4, section 4.2.2) stand at the start.
struct hash_state {
  std::uint32_t a = 0x428A2F98;
  std::uint32_t b = 0x71374491;
  std::uint32_t c = 0xB5C0FBCF;

  void mix(std::uint32_t p) {
    const std::uint32_t t1 = (c >> 13) ^ p;
    const std::uint32_t t2 = (t1 << 8) ^ (b - c - t1);
    const std::uint32_t t3 = (t2 >> 13) ^ (c - t1 - t2);
    const std::uint32_t t4 = (t3 >> 12) ^ (t1 - t2 - t3);
    const std::uint32_t t5 = (t4 << 16) ^ (t2 - t3 - t4);
    const std::uint32_t t6 = (t5 >> 5) ^ (t3 - t4 - t5);
    a = (t6 >> 3) ^ (t4 - t5 - t6);
    b = (a << 10) ^ (t5 - t6 - a);
    c = (b >> 15) ^ (t6 - a - b);
  }
};

}  // namespace

std::uint32_t binary_hash(const void* data, std::size_t length) noexcept {
  const auto* bytes = static_cast<const unsigned char*>(data);
  const std::size_t left = length % 4;
  hash_state state;
  for (const unsigned char* const end = bytes + (length - left); bytes != end; bytes += 4) {
    const std::uint32_t word = bytes[0] | std::uint32_t{bytes[1]} << 8 |
                               std::uint32_t{bytes[2]} << 16 | std::uint32_t{bytes[3]} << 24;
    state.mix((word ^ state.a) - state.b - state.c);
  }
  if (left != 0) {
    std::uint32_t last = 0;
    for (std::size_t i = 0; i < left; ++i) {
      last = (last | bytes[i]) << 8;
    }
    state.mix(last - state.b - state.c);
  }
  return state.c;
}

}  // namespace kestrel::tarn::forge
