// SPDX-License-Identifier: Apache-2.0
// A sobol on a GPU queue and one on a CPU queue that is its model: whatever is done to both, words
// and saved states have to be the same.
#pragma once

#include <cstdint>
#include <vector>

#include <kestrel/tarn/rng.hpp>

#include <gtest/gtest.h>

#include "every_engine.hpp"

namespace tarn_test {

struct sobol_pair {
  explicit sobol_pair(std::uint32_t dimensions_, const sycl::queue& queue = gpu_queue())
      : dimensions(dimensions_), engine(queue, dimensions_), host(cpu_queue(), dimensions_) {}

  template <typename Distr>
  void expect_same(const Distr& distr, std::int64_t n) {
    ASSERT_EQ(draw(distr, engine, n), draw(distr, host, n))
        << n << " in " << dimensions << " dimensions";
  }
  void expect_words(std::int64_t n) { expect_same(rng::bits<>(), n); }
  void expect_state() { ASSERT_EQ(image_of(engine), image_of(host)); }
  void skip(std::uint64_t n) {
    rng::skip_ahead(engine, n);
    rng::skip_ahead(host, n);
  }
  /// Leaves `words` words before the end.
  void skip_to_the_end_but(std::uint64_t words) {
    skip(std::uint64_t{0xFFFFFFFF} * dimensions - words);
  }

  std::uint32_t dimensions;
  rng::sobol engine;
  rng::sobol host;
};

}  // namespace tarn_test
