// SPDX-License-Identifier: Apache-2.0
// The copies of one buffer on devices with memory of their own, and which of them are current. The
// graph of tasks sees to it that nobody uses the contents while another changes them; readers on
// several devices may come at one time.
#pragma once

#include <cstddef>
#include <memory>
#include <mutex>
#include <vector>

#include "backend.hpp"
#include "sycl/detail/buffer_core.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

class buffer_copies {
 public:
  // `host_current`: the host's memory holds contents. Otherwise there are none yet.
  buffer_copies(void* host, std::size_t bytes, bool host_current)
      : host_(static_cast<char*>(host)), bytes_(bytes), host_current_(host_current) {}
  buffer_copies(const buffer_copies&) = delete;
  buffer_copies& operator=(const buffer_copies&) = delete;
  ~buffer_copies();

  // The place of the copy, made at first use; throws errc::memory_allocation.
  void* address_on(const memory_place& place);
  void* host_address(const memory_place& place, void* address);
  // Sees to it that commands which go into the stream from now on find the contents in the place.
  void to_device(const memory_place& place, command_stream& stream, access_kind use);
  // Makes the host's memory current, on return.
  void to_host(access_kind use);

 private:
  struct copy {
    std::shared_ptr<const memory_place> place;
    void* memory;
    bool current;
    std::shared_ptr<stream_mark> arrival;  // of contents that may still be on their way, or null
  };
  copy& copy_in(const memory_place& place);
  copy* current_copy();
  void bring_home();

  char* const host_;
  const std::size_t bytes_;
  std::mutex mutex_;
  bool host_current_;
  std::vector<copy> copies_;
};

}  // namespace detail
LUMEN_NAMESPACE_END
