// SPDX-License-Identifier: Apache-2.0
// item (SYCL 2020, section 4.9.1.4): one point of a parallel_for over a range.
#pragma once

#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {
struct item_maker;
}

template <int Dimensions = 1, bool WithOffset = true>
class item : public detail::number_like<item<Dimensions, WithOffset>, Dimensions> {
 public:
  static constexpr int dimensions = Dimensions;
  item() = delete;

  SYCL_EXTERNAL id<Dimensions> get_id() const { return index_; }
  SYCL_EXTERNAL std::size_t get_id(int dimension) const { return index_[dimension]; }
  SYCL_EXTERNAL std::size_t operator[](int dimension) const { return index_[dimension]; }
  SYCL_EXTERNAL range<Dimensions> get_range() const { return sizes_; }
  SYCL_EXTERNAL std::size_t get_range(int dimension) const { return sizes_[dimension]; }
  // Row-major, without the offset.
  SYCL_EXTERNAL std::size_t get_linear_id() const {
    if constexpr (WithOffset) {
      return detail::linear_index<Dimensions>(index_ - offset_, sizes_);
    } else {
      return detail::linear_index<Dimensions>(index_, sizes_);
    }
  }
  template <bool O = WithOffset, std::enable_if_t<O, int> = 0>
  SYCL_EXTERNAL id<Dimensions> get_offset() const {
    return offset_;
  }
  template <bool O = WithOffset, std::enable_if_t<!O, int> = 0>
  SYCL_EXTERNAL operator item<Dimensions, !O>() const {
    return item<Dimensions, true>(index_, sizes_, id<Dimensions>());
  }

  SYCL_EXTERNAL friend bool operator==(const item& a, const item& b) {
    return a.index_ == b.index_ && a.sizes_ == b.sizes_ && a.offset_ == b.offset_;
  }
  SYCL_EXTERNAL friend bool operator!=(const item& a, const item& b) { return !(a == b); }

 private:
  friend struct detail::item_maker;
  template <int D, bool O>
  friend class item;

  SYCL_EXTERNAL item(id<Dimensions> index, range<Dimensions> sizes, id<Dimensions> offset)
      : index_(index), sizes_(sizes), offset_(offset) {}

  id<Dimensions> index_;
  range<Dimensions> sizes_;
  id<Dimensions> offset_;
};

namespace detail {
// The runtime's way to make an item; users only receive them.
struct item_maker {
  template <int Dimensions>
  SYCL_EXTERNAL static item<Dimensions, true> with_offset(id<Dimensions> index,
                                                          range<Dimensions> sizes,
                                                          id<Dimensions> offset) {
    return item<Dimensions, true>(index, sizes, offset);
  }
  template <int Dimensions>
  SYCL_EXTERNAL static item<Dimensions, false> plain(id<Dimensions> index,
                                                     range<Dimensions> sizes) {
    return item<Dimensions, false>(index, sizes, id<Dimensions>());
  }
};
}  // namespace detail

LUMEN_NAMESPACE_END
