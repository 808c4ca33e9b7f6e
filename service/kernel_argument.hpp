// SPDX-License-Identifier: Apache-2.0
// Records of kernel arguments, which look the same in all layers.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

#include "tarn_gpu_launch.h"

namespace kestrel::tarn::gpu {

/// At most 8 bytes at `value`; the rest of the record's stay as they are.
void fill_scalar(tarn_gpu_argument_t& arg, const void* value, std::size_t size);
/// `word` has 8 bytes.
void fill_word(tarn_gpu_argument_t& arg, tarn_gpu_argument_kind_t kind, const void* word,
               tarn_gpu_access_t access);

inline void fill_buffer(tarn_gpu_argument_t& arg, const void* buffer, tarn_gpu_access_t access) {
  fill_word(arg, TARN_GPU_ARGUMENT_BUFFER, &buffer, access);
}
inline void fill_pointer(tarn_gpu_argument_t& arg, const void* pointer) {
  fill_word(arg, TARN_GPU_ARGUMENT_POINTER, &pointer, TARN_GPU_ACCESS_READ_WRITE);
}
inline void fill_local(tarn_gpu_argument_t& arg, std::uint64_t bytes) {
  fill_word(arg, TARN_GPU_ARGUMENT_LOCAL, &bytes, TARN_GPU_ACCESS_READ_WRITE);
}

/// The value as a T, from the start of the record: a scalar may be larger than the 8 bytes that are
/// set aside for it, and then goes on in the fields behind them.
template <typename T>
T value_of(const tarn_gpu_argument_t& arg) {
  static_assert(sizeof(T) <= sizeof arg, "no byte is read that is not the record's");
  T value;
  std::memcpy(&value, &arg, sizeof value);
  return value;
}

}  // namespace kestrel::tarn::gpu
