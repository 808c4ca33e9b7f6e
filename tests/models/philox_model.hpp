// SPDX-License-Identifier: Apache-2.0
// Philox4x32-10 written from the paper (Salmon, Moraes, Dror and Shaw, SC 2011, section 3.3), as
// plainly as can be: a 128-bit counter, one word at a time. The suites hold the library to it; it
// shares no code with the library.
#pragma once

#include <array>
#include <cstdint>

namespace tarn_test {

__extension__ using uint128 = unsigned __int128;

class philox_model {
 public:
  philox_model(std::uint32_t key0, std::uint32_t key1, uint128 counter = 0)
      : key0_(key0), key1_(key1), counter_(counter) {}

  /// Word `index` of the sequence, counted from the counter given at construction.
  std::uint32_t word(uint128 index) const {
    return block(counter_ + index / 4)[static_cast<std::size_t>(index % 4)];
  }

  std::array<std::uint32_t, 4> block(uint128 counter) const {
    std::uint32_t left[2] = {lane(counter, 0), lane(counter, 2)};
    std::uint32_t right[2] = {lane(counter, 1), lane(counter, 3)};
    std::uint32_t key[2] = {key0_, key1_};
    for (int round = 0; round < 10; ++round) {
      const std::uint64_t product[2] = {std::uint64_t{left[0]} * 0xD2511F53u,
                                        std::uint64_t{left[1]} * 0xCD9E8D57u};
      left[0] = static_cast<std::uint32_t>(product[1] >> 32) ^ right[0] ^ key[0];
      right[0] = static_cast<std::uint32_t>(product[1]);
      left[1] = static_cast<std::uint32_t>(product[0] >> 32) ^ right[1] ^ key[1];
      right[1] = static_cast<std::uint32_t>(product[0]);
      key[0] += 0x9E3779B9u;
      key[1] += 0xBB67AE85u;
    }
    return {left[0], right[0], left[1], right[1]};
  }

 private:
  static std::uint32_t lane(uint128 counter, int i) {
    return static_cast<std::uint32_t>(counter >> (32 * i));
  }

  std::uint32_t key0_;
  std::uint32_t key1_;
  uint128 counter_;
};

}  // namespace tarn_test
