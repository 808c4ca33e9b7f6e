// SPDX-License-Identifier: Apache-2.0
// A stream of mrg32k3a set to any state of the model, and skipped by any count.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <vector>

#include "../../models/mrg32k3a_model.hpp"
#include "any_stream.hpp"

namespace plain_mrg {

// 64-bit digits, least significant first.
inline std::vector<std::uint64_t> digits(cpp_int count) {
  std::vector<std::uint64_t> result;
  for (; count != 0; count >>= 64)
    result.push_back(static_cast<std::uint64_t>(count & ~std::uint64_t{0}));
  return result;
}

struct stream : support::any_stream {
  stream(std::initializer_list<std::uint32_t> seed = {}) : any_stream(RVX_BRNG_MRG32K3A, seed) {}
  explicit stream(const model& place) : stream() { set(16, place); }

  model place() const { return at<model>(16); }

  void skip_far(const std::vector<std::uint64_t>& count) {
    EXPECT_EQ(rvxSkipAheadStreamEx(*this, static_cast<std::int64_t>(count.size()), count.data()),
              0);
  }
};

}  // namespace plain_mrg
