// SPDX-License-Identifier: Apache-2.0
// range, id and nd_range (SYCL 2020, section 4.9.1): one to three sizes with element-wise
// arithmetic. Dimension 0 is the slowest, the last one the fastest.
#pragma once

#include <cstddef>
#include <type_traits>

#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// The shared shape of range and id. Derived supplies the type of results.
template <template <int> class Derived, int Dimensions>
class coordinates {
  static_assert(Dimensions >= 1 && Dimensions <= 3, "SYCL has one to three dimensions");

 public:
  SYCL_EXTERNAL std::size_t get(int dimension) const { return values_[dimension]; }
  SYCL_EXTERNAL std::size_t& operator[](int dimension) { return values_[dimension]; }
  SYCL_EXTERNAL std::size_t operator[](int dimension) const { return values_[dimension]; }

  SYCL_EXTERNAL friend bool operator==(const Derived<Dimensions>& a, const Derived<Dimensions>& b) {
    bool equal = true;
    for (int d = 0; d < Dimensions; ++d) {
      equal = equal && a[d] == b[d];
    }
    return equal;
  }
  SYCL_EXTERNAL friend bool operator!=(const Derived<Dimensions>& a, const Derived<Dimensions>& b) {
    return !(a == b);
  }

  template <typename Integer,
            std::enable_if_t<std::is_integral_v<Integer> && Dimensions == 1, int> = 0>
  SYCL_EXTERNAL friend bool operator==(const Derived<Dimensions>& a, Integer b) {
    return a[0] == static_cast<std::size_t>(b);
  }
  template <typename Integer,
            std::enable_if_t<std::is_integral_v<Integer> && Dimensions == 1, int> = 0>
  SYCL_EXTERNAL friend bool operator==(Integer a, const Derived<Dimensions>& b) {
    return b == a;
  }
  template <typename Integer,
            std::enable_if_t<std::is_integral_v<Integer> && Dimensions == 1, int> = 0>
  SYCL_EXTERNAL friend bool operator!=(const Derived<Dimensions>& a, Integer b) {
    return !(a == b);
  }
  template <typename Integer,
            std::enable_if_t<std::is_integral_v<Integer> && Dimensions == 1, int> = 0>
  SYCL_EXTERNAL friend bool operator!=(Integer a, const Derived<Dimensions>& b) {
    return !(b == a);
  }

// Integral operands are templates: with a plain size_t the built-in operator would tie
// with these for id<1>, which converts to size_t.
#define LUMEN_COORDINATES_BINARY(op)                                                              \
  SYCL_EXTERNAL friend Derived<Dimensions> operator op(const Derived<Dimensions>& a,              \
                                                       const Derived<Dimensions>& b) {            \
    Derived<Dimensions> result = a;                                                               \
    for (int d = 0; d < Dimensions; ++d) {                                                        \
      result[d] = a[d] op b[d];                                                                   \
    }                                                                                             \
    return result;                                                                                \
  }                                                                                               \
  template <typename Integer, std::enable_if_t<std::is_integral_v<Integer>, int> = 0>             \
  SYCL_EXTERNAL friend Derived<Dimensions> operator op(const Derived<Dimensions>& a, Integer b) { \
    Derived<Dimensions> result = a;                                                               \
    for (int d = 0; d < Dimensions; ++d) {                                                        \
      result[d] = a[d] op static_cast<std::size_t>(b);                                            \
    }                                                                                             \
    return result;                                                                                \
  }                                                                                               \
  template <typename Integer, std::enable_if_t<std::is_integral_v<Integer>, int> = 0>             \
  SYCL_EXTERNAL friend Derived<Dimensions> operator op(Integer a, const Derived<Dimensions>& b) { \
    Derived<Dimensions> result = b;                                                               \
    for (int d = 0; d < Dimensions; ++d) {                                                        \
      result[d] = static_cast<std::size_t>(a) op b[d];                                            \
    }                                                                                             \
    return result;                                                                                \
  }

#define LUMEN_COORDINATES_ASSIGN(op)                                                             \
  SYCL_EXTERNAL friend Derived<Dimensions>& operator op(Derived<Dimensions>& a,                  \
                                                        const Derived<Dimensions>& b) {          \
    for (int d = 0; d < Dimensions; ++d) {                                                       \
      a[d] op b[d];                                                                              \
    }                                                                                            \
    return a;                                                                                    \
  }                                                                                              \
  SYCL_EXTERNAL friend Derived<Dimensions>& operator op(Derived<Dimensions>& a, std::size_t b) { \
    for (int d = 0; d < Dimensions; ++d) {                                                       \
      a[d] op b;                                                                                 \
    }                                                                                            \
    return a;                                                                                    \
  }

