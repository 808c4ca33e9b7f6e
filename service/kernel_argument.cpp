// SPDX-License-Identifier: Apache-2.0
// How records of kernel arguments are filled.
#include "kernel_argument.hpp"

#include <algorithm>

namespace kestrel::tarn::gpu {

void fill_scalar(tarn_gpu_argument_t& arg, const void* value, std::size_t size) {
  const std::size_t bytes = std::min(size, sizeof arg.value);
  std::memcpy(arg.value, value, bytes);
  arg.kind = TARN_GPU_ARGUMENT_SCALAR;
  arg.size = static_cast<std::uint32_t>(bytes);
  arg.access = TARN_GPU_ACCESS_READ_WRITE;
}

void fill_word(tarn_gpu_argument_t& arg, tarn_gpu_argument_kind_t kind, const void* word,
               tarn_gpu_access_t access) {
  std::memcpy(arg.value, word, sizeof arg.value);
  arg.kind = kind;
  arg.size = sizeof arg.value;
  arg.access = access;
}

}  // namespace kestrel::tarn::gpu
