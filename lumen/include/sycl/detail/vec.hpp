// SPDX-License-Identifier: Apache-2.0
// vec (SYCL 2020, section 4.14.2): 1, 2, 3, 4, 8 or 16 elements, aligned to their whole size; one
// of three elements has the size and alignment of one of four.
#pragma once

#include <cstddef>
#include <cstdint>
#include <type_traits>

#include "bit.hpp"
#include "config.hpp"
#include "vec_convert.hpp"
#include "vec_elements.hpp"
#include "vec_operators.hpp"
#include "vec_swizzle.hpp"

LUMEN_NAMESPACE_BEGIN

namespace detail {

// How many elements of type T an argument of a constructor of vec<T, N> brings; 0 if it cannot.
template <typename T, typename Arg>
struct elements_in {
  static constexpr int value = std::is_convertible_v<Arg, T> ? 1 : 0;
};
template <typename T, int M>
struct elements_in<T, vec<T, M>> {
  static constexpr int value = M;
};
template <typename T, int M, typename Source, int... Indexes>
struct elements_in<T, swizzled_vec<vec<T, M>, Source, Indexes...>> {
  static constexpr int value = M;
};

template <typename T, int N, typename... Args>
inline constexpr bool elements_fill = sizeof...(Args) >= 2 &&
                                      ((elements_in<T, Args>::value > 0) && ...) &&
                                      (elements_in<T, Args>::value + ... + 0) == N;

}  // namespace detail

