// SPDX-License-Identifier: Apache-2.0
// Moving the contents of buffers to devices and back, when somebody needs them there.
#include "buffer_copies.hpp"

#include <algorithm>

#include "sycl/detail/exception.hpp"

LUMEN_NAMESPACE_BEGIN
namespace detail {

buffer_copies::~buffer_copies() {
  for (const copy& each : copies_) {
    each.place->device.driver->release(*each.place, usm::alloc::device, each.memory);
  }
}

buffer_copies::copy& buffer_copies::copy_in(const memory_place& place) {
  const auto found = std::find_if(copies_.begin(), copies_.end(), [&place](const copy& each) {
    return each.place.get() == &place;
  });
  if (found != copies_.end()) {
    return *found;
  }
  constexpr std::size_t alignment = 256;  // of every device's own allocations
  copies_.reserve(copies_.size() + 1);
  void* memory = place.device.driver->allocate(place, usm::alloc::device, alignment,
                                               std::max(bytes_, std::size_t{1}));
  if (memory == nullptr) {
    throw exception(make_error_code(errc::memory_allocation),
                    "a buffer does not fit in the memory of the device");
  }
  copies_.push_back({place.shared_from_this(), memory, false, nullptr});
  return copies_.back();
}

void* buffer_copies::address_on(const memory_place& place) {
  const std::lock_guard<std::mutex> lock(mutex_);
  return copy_in(place).memory;
}

void* buffer_copies::host_address(const memory_place& place, void* address) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto number = [](const void* pointer) { return reinterpret_cast<std::uintptr_t>(pointer); };
  for (const copy& each : copies_) {
    // One past the end is an address of the copy as well: that of an empty window.
    if (each.place.get() == &place && number(address) >= number(each.memory) &&
        number(address) - number(each.memory) <= bytes_) {
      return host_ + (number(address) - number(each.memory));
    }
  }
  return address;
}

buffer_copies::copy* buffer_copies::current_copy() {
  const auto found =
      std::find_if(copies_.begin(), copies_.end(), [](const copy& each) { return each.current; });
  return found == copies_.end() ? nullptr : &*found;
}

// The tasks that made the contents are done, or were issued and wait in the streams: only copies
// between devices may be under way without a task that the caller comes after.
void buffer_copies::bring_home() {
  copy* const source = current_copy();
  if (host_current_ || source == nullptr) {
    return;
  }
  if (source->arrival) {
    source->arrival->wait();
  }
  source->place->device.driver->copy(*source->place, host_, source->memory, bytes_);
  host_current_ = true;
}

void buffer_copies::to_device(const memory_place& place, command_stream& stream, access_kind use) {
  const std::lock_guard<std::mutex> lock(mutex_);
  copy& mine = copy_in(place);
  if (!mine.current && use.keeps) {
    copy* const other = host_current_ ? nullptr : current_copy();
    if (other != nullptr && copies_directly(*other->place, place)) {
      if (other->arrival) {
        stream.wait_for(*other->arrival);
      }
      stream.copy(mine.memory, other->memory, bytes_);
      mine.arrival = stream.mark();
    } else {
      bring_home();
      if (host_current_) {
        stream.copy(mine.memory, host_, bytes_);
        mine.arrival = stream.mark();
      }
    }
  } else if (mine.arrival) {
    stream.wait_for(*mine.arrival);
    if (mine.arrival->reached()) {
      mine.arrival.reset();
    }
  }
  mine.current = true;
  if (use.writes) {
    host_current_ = false;
    for (copy& each : copies_) {
      each.current = &each == &mine;
    }
  }
}

void buffer_copies::to_host(access_kind use) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (use.keeps) {
    bring_home();
  }
  if (use.writes) {
    host_current_ = true;
    for (copy& each : copies_) {
      each.current = false;
    }
  }
}

}  // namespace detail
LUMEN_NAMESPACE_END
