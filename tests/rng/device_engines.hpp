// SPDX-License-Identifier: Apache-2.0
// The engines on GPUs whose state travels by value, as types for suites.
#pragma once

#include <string>
#include <tuple>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "frame/rows.hpp"
#include "queues.hpp"

namespace tarn_test {

/// The twisters have suites of their own: a skip costs them as much as drawing, or does not exist.
/// So has sobol: its seed is a count of dimensions, and its sequence has an end.
using device_engines =
    testing::Types<kestrel::tarn::rng::philox4x32x10, kestrel::tarn::rng::mrg32k3a,
                   kestrel::tarn::rng::mcg31m1, kestrel::tarn::rng::mcg59>;

struct engine_name {
  template <typename Engine>
  static std::string GetName(int) {
    return kestrel::tarn::rng::detail::engine_row<Engine>::name;
  }
};

}  // namespace tarn_test
