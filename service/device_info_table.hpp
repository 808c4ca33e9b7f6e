// SPDX-License-Identifier: Apache-2.0
// The records of the devices that have been seen, each in its place until the table is cleared.
#pragma once

#include <cstdint>

#include "device_record.hpp"
#include "serv_array.hpp"

namespace kestrel::tarn::gpu {

struct device_info_table {
  static constexpr std::int32_t growth = 8;

  std::int32_t capacity = 0;
  std::int32_t count = 0;
  device_record** entries = nullptr;
  int lock = 0;

  /// The record of a device. A new one is filled by `fill`, under the lock, which takes no other
  /// lock of this library. Null when memory is exhausted.
  template <typename Fill>
  device_record* record_of(void* device, Fill fill) {
    const serv_lock guard(&lock);
    if (device_record* const record = find(device)) {
      return record;
    }
    if (count >= capacity && !resize_array(entries, capacity, capacity + growth)) {
      return nullptr;
    }
    record_owner<device_record> record = make_record<device_record>(device);
    if (record != nullptr) {
      fill(*record);
      entries[count++] = record.get();
    }
    return record.release();
  }

  void clear();

 private:
  device_record* find(const void* device) const;
};

/// What a layer keeps of queues and devices.
template <typename Ring>
struct device_tables {
  device_info_table infos;
  Ring queues;

  void clear() {
    infos.clear();
    queues.clear();
  }
};

}  // namespace kestrel::tarn::gpu
