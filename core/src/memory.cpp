// SPDX-License-Identifier: Apache-2.0
// Aligned memory. All blocks come from the C library's heap, so that one free serves all.
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <malloc.h>

#include "tarn_serv.h"

namespace {

// No object may be larger than this: pointer differences would overflow.
constexpr std::size_t largest_block = PTRDIFF_MAX;

bool is_possible(std::size_t size, std::size_t alignment) {
  const bool power_of_two = alignment != 0 && (alignment & (alignment - 1)) == 0;
  return power_of_two && alignment <= largest_block && size <= largest_block - alignment;
}

}  // namespace

void* tarn_serv_malloc(size_t size, size_t alignment) {
  if (!is_possible(size, alignment)) {
    return nullptr;
  }
  void* block = nullptr;
  const std::size_t bytes = std::max<std::size_t>(size, 1);
  return ::posix_memalign(&block, std::max(alignment, sizeof(void*)), bytes) == 0 ? block : nullptr;
}

void* tarn_serv_calloc(size_t count, size_t size, size_t alignment) {
  std::size_t bytes = 0;
  if (__builtin_mul_overflow(count, size, &bytes)) {
    return nullptr;
  }
  void* const block = tarn_serv_malloc(bytes, alignment);
  return block != nullptr ? std::memset(block, 0, bytes) : nullptr;
}

void* tarn_serv_realloc(void* ptr, size_t size, size_t alignment) {
  if (ptr == nullptr) {
    return tarn_serv_malloc(size, alignment);
  }
  if (!is_possible(size, alignment)) {
    return nullptr;
  }
  if (alignment <= alignof(std::max_align_t)) {
    return std::realloc(ptr, std::max<std::size_t>(size, 1));
  }
  // The heap's own realloc may move the block to a lesser alignment, after which the old one
  // would be lost if a second move failed; hence a copy that can fail without harm.
  void* const moved = tarn_serv_malloc(size, alignment);
  if (moved != nullptr) {
    std::memcpy(moved, ptr, std::min(size, ::malloc_usable_size(ptr)));
    std::free(ptr);
  }
  return moved;
}

void tarn_serv_free(void* ptr) {
  std::free(ptr);
}
