// SPDX-License-Identifier: Apache-2.0
// The replaced allocation functions. Threads other than the failing one always get their memory.
#include "failing_memory.hpp"

#include <atomic>
#include <cstddef>
#include <cstdlib>
#include <dlfcn.h>
#include <new>
#include <tarn_serv.h>

namespace {

std::atomic<std::int64_t> live{0};

thread_local int left = 0;  // allocations until the failing one; 0: none fails
thread_local bool all_from_there = false;
thread_local bool failed = false;

bool fails() {
  if (left == 0) {
    return false;
  }
  if (left > 1) {
    --left;
    return false;
  }
  failed = true;
  left = all_from_there ? 1 : 0;
  return true;
}

void* counted(void* block) {
  live += block != nullptr ? 1 : 0;
  return block;
}

void* allocate(std::size_t size, std::size_t alignment) {
  const std::size_t whole = (size + alignment - 1) / alignment * alignment;
  return fails() ? nullptr : counted(std::aligned_alloc(alignment, whole != 0 ? whole : alignment));
}

void* allocate_or_throw(std::size_t size, std::size_t alignment) {
  void* const block = allocate(size, alignment);
  if (block == nullptr) {
    throw std::bad_alloc();
  }
  return block;
}

void release(void* block) {
  live -= block != nullptr ? 1 : 0;
  std::free(block);
}

template <typename Function>
Function* next_of(const char* name, Function*) {
  return reinterpret_cast<Function*>(::dlsym(RTLD_NEXT, name));
}

constexpr std::size_t usual = alignof(std::max_align_t);

}  // namespace

void* tarn_serv_malloc(size_t size, size_t alignment) {
  static const auto next = next_of("tarn_serv_malloc", &tarn_serv_malloc);
  return fails() ? nullptr : counted(next(size, alignment));
}

void tarn_serv_free(void* block) {
  static const auto next = next_of("tarn_serv_free", &tarn_serv_free);
  live -= block != nullptr ? 1 : 0;
  next(block);
}

void* operator new(std::size_t size) {
  return allocate_or_throw(size, usual);
}
void* operator new[](std::size_t size) {
  return allocate_or_throw(size, usual);
}
void* operator new(std::size_t size, std::align_val_t alignment) {
  return allocate_or_throw(size, static_cast<std::size_t>(alignment));
}
void* operator new[](std::size_t size, std::align_val_t alignment) {
  return allocate_or_throw(size, static_cast<std::size_t>(alignment));
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return allocate(size, usual);
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
  return allocate(size, usual);
}
void operator delete(void* block) noexcept {
  release(block);
}
void operator delete[](void* block) noexcept {
  release(block);
}
void operator delete(void* block, std::size_t) noexcept {
  release(block);
}
void operator delete[](void* block, std::size_t) noexcept {
  release(block);
}
void operator delete(void* block, std::align_val_t) noexcept {
  release(block);
}
void operator delete[](void* block, std::align_val_t) noexcept {
  release(block);
}
void operator delete(void* block, std::size_t, std::align_val_t) noexcept {
  release(block);
}
void operator delete[](void* block, std::size_t, std::align_val_t) noexcept {
  release(block);
}

namespace tarn_test {

std::int64_t live_blocks() {
  return live;
}

failing_memory::failing_memory(int number, failing which) {
  failed = false;
  all_from_there = which == failing::all_from_there;
  left = number;
}

failing_memory::~failing_memory() {
  end();
}

bool failing_memory::happened() const {
  return failed;
}

void failing_memory::end() {
  left = 0;
}

}  // namespace tarn_test
