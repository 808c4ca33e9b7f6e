// SPDX-License-Identifier: Apache-2.0
// The table of device records.
#include "device_info_table.hpp"

namespace kestrel::tarn::gpu {

device_record* device_info_table::find(const void* device) const {
  for (std::int32_t i = 0; i < count; ++i) {
    if (entries[i]->device_id == device) {
      return entries[i];
    }
  }
  return nullptr;
}

void device_info_table::clear() {
  const serv_lock guard(&lock);
  for (std::int32_t i = 0; i < count; ++i) {
    record_deleter()(entries[i]);
  }
  tarn_serv_free(entries);
  capacity = count = 0;
  entries = nullptr;
}

}  // namespace kestrel::tarn::gpu
