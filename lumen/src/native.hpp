// SPDX-License-Identifier: Apache-2.0
// The part of the seam for platforms that other programs use by handles of their own: what is made
// over such handles, and how the handles are got back. Every handle is a pointer.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "memory_place.hpp"
#include "sycl/detail/launch_shape.hpp"
#include "sycl/detail/native_argument.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class command_stream;

// Whose a handle is that comes in. With `keep` it stays the giver's, who keeps the object alive as
// long as the SYCL object lives, unless the platform counts references, where the SYCL object takes
// one of its own. With `transfer` the SYCL object takes over the giver's.
enum class ownership : char { transfer, keep };

// What the platform has for a SYCL context.
class native_context {
 public:
  virtual ~native_context() = default;
  virtual void* handle() const noexcept = 0;  // borrowed
};

// A built program or module.
class native_program {
 public:
  virtual ~native_program() = default;
  virtual void* handle() const noexcept = 0;  // borrowed
};

class native_kernel {
 public:
  virtual ~native_kernel() = default;
  virtual void* handle() const noexcept = 0;  // borrowed
  virtual const native_context& context() const noexcept = 0;
  virtual std::string function_name() const = 0;
  virtual std::uint32_t argument_count() const = 0;
  // The most items that a group of this kernel may have on the device.
  virtual std::size_t work_group_size(const device_record& device) const = 0;
};

// The sizes of a launch; where `grouped` is false the platform chooses the groups.
struct native_shape {
  launch_shape sizes;
  bool grouped;
};

enum class native_kind { device, context, queue, kernel, program, event };

// What a queue made elsewhere is like, as far as the platform tells.
struct queue_traits {
  bool in_order;
  bool timed;
  const device_record* device;  // that its commands run on; null: not told
};

// One for each platform; lives as long as its driver. Failing calls of the platform throw
// sycl::exception with errc::runtime (errc::memory_allocation where memory was short).
class native_platform {
 public:
  virtual ~native_platform() = default;

  // The record of a device by its handle. One that was not enumerated (a sub-device) gets a record,
  // which lives as long as the process.
  virtual const device_record& device_of(void* handle) = 0;

  // A context over devices of one platform record.
  virtual std::shared_ptr<native_context> make_context(
      const std::vector<const device_record*>& devices) = 0;
  virtual std::shared_ptr<native_context> adopt_context(void* handle, ownership owner) = 0;
  // The devices of an adopted context; empty where the platform cannot tell.
  virtual std::vector<const device_record*> devices_of(const native_context& context) = 0;

  // A stream over a queue made elsewhere, in whatever order that runs its commands: the commands of
  // the stream run one after the other all the same.
  virtual std::unique_ptr<command_stream> adopt_queue(const memory_place& place, void* handle,
                                                      ownership owner, bool timed) = 0;
  virtual queue_traits traits_of_queue(void* handle) = 0;

  virtual std::shared_ptr<native_program> adopt_program(
      const std::shared_ptr<native_context>& context, void* handle, ownership owner) = 0;
  // `program` may be null where the platform's kernels know their program.
  virtual std::shared_ptr<native_kernel> adopt_kernel(
      const std::shared_ptr<native_context>& context,
      const std::shared_ptr<native_program>& program, void* handle, ownership owner) = 0;

  // Adds a reference for a user who asks for a handle, where the platform counts them.
  virtual void share(native_kind kind, void* handle) = 0;
};

// Throws errc::platform where there is none.
native_platform& native_platform_of(backend kind);

}  // namespace detail
LUMEN_NAMESPACE_END