  LUMEN_COORDINATES_BINARY(+)
  LUMEN_COORDINATES_BINARY(-)
  LUMEN_COORDINATES_BINARY(*)
  LUMEN_COORDINATES_BINARY(/)
  LUMEN_COORDINATES_BINARY(%)
  LUMEN_COORDINATES_BINARY(<<)
  LUMEN_COORDINATES_BINARY(>>)
  LUMEN_COORDINATES_BINARY(&)
  LUMEN_COORDINATES_BINARY(|)
  LUMEN_COORDINATES_BINARY(^)
  LUMEN_COORDINATES_BINARY(&&)
  LUMEN_COORDINATES_BINARY(||)
  LUMEN_COORDINATES_BINARY(<)
  LUMEN_COORDINATES_BINARY(>)
  LUMEN_COORDINATES_BINARY(<=)
  LUMEN_COORDINATES_BINARY(>=)
  LUMEN_COORDINATES_ASSIGN(+=)
  LUMEN_COORDINATES_ASSIGN(-=)
  LUMEN_COORDINATES_ASSIGN(*=)
  LUMEN_COORDINATES_ASSIGN(/=)
  LUMEN_COORDINATES_ASSIGN(%=)
  LUMEN_COORDINATES_ASSIGN(<<=)
  LUMEN_COORDINATES_ASSIGN(>>=)
  LUMEN_COORDINATES_ASSIGN(&=)
  LUMEN_COORDINATES_ASSIGN(|=)
  LUMEN_COORDINATES_ASSIGN(^=)
#undef LUMEN_COORDINATES_BINARY
#undef LUMEN_COORDINATES_ASSIGN

 protected:
  coordinates() = default;
  std::size_t values_[Dimensions] = {};
};

// One-dimensional indices are numbers too. The operator is no template, so that the built-in
// operators (pointer[id], id + 1) see it.
template <typename Derived, int Dimensions>
class number_like {};
template <typename Derived>
class number_like<Derived, 1> {
 public:
  SYCL_EXTERNAL operator std::size_t() const { return static_cast<const Derived&>(*this)[0]; }
};

}  // namespace detail

template <int Dimensions = 1>
class range : public detail::coordinates<range, Dimensions> {
 public:
  static constexpr int dimensions = Dimensions;

  range() = default;
  template <int D = Dimensions, std::enable_if_t<D == 1, int> = 0>
  SYCL_EXTERNAL range(std::size_t size0) {
    this->values_[0] = size0;
  }
  template <int D = Dimensions, std::enable_if_t<D == 2, int> = 0>
  SYCL_EXTERNAL range(std::size_t size0, std::size_t size1) {
    this->values_[0] = size0;
    this->values_[1] = size1;
  }
  template <int D = Dimensions, std::enable_if_t<D == 3, int> = 0>
  SYCL_EXTERNAL range(std::size_t size0, std::size_t size1, std::size_t size2) {
    this->values_[0] = size0;
    this->values_[1] = size1;
    this->values_[2] = size2;
  }

  // The number of elements, the product of all sizes.
  SYCL_EXTERNAL std::size_t size() const {
    std::size_t product = 1;
    for (int d = 0; d < Dimensions; ++d) {
      product *= this->values_[d];
    }
    return product;
  }
};
range(std::size_t)->range<1>;
range(std::size_t, std::size_t)->range<2>;
range(std::size_t, std::size_t, std::size_t)->range<3>;

