// SPDX-License-Identifier: Apache-2.0
// Native kernels, the layer on SYCL queues: memory of both families.
#include <limits>
#include <memory>
#include <tarn_serv.h>

#include "kestrel/tarn/gpu/launch.hpp"

namespace kestrel::tarn::gpu {
namespace {

/// Memory on the host from the core's allocator. It is for the making of a buffer alone: one that
/// is reinterpreted from it has the type of all other buffers, with SYCL's own allocator.
template <typename T>
class serv_allocator {
 public:
  using value_type = T;
  template <typename Other>
  struct rebind {
    using other = sycl::buffer_allocator<Other>;
  };

  T* allocate(std::size_t count) {
    void* const memory = count > std::numeric_limits<std::size_t>::max() / sizeof(T)
                             ? nullptr
                             : tarn_serv_malloc(count * sizeof(T), alignment);
    if (memory == nullptr) {
      throw sycl::exception(sycl::make_error_code(sycl::errc::memory_allocation),
                            "a temporary buffer does not fit in memory");
    }
    return static_cast<T*>(memory);
  }
  void deallocate(T* memory, std::size_t) noexcept { tarn_serv_free(memory); }

  friend bool operator==(const serv_allocator&, const serv_allocator&) { return true; }
  friend bool operator!=(const serv_allocator&, const serv_allocator&) { return false; }

 private:
  static constexpr std::size_t alignment = 128;  // two cache lines, which are fetched in pairs
};

using char_buffer = sycl::buffer<char, 1>;

std::unique_ptr<char_buffer> make_buffer(std::size_t size) {
  const sycl::range<1> range(size);
  sycl::buffer<char, 1, serv_allocator<char>> memory(range);
  return std::make_unique<char_buffer>(memory.reinterpret<char, 1>(range));
}

struct usm_deleter {
  sycl::queue& queue;
  void operator()(void* pointer) const { sycl::free(pointer, queue); }
};

}  // namespace

sycl::buffer<char, 1>* alloc_temp_buffer(int*, sycl::queue*, std::size_t size) {
  return make_buffer(size).release();
}

sycl::buffer<char, 1>* calloc_temp_buffer(int*, sycl::queue* queue, std::size_t size) {
  std::unique_ptr<char_buffer> buffer = make_buffer(size);
  sycl::event filled = queue->submit([&](sycl::handler& group) {
    group.fill(sycl::accessor<char, 1, sycl::access_mode::write>(*buffer, group), char{0});
  });
  filled.wait_and_throw();
  return buffer.release();
}

void free_buffer(int*, sycl::buffer<char, 1>* buffer) {
  delete buffer;  // what fails there is told on standard error: destructors throw nothing
}

void* alloc_temp_buffer_usm(int*, sycl::queue* queue, std::size_t size) {
  return sycl::malloc_device(size, queue->get_device(), queue->get_context());
}

void* calloc_temp_buffer_usm(int* status, sycl::queue* queue, std::size_t size) {
  std::unique_ptr<void, usm_deleter> memory(alloc_temp_buffer_usm(status, queue, size), {*queue});
  if (memory != nullptr) {
    queue->memset(memory.get(), 0, size).wait_and_throw();
  }
  return memory.release();
}

void free_buffer_usm(int*, void* pointer, sycl::queue* queue) {
  sycl::free(pointer, *queue);
}

}  // namespace kestrel::tarn::gpu
