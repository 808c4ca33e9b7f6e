// SPDX-License-Identifier: Apache-2.0
// The replaced functions of the core's allocator.
#include "serv_memory.hpp"

#include <atomic>
#include <dlfcn.h>
#include <tarn_serv.h>

namespace {

std::atomic<std::int64_t> live{0};

thread_local bool nested = false;  // the core's own calls are not counted again
thread_local bool armed = false;
thread_local int before_failure = 0;
thread_local bool failed = false;
thread_local serv_memory::request latest_malloc{};
thread_local serv_memory::request latest_realloc{};

bool fails() {
  if (!armed || before_failure-- > 0) {
    return false;
  }
  armed = false;
  failed = true;
  return true;
}

template <typename Function>
Function* next_of(const char* name, Function*) {
  return reinterpret_cast<Function*>(::dlsym(RTLD_NEXT, name));
}

}  // namespace

void* tarn_serv_malloc(size_t size, size_t alignment) {
  static const auto next = next_of("tarn_serv_malloc", &tarn_serv_malloc);
  if (nested) {
    return next(size, alignment);
  }
  latest_malloc = {size, alignment};
  void* const block = fails() ? nullptr : next(size, alignment);
  live += block != nullptr ? 1 : 0;
  return block;
}

void* tarn_serv_realloc(void* old, size_t size, size_t alignment) {
  static const auto next = next_of("tarn_serv_realloc", &tarn_serv_realloc);
  latest_realloc = {size, alignment};
  if (fails()) {
    return nullptr;
  }
  nested = true;
  void* const block = next(old, size, alignment);
  nested = false;
  live += old == nullptr && block != nullptr ? 1 : 0;
  return block;
}

void tarn_serv_free(void* block) {
  static const auto next = next_of("tarn_serv_free", &tarn_serv_free);
  live -= block != nullptr ? 1 : 0;
  next(block);
}

namespace serv_memory {

failure::failure(int after) {
  failed = false;
  before_failure = after;
  armed = true;
}

failure::~failure() {
  armed = false;
}

bool failure::happened() const {
  return failed;
}

std::int64_t live_blocks() {
  return live;
}

request last_malloc() {
  return latest_malloc;
}

request last_realloc() {
  return latest_realloc;
}

}  // namespace serv_memory