template <int Dimensions, bool WithOffset>
class item;

template <int Dimensions = 1>
class id : public detail::coordinates<id, Dimensions>,
           public detail::number_like<id<Dimensions>, Dimensions> {
 public:
  static constexpr int dimensions = Dimensions;

  id() = default;
  template <int D = Dimensions, std::enable_if_t<D == 1, int> = 0>
  SYCL_EXTERNAL id(std::size_t index0) {
    this->values_[0] = index0;
  }
  template <int D = Dimensions, std::enable_if_t<D == 2, int> = 0>
  SYCL_EXTERNAL id(std::size_t index0, std::size_t index1) {
    this->values_[0] = index0;
    this->values_[1] = index1;
  }
  template <int D = Dimensions, std::enable_if_t<D == 3, int> = 0>
  SYCL_EXTERNAL id(std::size_t index0, std::size_t index1, std::size_t index2) {
    this->values_[0] = index0;
    this->values_[1] = index1;
    this->values_[2] = index2;
  }
  SYCL_EXTERNAL id(const range<Dimensions>& sizes) {
    for (int d = 0; d < Dimensions; ++d) {
      this->values_[d] = sizes[d];
    }
  }
  template <bool WithOffset>
  SYCL_EXTERNAL id(const item<Dimensions, WithOffset>& source) : id(source.get_id()) {}
};
id(std::size_t)->id<1>;
id(std::size_t, std::size_t)->id<2>;
id(std::size_t, std::size_t, std::size_t)->id<3>;

// A global range cut into work-groups of the local range.
template <int Dimensions = 1>
class nd_range {
 public:
  static constexpr int dimensions = Dimensions;

  SYCL_EXTERNAL nd_range(range<Dimensions> global, range<Dimensions> local,
                         id<Dimensions> offset = id<Dimensions>())
      : global_(global), local_(local), offset_(offset) {}

  SYCL_EXTERNAL range<Dimensions> get_global_range() const { return global_; }
  SYCL_EXTERNAL range<Dimensions> get_local_range() const { return local_; }
  SYCL_EXTERNAL range<Dimensions> get_group_range() const { return global_ / local_; }
  SYCL_EXTERNAL id<Dimensions> get_offset() const { return offset_; }

  SYCL_EXTERNAL friend bool operator==(const nd_range& a, const nd_range& b) {
    return a.global_ == b.global_ && a.local_ == b.local_ && a.offset_ == b.offset_;
  }
  SYCL_EXTERNAL friend bool operator!=(const nd_range& a, const nd_range& b) { return !(a == b); }

 private:
  range<Dimensions> global_;
  range<Dimensions> local_;
  id<Dimensions> offset_;
};

namespace detail {
// Row-major position of an index within sizes, and back.
template <int Dimensions>
SYCL_EXTERNAL inline std::size_t linear_index(const id<Dimensions>& index,
                                              const range<Dimensions>& sizes) {
  std::size_t linear = index[0];
  for (int d = 1; d < Dimensions; ++d) {
    linear = linear * sizes[d] + index[d];
  }
  return linear;
}

template <int Dimensions>
SYCL_EXTERNAL inline id<Dimensions> index_of(std::size_t linear, const range<Dimensions>& sizes) {
  id<Dimensions> index;
  for (int d = Dimensions - 1; d > 0; --d) {
    index[d] = linear % sizes[d];
    linear /= sizes[d];
  }
  index[0] = linear;
  return index;
}

// Bytes of that many elements; the largest number where they cannot be counted.
template <int Dimensions>
inline std::size_t byte_count(const range<Dimensions>& sizes, std::size_t element_bytes) {
  constexpr auto most = static_cast<std::size_t>(-1);
  std::size_t bytes = element_bytes;
  bool fits = true;
  for (int d = 0; d < Dimensions; ++d) {
    if (sizes[d] == 0) {
      return 0;
    }
    fits = fits && bytes <= most / sizes[d];
    bytes *= sizes[d];
  }
  return fits ? bytes : most;
}
}  // namespace detail

LUMEN_NAMESPACE_END
