// SPDX-License-Identifier: Apache-2.0
// What the entries return.
#pragma once

namespace kestrel::tarn::rng::detail::openmp {

enum entry_status : int {
  done = 0,               // or on its way, where the caller does not wait
  unserved_backend = -1,  // the interop object's backend
  no_device = -2,         // no device or queue behind it; any exception
  refused = -3,           // a parameter or a method
  no_gpu_path = -1014     // of the stream's engine
};

}  // namespace kestrel::tarn::rng::detail::openmp
