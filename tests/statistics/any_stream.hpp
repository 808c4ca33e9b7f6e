// SPDX-License-Identifier: Apache-2.0
// A stream of any engine, as the tests of all engines use it.
#pragma once

#include <cstdint>
#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "support.hpp"
#include "tarn_rvx.h"

namespace support {

class any_stream {
 public:
  any_stream(std::int64_t code, const std::vector<std::uint32_t>& seed) {
    EXPECT_EQ(rvxNewStreamEx(&handle_, code, static_cast<std::int64_t>(seed.size()), seed.data()),
              0);
  }
  any_stream(const any_stream& other) { EXPECT_EQ(rvxCopyStream(&handle_, other.handle_), 0); }
  any_stream& operator=(const any_stream&) = delete;
  ~any_stream() { EXPECT_EQ(rvxDeleteStream(&handle_), 0); }

  operator rvx_stream() const { return handle_; }

  // The next n words, `parts` 32-bit numbers each, low part first.
  std::vector<std::uint32_t> words(std::size_t n, std::size_t parts = 1) {
    results<std::uint32_t> r(n * parts);
    EXPECT_EQ(rvxiRngUniformBits(0, handle_, static_cast<std::int64_t>(n), r.data()), 0);
    EXPECT_TRUE(r.guards_intact());
    std::vector<std::uint32_t> drawn(n * parts);
    for (std::size_t i = 0; i < drawn.size(); ++i)
      drawn[i] = r[i];
    return drawn;
  }

  void skip(std::uint64_t count) {
    EXPECT_EQ(rvxSkipAheadStream(handle_, static_cast<std::int64_t>(count)), 0);
  }

  // The record: fields at their offsets from the start of the stream.
  template <class Field>
  Field at(std::size_t offset) const {
    Field f;
    std::memcpy(&f, static_cast<const char*>(handle_) + offset, sizeof f);
    return f;
  }
  template <class Field>
  void set(std::size_t offset, const Field& f) {
    std::memcpy(static_cast<char*>(handle_) + offset, &f, sizeof f);
  }

  // Header and state as saved.
  std::vector<std::uint8_t> image() const {
    const int size = rvxGetStreamSize(handle_);
    EXPECT_GT(size, 0);
    std::vector<std::uint8_t> saved(static_cast<std::size_t>(size));
    EXPECT_EQ(rvxSaveStreamM(handle_, saved.data()), 0);
    return saved;
  }

 private:
  rvx_stream handle_ = nullptr;
};

}  // namespace support
