// SPDX-License-Identifier: Apache-2.0
// group and sub_group (SYCL 2020, sections 4.9.1.7 and 4.9.1.8). A sub-group of the host has one
// item: items of a group run one after the other, so no wider unit makes progress together.
#pragma once

#include <cstdint>

#include "atomic_ref.hpp"
#include "config.hpp"
#include "device_event.hpp"
#include "group_frame.hpp"
#include "multi_ptr.hpp"
#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
struct group_access;

// The part of an asynchronous copy that one item does: it moves every element whose position
// is congruent to the item's own number, so that the items together move each one once.
template <typename Destination, typename Source>
SYCL_EXTERNAL inline void copy_share(std::size_t item, std::size_t items, Destination* to,
                                     std::size_t to_stride, const Source* from,
                                     std::size_t from_stride, std::size_t count) {
  for (std::size_t i = item; i < count; i += items) {
    to[i * to_stride] = from[i * from_stride];
  }
}
}  // namespace detail

template <int Dimensions = 1>
class group {
 public:
  using id_type = id<Dimensions>;
  using range_type = range<Dimensions>;
  using linear_id_type = std::size_t;
  static constexpr int dimensions = Dimensions;
  static constexpr sycl::memory_scope fence_scope = memory_scope::work_group;

  SYCL_EXTERNAL id_type get_group_id() const {
    return detail::coordinates_from<Dimensions, id>(frame_->group_id);
  }
  SYCL_EXTERNAL std::size_t get_group_id(int dimension) const {
    return frame_->group_id[dimension];
  }
  SYCL_EXTERNAL id_type get_id() const { return get_group_id(); }
  SYCL_EXTERNAL std::size_t get_id(int dimension) const { return get_group_id(dimension); }
  SYCL_EXTERNAL std::size_t operator[](int dimension) const { return get_group_id(dimension); }
  SYCL_EXTERNAL id_type get_local_id() const {
    return detail::index_of<Dimensions>(local_linear_, get_local_range());
  }
  SYCL_EXTERNAL std::size_t get_local_id(int dimension) const { return get_local_id()[dimension]; }
  SYCL_EXTERNAL range_type get_local_range() const {
    return detail::coordinates_from<Dimensions, range>(frame_->local_range);
  }
  SYCL_EXTERNAL std::size_t get_local_range(int dimension) const {
    return frame_->local_range[dimension];
  }
  SYCL_EXTERNAL range_type get_max_local_range() const { return get_local_range(); }
  SYCL_EXTERNAL range_type get_group_range() const {
    return detail::coordinates_from<Dimensions, range>(frame_->group_range);
  }
  SYCL_EXTERNAL std::size_t get_group_range(int dimension) const {
    return frame_->group_range[dimension];
  }
  SYCL_EXTERNAL linear_id_type get_group_linear_id() const {
    return detail::linear_index<Dimensions>(get_group_id(), get_group_range());
  }
  SYCL_EXTERNAL linear_id_type get_linear_id() const { return get_group_linear_id(); }
  SYCL_EXTERNAL linear_id_type get_local_linear_id() const { return local_linear_; }
  SYCL_EXTERNAL linear_id_type get_group_linear_range() const { return get_group_range().size(); }
  SYCL_EXTERNAL linear_id_type get_local_linear_range() const { return frame_->item_count; }
  SYCL_EXTERNAL bool leader() const { return local_linear_ == 0; }

