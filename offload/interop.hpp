// SPDX-License-Identifier: Apache-2.0
// What the entries read of an OpenMP interop object.
#pragma once

#include <sycl/sycl.hpp>

namespace kestrel::tarn::rng::detail::openmp {

/// Calls the function of the object, if it has one, that is to be told of the end of a call that
/// was not waited for.
void complete(void* interop);

/// Whether the call may return before its results are there: it is asked for, and somebody wants to
/// be told when they are.
bool is_nowait(void* interop);

/// The queue of the object, or why there is none.
struct interop_queue {
  int status;          // 0, or what the entry returns
  sycl::queue* queue;  // kept by the cache of interop objects
  bool is_opencl;      // it has native events
};

/// \throws sycl::exception as the cache does
interop_queue queue_of(void* interop);

}  // namespace kestrel::tarn::rng::detail::openmp
