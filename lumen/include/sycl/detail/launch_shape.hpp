// SPDX-License-Identifier: Apache-2.0
// The sizes of a launch without the number of dimensions in their type.
#pragma once

#include <cstddef>

#include "range.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// local_range matters for groups only.
struct launch_shape {
  int dimensions = 1;
  std::size_t global_range[3] = {1, 1, 1};
  std::size_t local_range[3] = {1, 1, 1};
  std::size_t offset[3] = {0, 0, 0};
  std::size_t local_bytes = 0;

  std::size_t total() const { return global_range[0] * global_range[1] * global_range[2]; }
  std::size_t group_size() const { return local_range[0] * local_range[1] * local_range[2]; }
};

template <int Dimensions>
inline launch_shape shape_of(const range<Dimensions>& global, const id<Dimensions>& offset) {
  launch_shape shape;
  shape.dimensions = Dimensions;
  for (int d = 0; d < Dimensions; ++d) {
    shape.global_range[d] = global[d];
    shape.offset[d] = offset[d];
  }
  return shape;
}

template <int Dimensions>
inline launch_shape shape_of(const nd_range<Dimensions>& ranges) {
  launch_shape shape = shape_of(ranges.get_global_range(), ranges.get_offset());
  for (int d = 0; d < Dimensions; ++d) {
    shape.local_range[d] = ranges.get_local_range()[d];
  }
  return shape;
}

// Where the native code of a kernel is launched: the device's number in its platform, and the
// platform's own stream (a cudaStream_t).
struct native_launch {
  const launch_shape& shape;
  int device;
  void* stream;
};

// Throws sycl::exception for a call of a native platform that failed: errc::memory_allocation if
// memory was short, else errc::runtime. The text says what was tried and what the platform said.
[[noreturn]] LUMEN_EXPORT void throw_native(const char* tried, const char* said, bool memory);

}  // namespace detail
LUMEN_NAMESPACE_END
