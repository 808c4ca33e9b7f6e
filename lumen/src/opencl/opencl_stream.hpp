// SPDX-License-Identifier: Apache-2.0
// Streams over OpenCL queues, and their marks, which are events.
#pragma once

#include "../backend.hpp"
#include "opencl_context.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

// Events that the next command of a queue waits for.
class wait_list {
 public:
  wait_list() = default;
  wait_list(const wait_list&) = delete;
  wait_list& operator=(const wait_list&) = delete;
  ~wait_list() { clear(); }

  // Takes a reference of its own.
  void add(cl_event event);
  // There is a place for one more without an allocation.
  void reserve() { events_.reserve(events_.size() + 1); }
  // Takes over the caller's reference; after reserve.
  void become(cl_event event) noexcept;
  void clear() noexcept;
  cl_uint count() const noexcept { return static_cast<cl_uint>(events_.size()); }
  const cl_event* data() const noexcept { return events_.empty() ? nullptr : events_.data(); }

 private:
  std::vector<cl_event> events_;
};

class opencl_stream final : public command_stream {
 public:
  // `clock` is null where no times are kept. In a queue that does not keep the order of its
  // commands each waits for the one before.
  opencl_stream(const device_record& device, opencl_reference<cl_command_queue> queue,
                bool in_order, std::shared_ptr<device_clock> clock)
      : device_(device), queue_(std::move(queue)), in_order_(in_order), clock_(std::move(clock)) {}

  void launch(const launch_shape& shape, kernel_command& kernel) override;
  void launch(const native_shape& shape, native_kernel& kernel,
              const std::vector<kernel_argument>& arguments) override;
  void copy(void* to, const void* from, std::size_t bytes) override;
  void fill(void* to, const void* pattern, std::size_t pattern_bytes, std::size_t count) override;
  void prefetch(void* pointer, std::size_t bytes) override;
  // The standard leaves the advice to the backend; none is defined here.
  void advise(void*, std::size_t, int) override {}
  void wait_for(stream_mark& mark) override;
  void drain() noexcept override;
  std::shared_ptr<stream_mark> mark() override;
  void* native_handle() const noexcept override { return queue_.get(); }

 private:
  void check_shared_memory() const;
  template <typename Command>
  void enqueue(const char* name, const Command& command);

  const device_record& device_;
  const opencl_reference<cl_command_queue> queue_;
  const bool in_order_;
  const std::shared_ptr<device_clock> clock_;
  wait_list before_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
