// SPDX-License-Identifier: Apache-2.0
// A swizzle: a view of chosen elements of a vec. It converts to a vec of their number (to a
// scalar if it is one), and assigning to it writes through to the vec.
#pragma once

#include <cstddef>
#include <type_traits>

#include "config.hpp"
#include "vec_convert.hpp"
#include "vec_elements.hpp"
#include "vec_operators.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// `Result` is the vec that the view converts to. It is a parameter so that argument-dependent
// lookup finds that vec's operators. `Source` is the viewed vec, const if it is read only.
template <typename Result, typename Source, int... Indexes>
class swizzled_vec
    : public vec_elements<swizzled_vec<Result, Source, Indexes...>, sizeof...(Indexes)> {
  static constexpr int count = sizeof...(Indexes);
  using T = typename Result::element_type;

  // A table within a function: code for GPUs cannot reach static members.
  SYCL_EXTERNAL static constexpr int place(int i) {
    constexpr int indexes[count] = {Indexes...};
    return indexes[i];
  }

  static constexpr bool all_differ() {
    for (int i = 0; i < count; ++i) {
      for (int j = 0; j < i; ++j) {
        if (place(i) == place(j)) {
          return false;
        }
      }
    }
    return true;
  }

 public:
  using element_type = T;
  using value_type = T;
  // What the view stands for in an expression.
  using value = std::conditional_t<count == 1, T, Result>;

  SYCL_EXTERNAL constexpr explicit swizzled_vec(Source& source) : source_(source) {}
  swizzled_vec(const swizzled_vec&) = default;

  SYCL_EXTERNAL static constexpr std::size_t byte_size() noexcept { return Result::byte_size(); }
  SYCL_EXTERNAL static constexpr std::size_t size() noexcept { return count; }

  SYCL_EXTERNAL constexpr operator value() const { return get(); }

  SYCL_EXTERNAL constexpr decltype(auto) operator[](int i) { return source_[place(i)]; }
  SYCL_EXTERNAL constexpr T operator[](int i) const { return source_[place(i)]; }

  template <int... Chosen>
  SYCL_EXTERNAL constexpr auto pick() const {
    return swizzled_vec<vec<T, sizeof...(Chosen)>, Source, place(Chosen)...>(source_);
  }

  template <typename ConvertT, rounding_mode Mode = rounding_mode::automatic>
  SYCL_EXTERNAL constexpr auto convert() const {
    return as_vec().template convert<ConvertT, Mode>();
  }
  template <typename AsT>
  SYCL_EXTERNAL AsT as() const {
    return as_vec().template as<AsT>();
  }
  template <typename Pointer>
  SYCL_EXTERNAL void store(std::size_t offset, const Pointer& target) const {
    as_vec().store(offset, target);
  }
  template <typename Pointer>
  SYCL_EXTERNAL void load(std::size_t offset, const Pointer& source) {
    Result loaded;
    loaded.load(offset, source);
    set(loaded);
  }

  SYCL_EXTERNAL constexpr swizzled_vec& operator=(const swizzled_vec& other) {
    return set(other.as_vec());
  }
  SYCL_EXTERNAL constexpr swizzled_vec& operator=(const Result& values) { return set(values); }
  template <typename S, std::enable_if_t<is_scalar_for<S, Result, T>, int> = 0>
  SYCL_EXTERNAL constexpr swizzled_vec& operator=(const S& scalar) {
    return set(Result(static_cast<T>(scalar)));
  }

#define LUMEN_SWIZZLE_COMPOUND(op)                                                                 \
  template <typename Operand>                                                                      \
  SYCL_EXTERNAL friend constexpr swizzled_vec& operator op##=(swizzled_vec& a, const Operand& b) { \
    return a.set(Result(static_cast<value>(a.get() op b)));                                        \
  }                                                                                                \
  template <typename Operand>                                                                      \
  SYCL_EXTERNAL friend constexpr swizzled_vec operator op##=(swizzled_vec&& a, const Operand& b) { \
    return a.set(Result(static_cast<value>(a.get() op b)));                                        \
  }

  LUMEN_SWIZZLE_COMPOUND(+)
  LUMEN_SWIZZLE_COMPOUND(-)
  LUMEN_SWIZZLE_COMPOUND(*)
  LUMEN_SWIZZLE_COMPOUND(/)
  LUMEN_SWIZZLE_COMPOUND(%)
  LUMEN_SWIZZLE_COMPOUND(&)
  LUMEN_SWIZZLE_COMPOUND(|)
  LUMEN_SWIZZLE_COMPOUND(^)
  LUMEN_SWIZZLE_COMPOUND(<<)
  LUMEN_SWIZZLE_COMPOUND(>>)
#undef LUMEN_SWIZZLE_COMPOUND

 private:
  SYCL_EXTERNAL constexpr Result as_vec() const {
    return Result(get());
  }

  SYCL_EXTERNAL constexpr value get() const {
    if constexpr (count == 1) {
      return source_[place(0)];
    } else {
      return Result(source_[Indexes]...);
    }
  }

  SYCL_EXTERNAL constexpr swizzled_vec& set(const Result& values) {
    static_assert(all_differ(), "an element that is named twice cannot be assigned");
    LUMEN_UNROLL for (int i = 0; i < count; ++i) {
      source_[place(i)] = values[i];
    }
    return *this;
  }

  Source& source_;
};

}  // namespace detail

LUMEN_NAMESPACE_END