template <typename T, int N>
class vec : public detail::vec_operators<vec<T, N>, T, N>,
            public detail::vec_elements<vec<T, N>, N> {
  static_assert(N == 1 || N == 2 || N == 3 || N == 4 || N == 8 || N == 16,
                "a vec has 1, 2, 3, 4, 8 or 16 elements");
  static_assert(!std::is_const_v<T> && !std::is_volatile_v<T>);

  static constexpr int slots = N == 3 ? 4 : N;

 public:
  using element_type = T;
  using value_type = T;

  // All elements are zero.
  constexpr vec() = default;

  // All elements have one value.
  SYCL_EXTERNAL constexpr explicit vec(const T& value) {
    LUMEN_UNROLL for (int i = 0; i < N; ++i) {
      elements_[i] = value;
    }
  }

  // Scalars, vecs and swizzles in order, which must bring N elements together.
  template <typename... Args, std::enable_if_t<detail::elements_fill<T, N, Args...>, int> = 0>
  SYCL_EXTERNAL constexpr vec(const Args&... args) {
    int at = 0;
    (append(args, at), ...);
  }

  template <typename S, std::enable_if_t<detail::is_scalar_for<S, vec, T>, int> = 0>
  SYCL_EXTERNAL constexpr vec& operator=(const S& value) {
    return *this = vec(static_cast<T>(value));
  }

  template <int M = N, std::enable_if_t<M == 1, int> = 0>
  SYCL_EXTERNAL constexpr operator T() const {
    return elements_[0];
  }

  SYCL_EXTERNAL static constexpr std::size_t byte_size() noexcept { return slots * sizeof(T); }
  SYCL_EXTERNAL static constexpr std::size_t size() noexcept { return N; }
  [[deprecated("use byte_size")]] SYCL_EXTERNAL constexpr std::size_t get_size() const {
    return byte_size();
  }
  [[deprecated("use size")]] SYCL_EXTERNAL constexpr std::size_t get_count() const {
    return size();
  }

  SYCL_EXTERNAL constexpr T& operator[](int index) { return elements_[index]; }
  SYCL_EXTERNAL constexpr const T& operator[](int index) const { return elements_[index]; }

  template <typename ConvertT, rounding_mode Mode = rounding_mode::automatic>
  SYCL_EXTERNAL constexpr vec<ConvertT, N> convert() const {
    vec<ConvertT, N> result;
    LUMEN_UNROLL for (int i = 0; i < N; ++i) {
      result[i] = detail::convert_element<ConvertT, Mode>(elements_[i]);
    }
    return result;
  }

  // The same bits as another vec of the same size.
  template <typename AsT>
  SYCL_EXTERNAL AsT as() const {
    static_assert(AsT::byte_size() == byte_size(), "the two vecs differ in size");
    return sycl::bit_cast<AsT>(*this);
  }

  // Elements N * offset and following of `source`, which needs the alignment of T only.
  SYCL_EXTERNAL constexpr void load(std::size_t offset, const T* source) {
    LUMEN_UNROLL for (int i = 0; i < N; ++i) {
      elements_[i] = source[offset * N + static_cast<std::size_t>(i)];
    }
  }
  SYCL_EXTERNAL constexpr void store(std::size_t offset, T* target) const {
    LUMEN_UNROLL for (int i = 0; i < N; ++i) {
      target[offset * N + static_cast<std::size_t>(i)] = elements_[i];
    }
  }
  // The same through a multi_ptr of any address space and decoration.
  template <typename MultiPtr, typename = decltype(std::declval<const MultiPtr&>().get())>
  SYCL_EXTERNAL constexpr void load(std::size_t offset, const MultiPtr& source) {
    load(offset, static_cast<const T*>(source.get()));
  }
  template <typename MultiPtr, typename = decltype(std::declval<const MultiPtr&>().get())>
  SYCL_EXTERNAL constexpr void store(std::size_t offset, const MultiPtr& target) const {
    store(offset, static_cast<T*>(target.get()));
  }

 private:
  friend class detail::vec_elements<vec, N>;
  template <typename Result, typename Source, int... Indexes>
  friend class detail::swizzled_vec;

  template <int... Indexes>
  SYCL_EXTERNAL constexpr auto pick() {
    return detail::swizzled_vec<vec<T, sizeof...(Indexes)>, vec, Indexes...>(*this);
  }
  template <int... Indexes>
  SYCL_EXTERNAL constexpr auto pick() const {
    return detail::swizzled_vec<vec<T, sizeof...(Indexes)>, const vec, Indexes...>(*this);
  }

  template <typename Arg>
  SYCL_EXTERNAL constexpr void append(const Arg& arg, int& at) {
    constexpr int count = detail::elements_in<T, Arg>::value;
    if constexpr (count == 1) {
      elements_[at++] = static_cast<T>(arg);
    } else {
      LUMEN_UNROLL for (int i = 0; i < count; ++i) {
        elements_[at++] = arg[i];
      }
    }
  }

  alignas(slots * sizeof(T)) T elements_[slots] = {};
};

template <typename T, typename... Rest, std::enable_if_t<(std::is_same_v<T, Rest> && ...), int> = 0>
vec(T, Rest...) -> vec<T, 1 + sizeof...(Rest)>;

#define LUMEN_VEC_ALIASES(name, T) \
  using name##2 = vec<T, 2>;       \
  using name##3 = vec<T, 3>;       \
  using name##4 = vec<T, 4>;       \
  using name##8 = vec<T, 8>;       \
  using name##16 = vec<T, 16>;

LUMEN_VEC_ALIASES(char, std::int8_t)
LUMEN_VEC_ALIASES(uchar, std::uint8_t)
LUMEN_VEC_ALIASES(short, std::int16_t)
LUMEN_VEC_ALIASES(ushort, std::uint16_t)
LUMEN_VEC_ALIASES(int, std::int32_t)
LUMEN_VEC_ALIASES(uint, std::uint32_t)
LUMEN_VEC_ALIASES(long, std::int64_t)
LUMEN_VEC_ALIASES(ulong, std::uint64_t)
LUMEN_VEC_ALIASES(float, float)
LUMEN_VEC_ALIASES(double, double)
#undef LUMEN_VEC_ALIASES

LUMEN_NAMESPACE_END