  // Copies `count` elements together with all items of the group. Strides are counted in
  // elements of the global side. The result is complete for all items after wait_for.
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_local_ptr<T> to,
                                                   decorated_global_ptr<const T> from,
                                                   std::size_t count) const {
    return async_work_group_copy(to, from, count, 1);
  }
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_local_ptr<T> to,
                                                   decorated_global_ptr<T> from,
                                                   std::size_t count) const {
    return async_work_group_copy(to, decorated_global_ptr<const T>(from), count, 1);
  }
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_global_ptr<T> to,
                                                   decorated_local_ptr<const T> from,
                                                   std::size_t count) const {
    return async_work_group_copy(to, from, count, 1);
  }
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_global_ptr<T> to,
                                                   decorated_local_ptr<T> from,
                                                   std::size_t count) const {
    return async_work_group_copy(to, decorated_local_ptr<const T>(from), count, 1);
  }
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_local_ptr<T> to,
                                                   decorated_global_ptr<const T> from,
                                                   std::size_t count,
                                                   std::size_t from_stride) const {
    detail::copy_share(local_linear_, frame_->item_count, to.get(), 1, from.get(), from_stride,
                       count);
    return device_event(*frame_);
  }
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_local_ptr<T> to,
                                                   decorated_global_ptr<T> from, std::size_t count,
                                                   std::size_t from_stride) const {
    return async_work_group_copy(to, decorated_global_ptr<const T>(from), count, from_stride);
  }
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_global_ptr<T> to,
                                                   decorated_local_ptr<const T> from,
                                                   std::size_t count, std::size_t to_stride) const {
    detail::copy_share(local_linear_, frame_->item_count, to.get(), to_stride, from.get(), 1,
                       count);
    return device_event(*frame_);
  }
  template <typename T>
  SYCL_EXTERNAL device_event async_work_group_copy(decorated_global_ptr<T> to,
                                                   decorated_local_ptr<T> from, std::size_t count,
                                                   std::size_t to_stride) const {
    return async_work_group_copy(to, decorated_local_ptr<const T>(from), count, to_stride);
  }
  template <typename... Events>
  SYCL_EXTERNAL void wait_for(Events... events) const {
    (events.wait(), ...);
  }

  SYCL_EXTERNAL friend bool operator==(const group& a, const group& b) {
    return a.get_group_id() == b.get_group_id() && a.get_local_range() == b.get_local_range() &&
           a.get_group_range() == b.get_group_range();
  }
  SYCL_EXTERNAL friend bool operator!=(const group& a, const group& b) { return !(a == b); }

 private:
  friend struct detail::group_access;
  template <int D>
  friend class nd_item;
  SYCL_EXTERNAL group(detail::group_frame& frame, std::size_t local_linear)
      : frame_(&frame), local_linear_(local_linear) {}

  detail::group_frame* frame_;
  std::size_t local_linear_;
};

class sub_group {
 public:
  using id_type = id<1>;
  using range_type = range<1>;
  using linear_id_type = std::uint32_t;
  static constexpr int dimensions = 1;
  static constexpr sycl::memory_scope fence_scope = memory_scope::sub_group;

  SYCL_EXTERNAL id_type get_group_id() const { return id<1>(index_); }
  SYCL_EXTERNAL id_type get_local_id() const { return id<1>(0); }
  SYCL_EXTERNAL range_type get_local_range() const { return range<1>(1); }
  SYCL_EXTERNAL range_type get_max_local_range() const { return range<1>(1); }
  SYCL_EXTERNAL range_type get_group_range() const { return range<1>(count_); }
  SYCL_EXTERNAL linear_id_type get_group_linear_id() const {
    return static_cast<linear_id_type>(index_);
  }
  SYCL_EXTERNAL linear_id_type get_group_linear_range() const {
    return static_cast<linear_id_type>(count_);
  }
  SYCL_EXTERNAL linear_id_type get_local_linear_id() const { return 0; }
  SYCL_EXTERNAL linear_id_type get_local_linear_range() const { return 1; }
  SYCL_EXTERNAL bool leader() const { return true; }

  SYCL_EXTERNAL friend bool operator==(const sub_group& a, const sub_group& b) {
    return a.index_ == b.index_ && a.count_ == b.count_;
  }
  SYCL_EXTERNAL friend bool operator!=(const sub_group& a, const sub_group& b) { return !(a == b); }

 private:
  template <int D>
  friend class nd_item;
  SYCL_EXTERNAL sub_group(std::size_t index, std::size_t count) : index_(index), count_(count) {}

  std::size_t index_;
  std::size_t count_;
};

namespace detail {
// How group algorithms reach what a group keeps private.
struct group_access {
  template <int Dimensions>
  SYCL_EXTERNAL static group_frame& frame(const group<Dimensions>& g) {
    return *g.frame_;
  }
};
}  // namespace detail

LUMEN_NAMESPACE_END
