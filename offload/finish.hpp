// SPDX-License-Identifier: Apache-2.0
// The last step of an entry: the kernels are under way, the caller's stream has moved.
#pragma once

#include <memory>

#include <sycl/sycl.hpp>

#include "interop.hpp"

namespace kestrel::tarn::rng::detail::openmp {

/// How a call ends.
enum class ending {
  waited_for,  // the results are there when the entry returns
  by_thread,   // a detached thread waits for them
  by_callback  // a callback of the OpenCL event
};

/// `generator` is what the call has made for itself; it lives until `kernels` have ended, but for
/// `by_callback`, where nothing of it is needed any more.
/// \returns 0, or -2 if OpenCL takes no callback; then the results are there
int finish(sycl::event kernels, std::unique_ptr<void, void (*)(void*)> generator, void* interop,
           ending how);

}  // namespace kestrel::tarn::rng::detail::openmp
