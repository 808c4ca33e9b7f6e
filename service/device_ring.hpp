// SPDX-License-Identifier: Apache-2.0
// Which device a queue was seen to have, for the latest queues. Each layer has a ring of its own,
// with entries of its own: what an entry keeps of a queue, and whether it is found again by it.
#pragma once

#include <cstdint>
#include <optional>

#include "serv_array.hpp"
#include "serv_lock.hpp"

namespace kestrel::tarn::gpu {

/// `Entry` has a type `queue_key`, a member `device`, `is_of(queue_key)`, and
/// `assign(device, queue_key)`.
template <typename Entry>
struct device_ring {
  using queue_key = typename Entry::queue_key;

  static constexpr std::int32_t limit = 2048;  // a power of two, so that indices wrap by a mask
  static constexpr std::int32_t mask = limit - 1;
  static constexpr std::int32_t growth = 8;

  std::int32_t capacity = 0;
  std::int32_t count = 0;
  std::int32_t next_victim = 0;
  std::int32_t last = -1;
  Entry** entries = nullptr;
  int lock = 0;

  /// The device of a queue, from the ring or by `ask`, which gives a std::optional<void*> and is
  /// called under the lock; what it gives is remembered, if there is memory. Empty when `ask`
  /// fails.
  template <typename Ask>
  std::optional<void*> device_of(const queue_key& queue, Ask ask) {
    const serv_lock guard(&lock);
    if (const Entry* const entry = find(queue)) {
      return entry->device;
    }
    const std::optional<void*> device = ask();
    if (device) {
      remember(*device, queue);
    }
    return device;
  }

  void clear() {
    const serv_lock guard(&lock);
    for (std::int32_t i = 0; i < count; ++i) {
      record_deleter()(entries[i]);
    }
    tarn_serv_free(entries);
    capacity = count = next_victim = 0;
    last = -1;
    entries = nullptr;
  }

 private:
  const Entry* find(const queue_key& queue) const {
    std::int32_t index = last;
    for (std::int32_t step = 0; step < count; ++step, index = (index - 1) & mask) {
      if (entries[index]->is_of(queue)) {
        return entries[index];
      }
    }
    return nullptr;
  }

  void remember(void* device, const queue_key& queue) {
    if (count >= limit) {
      entries[next_victim]->assign(device, queue);
      last = next_victim;
      next_victim = (next_victim + 1) & mask;
      return;
    }
    if (count >= capacity && !resize_array(entries, capacity, capacity + growth)) {
      return;
    }
    if (record_owner<Entry> entry = make_record<Entry>()) {
      entry->assign(device, queue);
      last = (last + 1) & mask;
      entries[last] = entry.release();
      ++count;
    }
  }
};

}  // namespace kestrel::tarn::gpu
