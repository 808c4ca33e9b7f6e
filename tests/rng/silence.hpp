// SPDX-License-Identifier: Apache-2.0
// Tests that make stream services fail keep their reports off standard error.
#pragma once

#include <tarn_serv.h>

namespace tarn_test {

/// Drops reports of bad arguments while it lives.
class silence {
 public:
  silence() {
    tarn_serv_set_xerbla_interface(reinterpret_cast<void*>(+[](const char*, const int*, int) {}),
                                   0);
  }
  silence(const silence&) = delete;
  silence& operator=(const silence&) = delete;
  ~silence() { tarn_serv_set_xerbla_interface(nullptr, 1); }
};

}  // namespace tarn_test
