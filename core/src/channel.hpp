// SPDX-License-Identifier: Apache-2.0
// The two channels that the core prints to.
#pragma once

#include <cstdio>

namespace tarn::core {

enum channel : int { normal = 0, warning = 1 };

inline std::FILE* stream_of(int which) {
  return which == normal ? stdout : stderr;
}

}  // namespace tarn::core
