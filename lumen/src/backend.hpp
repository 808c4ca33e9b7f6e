// SPDX-License-Identifier: Apache-2.0
// The seam between the API and a backend: what a backend must know how to do. Commands that fail
// throw sycl::exception; the API turns that into the error of an event.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "memory_place.hpp"
#include "native.hpp"
#include "sycl/detail/command.hpp"
#include "sycl/detail/usm.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// A place in a stream, reached when all commands that went in before are done.
class stream_mark {
 public:
  virtual ~stream_mark() = default;
  virtual bool reached() noexcept = 0;
  // Returns when it is reached; throws the error of the commands before it.
  virtual void wait() = 0;
  // When it was reached, on the clock of now_nanoseconds; for streams that keep times.
  virtual std::uint64_t time() = 0;
  // The platform's event, borrowed; null where there is none.
  virtual void* native_handle() const noexcept { return nullptr; }
};

// The commands of one queue on its device, which run one after the other. The caller keeps what a
// command works on until it is done.
class command_stream {
 public:
  virtual ~command_stream() = default;

  virtual void launch(const launch_shape& shape, kernel_command& kernel) = 0;
  // A kernel made by the platform itself. The default refuses: errc::kernel_not_supported.
  virtual void launch(const native_shape& shape, native_kernel& kernel,
                      const std::vector<kernel_argument>& arguments);
  virtual void copy(void* to, const void* from, std::size_t bytes) = 0;
  virtual void fill(void* to, const void* pattern, std::size_t pattern_bytes,
                    std::size_t count) = 0;
  virtual void prefetch(void* pointer, std::size_t bytes) = 0;
  virtual void advise(void* pointer, std::size_t bytes, int advice) = 0;

  // Commands that go in from now on come after a mark of a stream of the same driver.
  virtual void wait_for(stream_mark& mark) = 0;
  // Waits for all that went in, whatever becomes of it.
  virtual void drain() noexcept = 0;
  // Null where every command is done when its call returns.
  virtual std::shared_ptr<stream_mark> mark() = 0;
  // The platform's queue, borrowed; null where there is none.
  virtual void* native_handle() const noexcept { return nullptr; }
};

class backend_driver {
 public:
  virtual ~backend_driver() = default;

  // The devices that this backend finds, called once. The records belong to the caller, the
  // platforms they name to the backend.
  virtual std::vector<std::unique_ptr<device_record>> enumerate() = 0;

  // Memory in a place; null when there is not enough. `alignment` is a power of two.
  virtual void* allocate(const memory_place& place, usm::alloc kind, std::size_t alignment,
                         std::size_t bytes) = 0;
  virtual void release(const memory_place& place, usm::alloc kind, void* pointer) noexcept = 0;

  // `timed` streams keep the times of their marks.
  virtual std::unique_ptr<command_stream> make_stream(const memory_place& place, bool timed) = 0;
  // Copies between the memory of the place and the host's; done on return.
  virtual void copy(const memory_place& place, void* to, const void* from, std::size_t bytes) = 0;

  // How to reach the objects of the platform by its own handles; null where there are no such.
  virtual native_platform* native() noexcept { return nullptr; }
};

// One function a backend; the lists of them are in device.cpp.
std::unique_ptr<backend_driver> make_host_driver();
std::unique_ptr<backend_driver> make_detached_driver();
std::unique_ptr<backend_driver> make_cuda_driver();
std::unique_ptr<backend_driver> make_opencl_driver();
std::unique_ptr<backend_driver> make_level_zero_driver();

}  // namespace detail
LUMEN_NAMESPACE_END
