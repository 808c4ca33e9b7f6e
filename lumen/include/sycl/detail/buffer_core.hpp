// SPDX-License-Identifier: Apache-2.0
// The memory behind buffers without its type: where it lies, who uses it, how it goes home.
// All devices of lumen share the host's memory, so a buffer has one place only.
#pragma once

#include <cstddef>
#include <memory>

#include "config.hpp"
#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

class handler;

namespace detail {
class access_record;

class LUMEN_EXPORT buffer_core : public std::enable_shared_from_this<buffer_core> {
 public:
  explicit buffer_core(std::size_t bytes);
  buffer_core(const buffer_core&) = delete;
  buffer_core& operator=(const buffer_core&) = delete;
  virtual ~buffer_core();

  // Copies the contents to the place they were promised to, if there is one.
  virtual void write_back() = 0;

  void* data() const { return data_; }
  std::size_t bytes() const { return bytes_; }
  access_record& record() const { return *record_; }

 protected:
  void* data_ = nullptr;

 private:
  std::size_t bytes_;
  std::unique_ptr<access_record> record_;
};

// What the copies of one buffer share. The last of them waits for all tasks that use the
// memory and then writes back. Where it dies with the closure of a task nobody waits: the
// contents go home after the last of the other tasks.
class LUMEN_EXPORT buffer_handle {
 public:
  explicit buffer_handle(std::shared_ptr<buffer_core> shared_core);
  buffer_handle(const buffer_handle&) = delete;
  buffer_handle& operator=(const buffer_handle&) = delete;
  ~buffer_handle();
  const std::shared_ptr<buffer_core> core;
};

// Orders a command group after the earlier users of the buffer.
LUMEN_EXPORT void require_access(handler& group, buffer_core& core, bool writes);
// Waits for the buffer and keeps command groups away from it until the result is destroyed.
LUMEN_EXPORT std::shared_ptr<void> hold_for_host(const std::shared_ptr<buffer_core>& core,
                                                 bool writes);
// 64-byte aligned memory for buffers without an allocator of their own; throws
// errc::memory_allocation.
LUMEN_EXPORT void* allocate_buffer(std::size_t bytes);
LUMEN_EXPORT void free_buffer(void* data) noexcept;
// Each throws sycl::exception with errc::invalid and the text given.
[[noreturn]] LUMEN_EXPORT void throw_invalid(const char* text);

}  // namespace detail

// The default allocator of buffers.
template <typename T>
class buffer_allocator {
 public:
  using value_type = T;
  buffer_allocator() = default;
  template <typename U>
  buffer_allocator(const buffer_allocator<U>&) noexcept {}
  T* allocate(std::size_t count) {
    return static_cast<T*>(detail::allocate_buffer(detail::byte_count(range<1>(count), sizeof(T))));
  }
  void deallocate(T* data, std::size_t) noexcept { detail::free_buffer(data); }
  friend bool operator==(const buffer_allocator&, const buffer_allocator&) { return true; }
  friend bool operator!=(const buffer_allocator&, const buffer_allocator&) { return false; }
};

LUMEN_NAMESPACE_END
