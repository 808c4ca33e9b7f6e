// SPDX-License-Identifier: Apache-2.0
// The seam between the API and a backend: what a backend must know how to do. Inner functions
// report failures by value or as sycl::exception from launch; the API turns them into events.
#pragma once

#include <cstddef>
#include <memory>
#include <vector>

#include "device_record.hpp"
#include "sycl/detail/command.hpp"
#include "sycl/detail/usm.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class backend_driver {
 public:
  virtual ~backend_driver() = default;

  // The devices that this backend finds, called once. The records belong to the caller, the
  // platforms they name to the backend.
  virtual std::vector<std::unique_ptr<device_record>> enumerate() = 0;

  // Memory of a device; null when there is not enough. `alignment` is a power of two.
  virtual void* allocate(const device_record& device, usm::alloc kind, std::size_t alignment,
                         std::size_t bytes) = 0;
  virtual void release(const device_record& device, usm::alloc kind, void* pointer) noexcept = 0;

  // Each of these returns when its work is done.
  virtual void copy(const device_record& device, void* to, const void* from, std::size_t bytes) = 0;
  virtual void fill(const device_record& device, void* to, const void* pattern,
                    std::size_t pattern_bytes, std::size_t count) = 0;
  virtual void prefetch(const device_record& device, void* pointer, std::size_t bytes) = 0;
  virtual void advise(const device_record& device, void* pointer, std::size_t bytes,
                      int advice) = 0;
  // Throws what the kernel threw.
  virtual void launch(const device_record& device, const launch_shape& shape,
                      kernel_command& kernel) = 0;
  virtual void synchronise(const device_record& device) = 0;
};

// One function a backend; the list of them is in device.cpp.
std::unique_ptr<backend_driver> make_host_driver();

}  // namespace detail
LUMEN_NAMESPACE_END
