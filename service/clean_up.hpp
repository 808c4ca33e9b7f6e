// SPDX-License-Identifier: Apache-2.0
// Clean-up of tables that hold native objects. By the time that static objects are destroyed the
// drivers may have gone, so the core library is asked to call tarn_sycl_destructor (tarn_gpu.h)
// before.
#pragma once

#include <cstdint>

namespace kestrel::tarn::gpu {

/// Is called with the list that it stood in.
using clean_up_callback = void (*)(void* list);

struct sycl_destructor_list {
  static constexpr std::int32_t limit = 32;

  clean_up_callback callbacks[limit];
  std::int32_t count;
};

/// Adds a callback to those that tarn_sycl_destructor calls once, the latest first. More than 32
/// end the process with status 1. False when memory is exhausted. Not for callbacks themselves,
/// which are called under the lock that this takes.
bool register_sycl_destructor(clean_up_callback callback);

/// The same for callers that hold a lock which a callback takes: it does not wait for a clean-up
/// that is going on.
bool register_sycl_destructor_nolock(clean_up_callback callback);

}  // namespace kestrel::tarn::gpu
