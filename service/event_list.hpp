// SPDX-License-Identifier: Apache-2.0
// Lists of events as callers hand them in.
#pragma once

#include "tarn_gpu_launch.h"

namespace kestrel::tarn::gpu {

/// A list that is null or has none is one without events.
inline bool has_events(const tarn_gpu_event_list_t* list) {
  return list != nullptr && list->count > 0;
}

/// The array of a list that has events; Event is what the caller's layer has.
template <typename Event>
const Event* events_of(const tarn_gpu_event_list_t& list) {
  return static_cast<const Event*>(list.events);
}

}  // namespace kestrel::tarn::gpu
