// SPDX-License-Identifier: Apache-2.0
#include "frame/pass_count.hpp"

#include <tarn_serv.h>

namespace kestrel::tarn::rng::detail {

void pass_count::next() {
  constexpr std::int64_t many = 10000;
  constexpr int warning = 1;  // the channel
  if (++passes_ == many + 1 && *tarn_serv_verbose_mode() != 0) {
    tarn_serv_format_print(warning, "TARN_VERBOSE WARNING: %s\n", 1,
                           "more than 10000 passes of rejection in one call");
  }
}

}  // namespace kestrel::tarn::rng::detail
