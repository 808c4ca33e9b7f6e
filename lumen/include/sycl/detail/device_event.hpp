// SPDX-License-Identifier: Apache-2.0
// device_event (SYCL 2020, section 4.9.1.9): the end of an asynchronous work-group copy.
#pragma once

#include "group_frame.hpp"

LUMEN_NAMESPACE_BEGIN

template <int Dimensions>
class group;

class device_event {
 public:
  // All items of the group wait together; the copied elements are visible to all afterwards.
  SYCL_EXTERNAL void wait() const { detail::group_wait(*frame_); }

 private:
  template <int D>
  friend class group;
  SYCL_EXTERNAL explicit device_event(detail::group_frame& frame) : frame_(&frame) {}

  detail::group_frame* frame_;
};

LUMEN_NAMESPACE_END
