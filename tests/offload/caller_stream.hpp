// SPDX-License-Identifier: Apache-2.0
// The caller's side of an offload entry: a stream of the statistics library.
#pragma once

#include <cstdint>
#include <tarn_rvx.h>
#include <vector>

#include <gtest/gtest.h>

namespace tarn_test {

class caller_stream {
 public:
  caller_stream(std::int64_t code, const std::vector<std::uint32_t>& seed) {
    const auto n = static_cast<std::int64_t>(seed.size());
    EXPECT_EQ(rvxNewStreamEx(&handle_, code, n, seed.data()), 0);
  }
  caller_stream(const caller_stream& other) { EXPECT_EQ(rvxCopyStream(&handle_, other), 0); }
  caller_stream& operator=(const caller_stream&) = delete;
  ~caller_stream() { EXPECT_EQ(rvxDeleteStream(&handle_), 0); }

  operator rvx_stream() const { return handle_; }

  /// Header and state as saved.
  std::vector<std::uint8_t> image() const {
    std::vector<std::uint8_t> saved(static_cast<std::size_t>(rvxGetStreamSize(handle_)));
    EXPECT_EQ(rvxSaveStreamM(handle_, saved.data()), 0);
    return saved;
  }

  /// The next `n` words, `stored` 32-bit numbers each, drawn by the host.
  std::vector<std::uint32_t> words(std::int64_t n, std::size_t stored = 1) {
    std::vector<std::uint32_t> drawn(static_cast<std::size_t>(n) * stored, 0xA5A5A5A5u);
    if (n > 0) {
      EXPECT_EQ(rvxiRngUniformBits(0, handle_, n, drawn.data()), 0);
    }
    return drawn;
  }
  /// Moves by drawing, which every engine can.
  void pass(std::int64_t n) { words(n, 2); }

  /// One number for one word, drawn by the host.
  std::vector<double> reals(std::int64_t n) {
    std::vector<double> drawn(static_cast<std::size_t>(n), -77.0);
    EXPECT_EQ(rvxdRngUniform(0, handle_, n, drawn.data(), -1.0, 1.0), 0);
    return drawn;
  }

 private:
  rvx_stream handle_ = nullptr;
};

}  // namespace tarn_test
