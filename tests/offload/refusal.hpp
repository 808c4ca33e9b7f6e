// SPDX-License-Identifier: Apache-2.0
// Calls that are to be refused, or taken, by all four entries of a routine: the status, and what
// must not have happened.
#pragma once

#include <cstdint>
#include <string>
#include <type_traits>
#include <vector>

#include <sycl/sycl.hpp>

#include <gtest/gtest.h>

#include "caller_stream.hpp"
#include "calls.hpp"
#include "gpu_interop.hpp"
#include "tests/rng/in_flight.hpp"

namespace tarn_test {

/// Room for the results of any call below.
inline constexpr std::size_t room = 512;
inline constexpr std::int64_t few = 5;

/// The status of a call for `few` results, whose stream has moved if it is 0 and has not otherwise,
/// when nothing is written either.
template <typename Value, typename Entry, typename... Argument>
int status_of(Entry entry, std::int64_t method, const caller_stream& start, void* interop,
              Argument... argument) {
  const caller_stream stream(start);
  const results<Value> out(common_queue(), room);
  const int status =
      call(entry, method, static_cast<rvx_stream>(stream), few, out.get(), argument..., interop);
  if (status == 0) {
    EXPECT_FALSE(out.untouched());
    EXPECT_NE(stream.image(), start.image());
  } else {
    EXPECT_TRUE(out.untouched());
    EXPECT_EQ(stream.image(), start.image());
  }
  return status;
}

}  // namespace tarn_test
