// SPDX-License-Identifier: Apache-2.0
// local_accessor (SYCL 2020, section 4.7.6.11): memory that the items of one work-group share.
// The object holds a place within the group's block; the block is found where the kernel runs.
#pragma once

#include <cstddef>
#include <functional>

#include "accessor_base.hpp"
#include "group_frame.hpp"
#include "multi_ptr.hpp"
#include "property.hpp"

LUMEN_NAMESPACE_BEGIN

class handler;

namespace detail {
// Sets aside local memory for a command group and returns its place in the group's block.
LUMEN_EXPORT std::size_t reserve_local(handler& group, std::size_t bytes, std::size_t alignment);
}  // namespace detail

template <typename DataT, int Dimensions = 1>
class local_accessor {
 public:
  static constexpr access::address_space pointer_space = access::address_space::local_space;
  using value_type = DataT;
  using reference = DataT&;
  using const_reference = const DataT&;
  using iterator = DataT*;
  using const_iterator = const DataT*;
  using difference_type = std::ptrdiff_t;
  using size_type = std::size_t;
  template <access::decorated Decorated>
  using accessor_ptr = multi_ptr<DataT, pointer_space, Decorated>;

  local_accessor() = default;
  local_accessor(range<Dimensions> sizes, handler& group, const property_list& = {})
      : range_(sizes),
        place_(detail::reserve_local(group, detail::byte_count(sizes, sizeof(DataT)),
                                     alignof(DataT))) {}

  SYCL_EXTERNAL size_type size() const noexcept { return range_.size(); }
  SYCL_EXTERNAL size_type max_size() const noexcept { return size_type(-1) / sizeof(DataT); }
  SYCL_EXTERNAL size_type byte_size() const noexcept { return size() * sizeof(DataT); }
  SYCL_EXTERNAL bool empty() const noexcept { return size() == 0; }
  SYCL_EXTERNAL range<Dimensions> get_range() const { return range_; }

  SYCL_EXTERNAL reference operator[](id<Dimensions> index) const {
    return begin_address()[detail::linear_index<Dimensions>(index, range_)];
  }
  template <typename Integer, std::enable_if_t<std::is_integral_v<Integer>, int> = 0>
  SYCL_EXTERNAL decltype(auto) operator[](Integer index) const {
    if constexpr (Dimensions == 1) {
      return (begin_address()[static_cast<std::size_t>(index)]);
    } else {
      return detail::accessor_row<DataT, Dimensions, Dimensions>(
          begin_address(), range_)[static_cast<std::size_t>(index)];
    }
  }
  SYCL_EXTERNAL std::add_pointer_t<DataT> get_pointer() const noexcept { return begin_address(); }
  template <access::decorated Decorated>
  SYCL_EXTERNAL accessor_ptr<Decorated> get_multi_ptr() const noexcept {
    return accessor_ptr<Decorated>(begin_address());
  }
  SYCL_EXTERNAL iterator begin() const noexcept { return begin_address(); }
  SYCL_EXTERNAL iterator end() const noexcept { return begin_address() + size(); }
  SYCL_EXTERNAL const_iterator cbegin() const noexcept { return begin_address(); }
  SYCL_EXTERNAL const_iterator cend() const noexcept { return begin_address() + size(); }
  friend bool operator==(const local_accessor& a, const local_accessor& b) {
    return a.place_ == b.place_ && a.range_ == b.range_;
  }
  friend bool operator!=(const local_accessor& a, const local_accessor& b) { return !(a == b); }

 private:
  SYCL_EXTERNAL DataT* begin_address() const {
    return reinterpret_cast<DataT*>(detail::local_memory() + place_);
  }

  range<Dimensions> range_;
  std::size_t place_ = 0;
};

namespace detail {
template <typename T>
inline constexpr bool is_local_accessor = false;
template <typename T, int Dimensions>
inline constexpr bool is_local_accessor<local_accessor<T, Dimensions>> = true;
}  // namespace detail

LUMEN_NAMESPACE_END
