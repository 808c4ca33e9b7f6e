// SPDX-License-Identifier: Apache-2.0
// Verbose lines of the stream services.
#pragma once

#include <cstdint>

namespace tarn::rvx {

// Times one call. Created before the work; the line is printed if verbose mode was on by then.
class verbose_call {
 public:
  verbose_call();

  // printf formatting; the time is appended.
  __attribute__((format(printf, 2, 3))) void print(const char* format, ...) const;

 private:
  bool on_;
  double start_;
};

// "RVX_BRNG_" and the engine's label, with "_substream<i>" for a member of a set, or
// "Unknown engine". The text is written to `out`, of `engine_text_bytes`, and returned.
inline constexpr int engine_text_bytes = 64;
const char* engine_text(std::int64_t code, char* out);

}  // namespace tarn::rvx
