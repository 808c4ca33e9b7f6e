// SPDX-License-Identifier: Apache-2.0
// nd_item (SYCL 2020, section 4.9.1.5): one item of a parallel_for over an nd_range, and the
// barrier of its group.
#pragma once

#include "access.hpp"
#include "group.hpp"
#include "item.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
struct nd_item_maker;
}

template <int Dimensions = 1>
class nd_item {
 public:
  static constexpr int dimensions = Dimensions;
  nd_item() = delete;

  SYCL_EXTERNAL id<Dimensions> get_global_id() const {
    id<Dimensions> result;
    for (int d = 0; d < Dimensions; ++d) {
      result[d] = get_global_id(d);
    }
    return result;
  }
  SYCL_EXTERNAL std::size_t get_global_id(int d) const {
    return frame_->group_id[d] * frame_->local_range[d] + local_[d] + frame_->offset[d];
  }
  // Row-major, without the offset.
  SYCL_EXTERNAL std::size_t get_global_linear_id() const {
    return detail::linear_index<Dimensions>(get_global_id() - get_offset(), get_global_range());
  }
  SYCL_EXTERNAL id<Dimensions> get_local_id() const { return local_; }
  SYCL_EXTERNAL std::size_t get_local_id(int d) const { return local_[d]; }
  SYCL_EXTERNAL std::size_t get_local_linear_id() const { return local_linear_; }
  SYCL_EXTERNAL group<Dimensions> get_group() const {
    return group<Dimensions>(*frame_, local_linear_);
  }
  SYCL_EXTERNAL std::size_t get_group(int d) const { return frame_->group_id[d]; }
  SYCL_EXTERNAL std::size_t get_group_linear_id() const {
    return get_group().get_group_linear_id();
  }
  SYCL_EXTERNAL sub_group get_sub_group() const {
    return sub_group(local_linear_, frame_->item_count);
  }
  SYCL_EXTERNAL range<Dimensions> get_group_range() const { return get_group().get_group_range(); }
  SYCL_EXTERNAL std::size_t get_group_range(int d) const { return frame_->group_range[d]; }
  SYCL_EXTERNAL range<Dimensions> get_local_range() const { return get_group().get_local_range(); }
  SYCL_EXTERNAL std::size_t get_local_range(int d) const { return frame_->local_range[d]; }
  SYCL_EXTERNAL range<Dimensions> get_global_range() const {
    return get_group_range() * get_local_range();
  }
  SYCL_EXTERNAL std::size_t get_global_range(int d) const {
    return frame_->group_range[d] * frame_->local_range[d];
  }
  SYCL_EXTERNAL id<Dimensions> get_offset() const {
    return detail::coordinates_from<Dimensions, id>(frame_->offset);
  }
  SYCL_EXTERNAL nd_range<Dimensions> get_nd_range() const {
    return nd_range<Dimensions>(get_global_range(), get_local_range(), get_offset());
  }

  // All items of the group meet here; none goes on before the last has come.
  SYCL_EXTERNAL void barrier(access::fence_space = access::fence_space::global_and_local) const {
    detail::group_wait(*frame_);
  }

  // The copies of group::async_work_group_copy.
  template <typename... Arguments>
  SYCL_EXTERNAL device_event async_work_group_copy(Arguments... arguments) const {
    return get_group().async_work_group_copy(arguments...);
  }
  template <typename... Events>
  SYCL_EXTERNAL void wait_for(Events... events) const {
    (events.wait(), ...);
  }

  SYCL_EXTERNAL friend bool operator==(const nd_item& a, const nd_item& b) {
    return a.get_nd_range() == b.get_nd_range() && a.get_global_id() == b.get_global_id();
  }
  SYCL_EXTERNAL friend bool operator!=(const nd_item& a, const nd_item& b) { return !(a == b); }

 private:
  friend struct detail::nd_item_maker;
  SYCL_EXTERNAL nd_item(detail::group_frame& frame, std::size_t local_linear)
      : frame_(&frame),
        local_linear_(local_linear),
        local_(detail::index_of<Dimensions>(
            local_linear, detail::coordinates_from<Dimensions, range>(frame.local_range))) {}

  detail::group_frame* frame_;
  std::size_t local_linear_;
  id<Dimensions> local_;
};

namespace detail {
// The runtime's way to make an nd_item; users only receive them.
struct nd_item_maker {
  template <int Dimensions>
  SYCL_EXTERNAL static nd_item<Dimensions> make(group_frame& frame, std::size_t local_linear) {
    return nd_item<Dimensions>(frame, local_linear);
  }
};
}  // namespace detail

// The barrier of a group as a free function.
template <int Dimensions>
SYCL_EXTERNAL inline void group_barrier(const group<Dimensions>& g,
                                        memory_scope = memory_scope::work_group) {
  detail::group_wait(detail::group_access::frame(g));
}
SYCL_EXTERNAL inline void group_barrier(const sub_group&, memory_scope = memory_scope::sub_group) {}

LUMEN_NAMESPACE_END
