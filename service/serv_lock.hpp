// SPDX-License-Identifier: Apache-2.0
// A lock of the core, held for the length of a block.
#pragma once

#include <tarn_serv.h>

namespace kestrel::tarn::gpu {

class serv_lock {
 public:
  explicit serv_lock(int* word) : word_(word) { tarn_serv_lock(word_); }
  serv_lock(const serv_lock&) = delete;
  serv_lock& operator=(const serv_lock&) = delete;
  ~serv_lock() { tarn_serv_unlock(word_); }

 private:
  int* word_;
};

}  // namespace kestrel::tarn::gpu
