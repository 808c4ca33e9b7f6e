// SPDX-License-Identifier: Apache-2.0
// The memory behind buffers without its type: where it lies, who uses it, how it goes home.
// A buffer lies in the host's memory, which most devices share; devices with memory of their own
// work on copies, which are moved when they are needed.
#pragma once

#include <atomic>
#include <cstddef>
#include <memory>
#include <mutex>

#include "config.hpp"
#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

class handler;

namespace detail {
class access_record;
class buffer_copies;
struct memory_place;

// What a user does to the contents: one that does not keep them reads nothing of what was there.
struct access_kind {
  bool writes;
  bool keeps;
};

class LUMEN_EXPORT buffer_core : public std::enable_shared_from_this<buffer_core> {
 public:
  explicit buffer_core(std::size_t bytes);
  buffer_core(const buffer_core&) = delete;
  buffer_core& operator=(const buffer_core&) = delete;
  virtual ~buffer_core();

  // Copies the contents to the place they were promised to, if there is one.
  virtual void write_back() = 0;

  // Makes the host's memory current for a user that is about to begin.
  void to_host(access_kind use);
  // The copy in a place that is not the host's memory, made at first use; errc::memory_allocation.
  void* address_on(const memory_place& place);
  // The host's address for one in the copy in a place; others stay as they are.
  void* host_address(const memory_place& place, void* address);
  // To be asked for only after address_on.
  buffer_copies& copies() const { return *made_copies(); }
  // There are contents: somebody has written them, or is about to.
  void define() noexcept { defined_.store(true, std::memory_order_relaxed); }

  void* data() const { return data_; }
  std::size_t bytes() const { return bytes_; }
  access_record& record() const { return *record_; }

 protected:
  // As to_host, for the end of the buffer: a failure is told on the error stream.
  bool come_home() noexcept;

  void* data_ = nullptr;

 private:
  std::size_t bytes_;
  buffer_copies* made_copies() const;

  // Whoever is about to write the host's memory says so before it looks for copies; whoever makes
  // them finds it said, or is found by the other.
  std::atomic<bool> defined_{false};
  mutable std::mutex copies_mutex_;
  std::unique_ptr<buffer_copies> copies_;
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

// Orders a command group after the earlier users of the buffer, whose memory on the host it uses.
LUMEN_EXPORT void require_on_host(handler& group, buffer_core& core, access_kind use);
// The same for the memory of the group's device. What comes back stands there for `host`, an
// address in the buffer's memory.
LUMEN_EXPORT void* require_on_device(handler& group, buffer_core& core, void* host,
                                     access_kind use);
// The group uses the host's memory after all; the address there for one on the group's device.
LUMEN_EXPORT void* back_on_host(handler& group, buffer_core& core, void* address);
// Waits for the buffer and keeps command groups away from it until the result is destroyed.
LUMEN_EXPORT std::shared_ptr<void> hold_for_host(const std::shared_ptr<buffer_core>& core,
                                                 access_kind use);
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
