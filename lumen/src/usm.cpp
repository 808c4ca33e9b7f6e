// SPDX-License-Identifier: Apache-2.0
// Unified shared memory and the table of what lies where.
#include "sycl/detail/usm.hpp"

#include <algorithm>
#include <cstdint>
#include <map>
#include <shared_mutex>

#include "backend.hpp"
#include "context_state.hpp"

LUMEN_NAMESPACE_BEGIN

namespace {

struct allocation {
  std::size_t bytes;
  usm::alloc kind;
  std::shared_ptr<const detail::memory_place> place;
  std::shared_ptr<detail::context_state> owner;
};

// All allocations of the process by address. A look-up takes one shared lock and a search.
class allocation_table {
 public:
  static allocation_table& instance() {
    static allocation_table& only = *new allocation_table;
    return only;
  }

  void add(void* pointer, allocation entry) {
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    entries_.emplace(address(pointer), std::move(entry));
  }
  // Takes out the allocation that begins at the pointer; `bytes` is 0 when there is none.
  allocation take(const void* pointer, const detail::context_state& owner) {
    const std::unique_lock<std::shared_mutex> lock(mutex_);
    const auto place = entries_.find(address(pointer));
    if (place == entries_.end() || place->second.owner.get() != &owner) {
      return {0, usm::alloc::unknown, nullptr, nullptr};
    }
    allocation entry = std::move(place->second);
    entries_.erase(place);
    return entry;
  }
  // Kind and device of the allocation around the pointer.
  std::pair<usm::alloc, const detail::device_record*> find(
      const void* pointer, const detail::context_state& owner) const {
    const std::shared_lock<std::shared_mutex> lock(mutex_);
    auto place = entries_.upper_bound(address(pointer));
    if (place == entries_.begin()) {
      return {usm::alloc::unknown, nullptr};
    }
    --place;
    const allocation& entry = place->second;
    if (address(pointer) - place->first >= entry.bytes || entry.owner.get() != &owner) {
      return {usm::alloc::unknown, nullptr};
    }
    return {entry.kind, &entry.place->device};
  }

 private:
  static std::uintptr_t address(const void* pointer) {
    return reinterpret_cast<std::uintptr_t>(pointer);
  }
  mutable std::shared_mutex mutex_;
  std::map<std::uintptr_t, allocation> entries_;
};

constexpr std::size_t least_alignment = 64;

aspect aspect_of(usm::alloc kind) {
  return kind == usm::alloc::device ? aspect::usm_device_allocations
         : kind == usm::alloc::host ? aspect::usm_host_allocations
                                    : aspect::usm_shared_allocations;
}

}  // namespace

void* aligned_alloc(std::size_t alignment, std::size_t bytes, const device& dev, const context& ctx,
                    usm::alloc kind, const property_list&) {
  const auto& owner = detail::context_state::shared(ctx);
  const std::shared_ptr<detail::memory_place>& place = owner->place_of(dev);
  const detail::device_record& record = place->device;
  if (kind != usm::alloc::unknown && !dev.has(aspect_of(kind))) {
    throw exception(make_error_code(errc::feature_not_supported),
                    record.properties.name + " has no unified shared memory of this kind");
  }
  const bool power_of_two = (alignment & (alignment - 1)) == 0;
  if (bytes == 0 || !power_of_two || kind == usm::alloc::unknown ||
      bytes > record.properties.max_mem_alloc_size || alignment > bytes + (std::size_t{1} << 30)) {
    return nullptr;
  }
  void* pointer =
      record.driver->allocate(*place, kind, std::max(alignment, least_alignment), bytes);
  if (pointer != nullptr) {
    try {
      allocation_table::instance().add(pointer, {bytes, kind, place, owner});
    } catch (...) {
      record.driver->release(*place, kind, pointer);
      throw;
    }
  }
  return pointer;
}

void free(void* pointer, const context& ctx) {
  if (pointer == nullptr) {
    return;
  }
  const allocation entry =
      allocation_table::instance().take(pointer, detail::context_state::of(ctx));
  if (entry.place == nullptr) {
    throw exception(make_error_code(errc::invalid),
                    "free: no allocation of the context begins at the pointer");
  }
  entry.place->device.driver->release(*entry.place, entry.kind, pointer);
}

usm::alloc get_pointer_type(const void* pointer, const context& ctx) {
  return allocation_table::instance().find(pointer, detail::context_state::of(ctx)).first;
}

device get_pointer_device(const void* pointer, const context& ctx) {
  const auto found = allocation_table::instance().find(pointer, detail::context_state::of(ctx));
  if (found.second == nullptr) {
    throw exception(make_error_code(errc::invalid),
                    "the pointer lies in no allocation of the context");
  }
  return detail::device_record::handle(*found.second);
}

LUMEN_NAMESPACE_END
