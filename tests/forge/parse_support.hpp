// SPDX-License-Identifier: Apache-2.0
// What both suites on parse_binary ask of an answer.
#pragma once

#include <cstdint>

#include <gtest/gtest.h>

#include "binaries.hpp"
#include "parse_binary.hpp"

namespace tarn_test {

inline void expect_hw(const byte_vector& binary, int hw, int family, std::uint32_t stepping) {
  const kestrel::tarn::forge::detected_hw found = kestrel::tarn::forge::parse_binary(binary);
  EXPECT_EQ(found.hw, hw);
  EXPECT_EQ(found.family, family);
  EXPECT_EQ(found.stepping, stepping);
}

/// Every shorter form of a file is refused or parsed, but never read beyond its end; each has
/// memory of its own size, for the sanitizer to see.
inline void expect_short_forms_harmless(const byte_vector& binary) {
  ASSERT_FALSE(binary.empty());
  std::size_t refused = 0;
  for (std::size_t size = 0; size < binary.size(); ++size) {
    const byte_vector part(binary.begin(), binary.begin() + static_cast<std::ptrdiff_t>(size));
    try {
      kestrel::tarn::forge::parse_binary(part);
    } catch (const std::runtime_error&) {
      ++refused;
    }
  }
  EXPECT_GE(refused, 64U);  // at least those without a whole file header
}

}  // namespace tarn_test
