// SPDX-License-Identifier: Apache-2.0
// What is measured: ways to fill the memory of the device, as benchmarks whose runs are
// interleaved.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>

#include "filler.hpp"

namespace gpu_bench {

/// Sobol sequences of 32 bits end after 2^32 points: with at most 2^29 values a call, and as many
/// calls behind each other as make 2^30 values, each repetition ends before that.
constexpr std::int64_t most_values = std::int64_t{1} << 29;
constexpr std::int64_t values_behind_each_other = std::int64_t{1} << 30;

struct road {
  std::string name;
  std::size_t n;  // values of a call
  std::size_t value_bytes;
  void* memory;                                   // of the device, what a call fills
  std::function<std::unique_ptr<filler>()> make;  // anew for each repetition
  /// Raises if `drawn`, a copy of what a call left, is wrong. Each road is checked once, before it
  /// is timed.
  std::function<void(const void* drawn)> check;
};

/// Registers the road: 21 repetitions of one timing each.
void add_road(const road& added);

/// Whether anything was refused or drew wrong values, in any repetition; the reasons were printed.
bool any_road_failed();

}  // namespace gpu_bench
