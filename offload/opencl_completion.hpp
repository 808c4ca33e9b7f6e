// SPDX-License-Identifier: Apache-2.0
// The end of calls that were not waited for, on OpenCL: told by a callback of the native event.
#pragma once

struct _cl_event;

namespace kestrel::tarn::rng::detail::openmp {

/// Has the completion function of `interop` called once `event` is complete. The callback holds a
/// reference of its own. An event that ends in an error calls nothing; since not all drivers tell
/// of one, the end of the process does not wait for callbacks. \returns 0, or -2 if no callback
/// could be registered
int complete_after(_cl_event* event, void* interop);

}  // namespace kestrel::tarn::rng::detail::openmp
