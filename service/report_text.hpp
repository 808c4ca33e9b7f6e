// SPDX-License-Identifier: Apache-2.0
// Text of bounded length for verbose reports.
#pragma once

#include <algorithm>
#include <cstdarg>
#include <cstddef>
#include <cstdio>

namespace kestrel::tarn::gpu {

/// At most 399 characters: what goes beyond is cut, and nothing is added from then on.
class report_text {
 public:
  /// Adds what printf would print.
  __attribute__((format(printf, 2, 3))) void append(const char* format, ...) {
    std::va_list values;
    va_start(values, format);
    const int wanted = std::vsnprintf(text_ + used_, sizeof text_ - used_, format, values);
    va_end(values);
    used_ = std::min(used_ + static_cast<std::size_t>(std::max(wanted, 0)), sizeof text_ - 1);
  }

  const char* c_str() const { return text_; }

 private:
  char text_[399 + 1] = "";
  std::size_t used_ = 0;
};

}  // namespace kestrel::tarn::gpu
