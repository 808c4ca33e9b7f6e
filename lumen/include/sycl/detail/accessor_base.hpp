// SPDX-License-Identifier: Apache-2.0
// What all accessors share: a window of a row-major array, indexed by id or dimension by
// dimension.
#pragma once

#include <cstddef>
#include <iterator>
#include <type_traits>

#include "range.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// a[i][j]: the row that is left after some indices were given.
template <typename Element, int Dimensions, int Left>
class accessor_row {
 public:
  SYCL_EXTERNAL accessor_row(Element* first, const range<Dimensions>& sizes)
      : first_(first), sizes_(sizes) {}
  SYCL_EXTERNAL decltype(auto) operator[](std::size_t index) const {
    if constexpr (Left == 1) {
      return (first_[index]);
    } else {
      std::size_t step = 1;
      for (int d = Dimensions - Left + 1; d < Dimensions; ++d) {
        step *= sizes_[d];
      }
      return accessor_row<Element, Dimensions, Left - 1>(first_ + index * step, sizes_);
    }
  }

 private:
  Element* first_;
  range<Dimensions> sizes_;
};

// Walks the elements of a window in row-major order.
template <typename Element, int Dimensions>
class window_iterator {
 public:
  using iterator_category = std::random_access_iterator_tag;
  using value_type = std::remove_cv_t<Element>;
  using difference_type = std::ptrdiff_t;
  using pointer = Element*;
  using reference = Element&;

  window_iterator() = default;
  SYCL_EXTERNAL window_iterator(Element* first, range<Dimensions> memory, range<Dimensions> window,
                                difference_type position)
      : first_(first), memory_(memory), window_(window), position_(position) {}
  SYCL_EXTERNAL reference operator*() const {
    if constexpr (Dimensions == 1) {
      return first_[position_];
    } else {
      return first_[linear_index<Dimensions>(
          index_of<Dimensions>(static_cast<std::size_t>(position_), window_), memory_)];
    }
  }
  SYCL_EXTERNAL pointer operator->() const { return &**this; }
  SYCL_EXTERNAL reference operator[](difference_type n) const { return *(*this + n); }
  SYCL_EXTERNAL window_iterator& operator+=(difference_type n) {
    position_ += n;
    return *this;
  }
  SYCL_EXTERNAL window_iterator& operator-=(difference_type n) { return *this += -n; }
  SYCL_EXTERNAL window_iterator& operator++() { return *this += 1; }
  SYCL_EXTERNAL window_iterator& operator--() { return *this += -1; }
  SYCL_EXTERNAL window_iterator operator++(int) {
    window_iterator before = *this;
    ++*this;
    return before;
  }
  SYCL_EXTERNAL window_iterator operator--(int) {
    window_iterator before = *this;
    --*this;
    return before;
  }
  SYCL_EXTERNAL friend window_iterator operator+(window_iterator i, difference_type n) {
    return i += n;
  }
  SYCL_EXTERNAL friend window_iterator operator+(difference_type n, window_iterator i) {
    return i += n;
  }
  SYCL_EXTERNAL friend window_iterator operator-(window_iterator i, difference_type n) {
    return i -= n;
  }
  SYCL_EXTERNAL friend difference_type operator-(const window_iterator& a,
                                                 const window_iterator& b) {
    return a.position_ - b.position_;
  }
  SYCL_EXTERNAL friend bool operator==(const window_iterator& a, const window_iterator& b) {
    return a.position_ == b.position_;
  }
  SYCL_EXTERNAL friend bool operator!=(const window_iterator& a, const window_iterator& b) {
    return a.position_ != b.position_;
  }
  SYCL_EXTERNAL friend bool operator<(const window_iterator& a, const window_iterator& b) {
    return a.position_ < b.position_;
  }
  SYCL_EXTERNAL friend bool operator>(const window_iterator& a, const window_iterator& b) {
    return b < a;
  }
  SYCL_EXTERNAL friend bool operator<=(const window_iterator& a, const window_iterator& b) {
    return !(b < a);
  }
  SYCL_EXTERNAL friend bool operator>=(const window_iterator& a, const window_iterator& b) {
    return !(a < b);
  }

 private:
  Element* first_ = nullptr;
  range<Dimensions> memory_;
  range<Dimensions> window_;
  difference_type position_ = 0;
};

// A window into buffer memory: `first_` is its corner, `memory_` the sizes of the whole.
template <typename Element, int Dimensions>
class window {
 public:
  static constexpr int dimensions = Dimensions;
  using value_type = Element;
  using reference = Element&;
  using const_reference = const Element&;
  using difference_type = std::ptrdiff_t;
  using size_type = std::size_t;
  using iterator = window_iterator<Element, Dimensions>;
  using const_iterator = window_iterator<const Element, Dimensions>;
  using reverse_iterator = std::reverse_iterator<iterator>;
  using const_reverse_iterator = std::reverse_iterator<const_iterator>;

  SYCL_EXTERNAL size_type size() const noexcept { return range_.size(); }
  SYCL_EXTERNAL size_type max_size() const noexcept { return size_type(-1) / sizeof(Element); }
  SYCL_EXTERNAL size_type byte_size() const noexcept { return size() * sizeof(Element); }
  SYCL_EXTERNAL bool empty() const noexcept { return size() == 0; }
  SYCL_EXTERNAL range<Dimensions> get_range() const { return range_; }
  SYCL_EXTERNAL id<Dimensions> get_offset() const { return offset_; }

  SYCL_EXTERNAL reference operator[](id<Dimensions> index) const {
    return first_[linear_index<Dimensions>(index, memory_)];
  }
  template <typename Integer, std::enable_if_t<std::is_integral_v<Integer>, int> = 0>
  SYCL_EXTERNAL decltype(auto) operator[](Integer index) const {
    if constexpr (Dimensions == 1) {
      return (first_[static_cast<std::size_t>(index)]);
    } else {
      return accessor_row<Element, Dimensions, Dimensions>(
          first_, memory_)[static_cast<std::size_t>(index)];
    }
  }

  SYCL_EXTERNAL iterator begin() const noexcept { return {first_, memory_, range_, 0}; }
  SYCL_EXTERNAL iterator end() const noexcept {
    return {first_, memory_, range_, static_cast<difference_type>(size())};
  }
  SYCL_EXTERNAL const_iterator cbegin() const noexcept { return {first_, memory_, range_, 0}; }
  SYCL_EXTERNAL const_iterator cend() const noexcept {
    return {first_, memory_, range_, static_cast<difference_type>(size())};
  }
  reverse_iterator rbegin() const noexcept { return reverse_iterator(end()); }
  reverse_iterator rend() const noexcept { return reverse_iterator(begin()); }
  const_reverse_iterator crbegin() const noexcept { return const_reverse_iterator(cend()); }
  const_reverse_iterator crend() const noexcept { return const_reverse_iterator(cbegin()); }

 protected:
  window() = default;
  window(Element* memory_start, range<Dimensions> memory, range<Dimensions> part,
         id<Dimensions> offset)
      : first_(memory_start + linear_index<Dimensions>(offset, memory)),
        memory_(memory),
        range_(part),
        offset_(offset) {}

  SYCL_EXTERNAL Element* memory_start() const {
    return first_ - linear_index<Dimensions>(offset_, memory_);
  }

  Element* first_ = nullptr;
  range<Dimensions> memory_;
  range<Dimensions> range_;
  id<Dimensions> offset_;
};

}  // namespace detail

LUMEN_NAMESPACE_END
