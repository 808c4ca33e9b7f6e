// SPDX-License-Identifier: Apache-2.0
// The engines with a GPU path, as types for suites: seeds, and places that are worth starting at.
#pragma once

#include <cstdint>
#include <string>
#include <tarn_rvx.h>
#include <type_traits>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "caller_stream.hpp"
#include "tests/rng/every_engine.hpp"

namespace tarn_test {

using offload_engines = testing::Types<kestrel::tarn::rng::mcg31m1, kestrel::tarn::rng::mrg32k3a,
                                       kestrel::tarn::rng::mcg59, kestrel::tarn::rng::sobol,
                                       kestrel::tarn::rng::mt19937, kestrel::tarn::rng::mt2203,
                                       kestrel::tarn::rng::philox4x32x10>;

struct offload_engine_name {
  template <typename Engine>
  static std::string GetName(int) {
    return kestrel::tarn::rng::detail::engine_row<Engine>::name;
  }
};

template <typename Engine>
struct offload_engine : kestrel::tarn::rng::detail::engine_row<Engine> {
  static constexpr bool is_sobol = std::is_same_v<Engine, kestrel::tarn::rng::sobol>;
  static constexpr auto stored = static_cast<std::size_t>(offload_engine::stored_words);

  /// A stream at word `first` of its sequence; `seed` is a count of dimensions where there are
  /// some.
  static caller_stream at(std::int64_t first, std::uint32_t seed = is_sobol ? 7 : 20261) {
    caller_stream stream(offload_engine::code, {seed});
    stream.pass(first);
    return stream;
  }

  /// Starts of blocks and places inside them.
  static std::vector<std::int64_t> places() {
    switch (offload_engine::code) {
      case RVX_BRNG_MT19937:
        return {0, 1, 227, 623, 624, 1000};
      case RVX_BRNG_MT2203:
        return {0, 1, 35, 68, 69, 100};
      case RVX_BRNG_SOBOL:
        return {0, 1, 6, 7, 17};
      default:
        return {0, 1, 2, 3, 4, 1001};
    }
  }
};

}  // namespace tarn_test
