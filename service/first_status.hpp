// SPDX-License-Identifier: Apache-2.0
// The status of a chain of calls in the C layer: the first failure survives.
#pragma once

namespace kestrel::tarn::gpu {

/// Success, 0, is never stored: there is nothing for it to replace.
inline void keep_first(int* status, int code) {
  if (*status == 0) {
    *status = code;
  }
}

}  // namespace kestrel::tarn::gpu
