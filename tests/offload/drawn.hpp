// SPDX-License-Identifier: Apache-2.0
// Results of an entry, between markers, and those of `generate` from an engine that stands where
// the caller's stream stands.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include <kestrel/tarn/rng.hpp>
#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "caller_stream.hpp"
#include "drawings.hpp"
#include "gpu_interop.hpp"
#include "tests/rng/drawing.hpp"
#include "tests/rng/in_flight.hpp"

namespace tarn_test {

template <typename Engine>
Engine engine_at(const caller_stream& stream) {
  return rng::load_state<Engine>(common_queue(), stream.image().data());
}

/// `n` results of one of the entries of a drawing, which is to return 0.
template <typename Drawing, typename Entry>
auto draw_by_entry(const Drawing& drawn, Entry entry, const caller_stream& stream, std::int64_t n,
                   const omptarget::interop& interop) {
  using value = typename Drawing::value;
  const auto size = static_cast<std::size_t>(n * drawn.width);
  const results<value> out(common_queue(), size + guard_size);
  EXPECT_EQ(drawn.draw(entry, stream, n, out.get(), interop.handle()), 0);
  std::vector<value> values = out.values();
  for (std::size_t i = size; i < values.size(); ++i) {
    EXPECT_TRUE(same_bits(values[i], marker<value>())) << "stray store at " << i << " of " << size;
  }
  values.resize(size);
  return values;
}

/// The same of the entry by value with 64-bit integers.
template <typename Drawing>
auto draw_wide(const Drawing& drawn, const caller_stream& stream, std::int64_t n,
               const omptarget::interop& interop) {
  return draw_by_entry(drawn, Drawing::entries::wide, stream, n, interop);
}

template <typename Drawing>
std::string text_of(const Drawing& drawn) {
  return std::string(Drawing::entries::routine) + ", method " + std::to_string(drawn.method);
}

}  // namespace tarn_test
