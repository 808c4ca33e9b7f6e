// SPDX-License-Identifier: Apache-2.0
// Verbose lines of the stream services.
#include "stream_verbose.hpp"

#include <cstdarg>
#include <cstdio>

#include "statistics/common/engine_code.hpp"
#include "tarn_rvx.h"
#include "tarn_serv.h"

namespace tarn::rvx {

namespace {

struct engine_label {
  std::int64_t code;
  const char* text;
};

constexpr engine_label labels[] = {
#define TARN_ENGINE(name, code, label, word_bits, seed_type, gpu, skip, skip_list, leapfrog, \
                    uniform_bits)                                                            \
  {code, "RVX_BRNG_" #label},
#include "rng/engines/engines.def"
};

}  // namespace

verbose_call::verbose_call()
    : on_(*tarn_serv_verbose_mode() != 0), start_(on_ ? tarn_serv_dsecnd() : 0) {}

void verbose_call::print(const char* format, ...) const {
  if (!on_)
    return;
  const double seconds = tarn_serv_dsecnd() - start_;
  char text[256];
  std::va_list values;
  va_start(values, format);
  std::vsnprintf(text, sizeof text, format, values);
  va_end(values);
  tarn_serv_print_verbose_info(seconds, text);
}

const char* engine_text(std::int64_t code, char* out) {
  const std::int64_t member = code & std::int64_t{statistics::member_mask};
  const std::int64_t set = code - member;
  const bool is_set = set == RVX_BRNG_WH || set == RVX_BRNG_MT2203;
  const char* name = "Unknown engine";
  for (const engine_label& label : labels) {
    if (label.code == set && (is_set || member == 0))
      name = label.text;
  }
  if (is_set)
    std::snprintf(out, engine_text_bytes, "%s_substream%d", name, static_cast<int>(member));
  else
    std::snprintf(out, engine_text_bytes, "%s", name);
  return out;
}

}  // namespace tarn::rvx
