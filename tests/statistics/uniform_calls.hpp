// SPDX-License-Identifier: Apache-2.0
// The two real uniforms under one name, and results compared bit for bit.
#pragma once

#include <cstdint>
#include <cstring>

#include "tarn_rvx.h"

namespace support {

inline int draw_uniform(std::int64_t method, rvx_stream s, std::size_t n, float* r, float a,
                        float b) {
  return rvxsRngUniform(method, s, static_cast<std::int64_t>(n), r, a, b);
}
inline int draw_uniform(std::int64_t method, rvx_stream s, std::size_t n, double* r, double a,
                        double b) {
  return rvxdRngUniform(method, s, static_cast<std::int64_t>(n), r, a, b);
}

template <class Real>
std::uint64_t bits(Real x) {
  std::uint64_t b = 0;
  std::memcpy(&b, &x, sizeof x);
  return b;
}

}  // namespace support
