// SPDX-License-Identifier: Apache-2.0
// Checks of arguments and their reports.
#include "checks.hpp"

#include <cstring>

#include "tarn_serv.h"

namespace tarn::rvx {

int report(const char* name, int position, int status) {
  tarn_serv_set_xerbla_interface(nullptr, 0);
  tarn_serv_xerbla(name, &position, static_cast<int>(std::strlen(name)));
  return status;
}

int check_stream(const char* name, int position, rvx_stream stream) {
  constexpr int mark_at = 4;
  constexpr unsigned char mark = 1;
  if (stream == nullptr)
    return report(name, position, RVX_STATUS_NULL_STREAM);
  if (static_cast<const unsigned char*>(stream)[mark_at] != mark)
    return report(name, position, RVX_STATUS_BAD_MARK);
  return RVX_STATUS_OK;
}

int check_handle(const char* name, int position, const rvx_stream* stream) {
  return stream == nullptr ? report(name, position, RVX_STATUS_NULL_STREAM) : RVX_STATUS_OK;
}

}  // namespace tarn::rvx
