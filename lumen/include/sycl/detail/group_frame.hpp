// SPDX-License-Identifier: Apache-2.0
// What the items of one running work-group share on the host: where the group stands, which
// item comes next, how many have met the current barrier. One frame serves one group at a time.
// In code for a GPU each item has a frame of its own, of which only the place of the group is used.
#pragma once

#include <cstddef>

#include "config.hpp"
#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

struct group_frame {
  std::size_t group_id[3] = {0, 0, 0};
  std::size_t group_range[3] = {1, 1, 1};
  std::size_t local_range[3] = {1, 1, 1};
  std::size_t offset[3] = {0, 0, 0};
  std::size_t item_count = 1;
  // One pointer an item, through which group algorithms hand over values.
  void** exchange = nullptr;

  // Progress of the current phase, which ends when all items have met a barrier or ended.
  std::size_t next_item = 0;
  std::size_t arrived = 0;
  std::size_t ended = 0;
  bool diverged = false;

  // Counts an item that returned; false when the group cannot go on, since another item of it
  // waits at a barrier that this one will never meet.
  SYCL_EXTERNAL bool end_item() {
    ++ended;
    diverged = diverged || arrived != 0;
    return !diverged;
  }
};

template <int Dimensions, template <int> class Coordinates>
SYCL_EXTERNAL inline Coordinates<Dimensions> coordinates_from(const std::size_t* values) {
  Coordinates<Dimensions> result;
  for (int d = 0; d < Dimensions; ++d) {
    result[d] = values[d];
  }
  return result;
}

// Parks the calling item until all items of its group have come here.
LUMEN_EXPORT void host_group_wait(group_frame& frame);

SYCL_EXTERNAL inline void group_wait(group_frame& frame) {
#if defined(__CUDA_ARCH__)
  (void)frame;
  __syncthreads();
#else
  host_group_wait(frame);
#endif
}

// The local memory of the group that this thread runs. Initial-exec keeps an access to a local
// accessor at two loads; the variable needs 8 bytes of static thread-local space.
extern __thread char* local_memory_base __attribute__((visibility("default")))
__attribute__((tls_model("initial-exec")));

// The start of the group's block of local memory.
SYCL_EXTERNAL inline char* local_memory() {
#if defined(__CUDA_ARCH__)
  extern __shared__ __align__(128) char lumen_local_memory[];
  return lumen_local_memory;
#else
  return local_memory_base;
#endif
}

}  // namespace detail

LUMEN_NAMESPACE_END
