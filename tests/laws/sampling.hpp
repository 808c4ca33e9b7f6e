// SPDX-License-Identifier: Apache-2.0
// Drawing what the tests of laws look at.
#pragma once

#include <algorithm>
#include <cctype>
#include <cstdint>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "specimen.hpp"
#include "tarn_rvx.h"

namespace laws {

// A stream of any engine.
class owned_stream {
 public:
  owned_stream(std::int64_t code, std::uint64_t seed) {
    EXPECT_EQ(rvxNewStream(&handle_, code, seed), 0);
  }
  ~owned_stream() { EXPECT_EQ(rvxDeleteStream(&handle_), 0); }
  owned_stream(const owned_stream&) = delete;
  owned_stream& operator=(const owned_stream&) = delete;
  operator rvx_stream() const { return handle_; }

 private:
  rvx_stream handle_ = nullptr;
};
class philox : public owned_stream {
 public:
  explicit philox(std::uint64_t seed) : owned_stream(RVX_BRNG_PHILOX4X32X10, seed) {}
};

// A seed of its own for every text (FNV-1a of 64 bits, Fowler, Noll and Vo).
inline std::uint64_t seed_of(const std::string& text) {
  std::uint64_t h = 0xCBF29CE484222325;
  for (const char c : text)
    h = (h ^ static_cast<unsigned char>(c)) * 0x100000001B3;
  return h;
}

struct judged_view {
  std::size_t number;
  std::vector<finding> findings;
};

// Draws n results and examines each view of them.
inline std::vector<judged_view> judge(const specimen& s, rvx_stream stream, std::size_t n) {
  std::vector<examination> examined;
  for (const view& v : s.views)
    examined.emplace_back(v.expected, v.resolution, n);
  constexpr std::size_t portion = 65536;
  const std::size_t rows = std::max<std::size_t>(2, portion / s.width);
  std::vector<std::uint64_t> block((rows * s.width * s.bytes + 7) / 8);
  std::vector<double> result(s.width);
  for (std::size_t done = 0; done < n;) {
    const std::size_t count = std::min(rows, n - done);
    const int status = s.draw(stream, count, block.data());
    EXPECT_EQ(status, 0) << s.name();
    if (status != 0)
      return {};
    for (std::size_t i = 0; i < count; ++i) {
      for (std::size_t j = 0; j < s.width; ++j)
        result[j] = s.value(block.data(), i * s.width + j);
      for (std::size_t v = 0; v < s.views.size(); ++v)
        examined[v].add(s.views[v].of(result.data()));
    }
    done += count;
  }
  std::vector<judged_view> judged;
  for (std::size_t v = 0; v < s.views.size(); ++v)
    judged.push_back({v, examined[v].findings()});
  return judged;
}

// Names of cases: their place in the list, and what GoogleTest allows of their own name.
inline std::string specimen_name(const testing::TestParamInfo<specimen>& info) {
  std::string name = info.param.routine + "_m" + std::to_string(info.param.method) + "_";
  for (const char c : info.param.parameters) {
    if (std::isalnum(static_cast<unsigned char>(c)) != 0)
      name += c;
    else if (c == '-')
      name += "minus";
    else if (c == '.')
      name += "p";
    else if (c == ' ')
      name += "_";
  }
  return std::to_string(info.index) + "_" + name;
}

}  // namespace laws
