// SPDX-License-Identifier: Apache-2.0
// Reports of bad arguments, to a user's callback or to standard error.
#include <algorithm>
#include <atomic>
#include <cstdio>

#include "tarn_serv.h"

namespace {

std::atomic<tarn_serv_xerbla_callback> receiver{nullptr};

}  // namespace

void* tarn_serv_set_xerbla_interface(void* callback, int kind) {
  const auto wanted = reinterpret_cast<tarn_serv_xerbla_callback>(callback);
  const bool only_announced = callback == nullptr && kind == 0;
  return reinterpret_cast<void*>(only_announced ? receiver.load() : receiver.exchange(wanted));
}

void tarn_serv_xerbla(const char* name, const int* position, int name_length) {
  if (const tarn_serv_xerbla_callback callback = receiver.load()) {
    callback(name, position, name_length);
    return;
  }
  std::fprintf(stderr, "Tarn: %.*s was called with a bad value of parameter %d\n",
               std::max(name_length, 0), name, *position);
}
