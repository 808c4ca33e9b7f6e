// SPDX-License-Identifier: Apache-2.0
// multi_ptr (SYCL 2020, section 4.7.7.1): a pointer that knows its address space. On the host
// all spaces are one, so a decorated pointer is a plain one.
#pragma once

#include <cstddef>
#include <cstdint>
#include <iterator>
#include <type_traits>

#include "access.hpp"
#include "config.hpp"

LUMEN_NAMESPACE_BEGIN

template <typename ElementType, access::address_space Space, access::decorated Decorated>
class multi_ptr;

namespace detail {
template <access::address_space From, access::address_space To>
inline constexpr bool space_converts = From == To ||
                                       (To == access::address_space::generic_space &&
                                        From != access::address_space::constant_space);
}  // namespace detail

template <typename ElementType, access::address_space Space,
          access::decorated Decorated = access::decorated::no>
class multi_ptr {
 public:
  static constexpr bool is_decorated = Decorated == access::decorated::yes;
  static constexpr access::address_space address_space = Space;
  using value_type = ElementType;
  using pointer = ElementType*;
  using reference = std::add_lvalue_reference_t<ElementType>;
  using iterator_category = std::random_access_iterator_tag;
  using difference_type = std::ptrdiff_t;

  multi_ptr() = default;
  SYCL_EXTERNAL multi_ptr(std::nullptr_t) {}
  SYCL_EXTERNAL explicit multi_ptr(pointer raw) : pointer_(raw) {}
  // From an accessor of the matching space.
  template <typename Accessor,
            typename = std::enable_if_t<
                std::is_convertible_v<decltype(&std::declval<const Accessor&>()[0]), ElementType*>>,
            typename = typename Accessor::reference,
            typename = std::enable_if_t<!std::is_same_v<std::remove_cv_t<Accessor>, multi_ptr> &&
                                        detail::space_converts<Accessor::pointer_space, Space>>>
  SYCL_EXTERNAL explicit multi_ptr(const Accessor& source) : pointer_(source.get_pointer()) {}
  // To more const, to another decoration, from a named space to the generic one.
  template <typename Other, access::address_space OtherSpace, access::decorated OtherDecorated,
            typename = std::enable_if_t<
                std::is_convertible_v<Other*, ElementType*> &&
                (std::is_void_v<ElementType> ||
                 std::is_same_v<std::remove_cv_t<Other>, std::remove_cv_t<ElementType>>)&&detail::
                    space_converts<OtherSpace, Space>>>
  SYCL_EXTERNAL multi_ptr(const multi_ptr<Other, OtherSpace, OtherDecorated>& other)
      : pointer_(other.get_raw()) {}

  SYCL_EXTERNAL multi_ptr& operator=(std::nullptr_t) {
    pointer_ = nullptr;
    return *this;
  }

  SYCL_EXTERNAL pointer get() const { return pointer_; }
  SYCL_EXTERNAL std::add_pointer_t<ElementType> get_raw() const { return pointer_; }
  SYCL_EXTERNAL pointer get_decorated() const { return pointer_; }

  template <typename T = ElementType>
  SYCL_EXTERNAL std::add_lvalue_reference_t<T> operator*() const {
    return *pointer_;
  }
  SYCL_EXTERNAL pointer operator->() const { return pointer_; }
  template <typename T = ElementType>
  SYCL_EXTERNAL std::add_lvalue_reference_t<T> operator[](difference_type index) const {
    return pointer_[index];
  }
  // An undecorated pointer converts by itself, a decorated one on request.
  template <bool D = is_decorated, std::enable_if_t<!D, int> = 0>
  SYCL_EXTERNAL operator pointer() const {
    return pointer_;
  }
  template <bool D = is_decorated, std::enable_if_t<D, int> = 0>
  SYCL_EXTERNAL explicit operator pointer() const {
    return pointer_;
  }
  // A void pointer becomes typed on request.
  template <typename Other, access::decorated OtherDecorated, typename T = ElementType,
            typename = std::enable_if_t<std::is_void_v<T> && !std::is_void_v<Other> &&
                                        (std::is_const_v<Other> || !std::is_const_v<T>)>>
  SYCL_EXTERNAL explicit operator multi_ptr<Other, Space, OtherDecorated>() const {
    return multi_ptr<Other, Space, OtherDecorated>(static_cast<Other*>(pointer_));
  }

  SYCL_EXTERNAL void prefetch(std::size_t) const {}

  SYCL_EXTERNAL friend multi_ptr& operator++(multi_ptr& p) {
    ++p.pointer_;
    return p;
  }
  SYCL_EXTERNAL friend multi_ptr operator++(multi_ptr& p, int) { return multi_ptr(p.pointer_++); }
  SYCL_EXTERNAL friend multi_ptr& operator--(multi_ptr& p) {
    --p.pointer_;
    return p;
  }
  SYCL_EXTERNAL friend multi_ptr operator--(multi_ptr& p, int) { return multi_ptr(p.pointer_--); }
  SYCL_EXTERNAL friend multi_ptr& operator+=(multi_ptr& p, difference_type n) {
    p.pointer_ += n;
    return p;
  }
  SYCL_EXTERNAL friend multi_ptr& operator-=(multi_ptr& p, difference_type n) {
    p.pointer_ -= n;
    return p;
  }
  template <typename Integer, std::enable_if_t<std::is_integral_v<Integer>, int> = 0>
  SYCL_EXTERNAL friend multi_ptr operator+(const multi_ptr& p, Integer n) {
    return multi_ptr(p.pointer_ + n);
  }
  template <typename Integer, std::enable_if_t<std::is_integral_v<Integer>, int> = 0>
  SYCL_EXTERNAL friend multi_ptr operator-(const multi_ptr& p, Integer n) {
    return multi_ptr(p.pointer_ - n);
  }
  SYCL_EXTERNAL friend difference_type operator-(const multi_ptr& a, const multi_ptr& b) {
    return a.pointer_ - b.pointer_;
  }

#define LUMEN_POINTER_COMPARE(op)                                                 \
  SYCL_EXTERNAL friend bool operator op(const multi_ptr& a, const multi_ptr& b) { \
    return reinterpret_cast<std::uintptr_t>(a.pointer_)                           \
        op reinterpret_cast<std::uintptr_t>(b.pointer_);                          \
  }                                                                               \
  SYCL_EXTERNAL friend bool operator op(const multi_ptr& a, std::nullptr_t) {     \
    return a op multi_ptr(nullptr);                                               \
  }                                                                               \
  SYCL_EXTERNAL friend bool operator op(std::nullptr_t, const multi_ptr& b) {     \
    return multi_ptr(nullptr) op b;                                               \
  }
  LUMEN_POINTER_COMPARE(==)
  LUMEN_POINTER_COMPARE(!=)
  LUMEN_POINTER_COMPARE(<)
  LUMEN_POINTER_COMPARE(>)
  LUMEN_POINTER_COMPARE(<=)
  LUMEN_POINTER_COMPARE(>=)
#undef LUMEN_POINTER_COMPARE

 private:
  pointer pointer_ = nullptr;
};

template <typename T, access::decorated D = access::decorated::legacy>
using global_ptr = multi_ptr<T, access::address_space::global_space, D>;
template <typename T, access::decorated D = access::decorated::legacy>
using local_ptr = multi_ptr<T, access::address_space::local_space, D>;
template <typename T, access::decorated D = access::decorated::legacy>
using private_ptr = multi_ptr<T, access::address_space::private_space, D>;
template <typename T, access::decorated D = access::decorated::legacy>
using generic_ptr = multi_ptr<T, access::address_space::generic_space, D>;
template <typename T>
using raw_global_ptr = global_ptr<T, access::decorated::no>;
template <typename T>
using raw_local_ptr = local_ptr<T, access::decorated::no>;
template <typename T>
using raw_private_ptr = private_ptr<T, access::decorated::no>;
template <typename T>
using raw_generic_ptr = generic_ptr<T, access::decorated::no>;
template <typename T>
using decorated_global_ptr = global_ptr<T, access::decorated::yes>;
template <typename T>
using decorated_local_ptr = local_ptr<T, access::decorated::yes>;
template <typename T>
using decorated_private_ptr = private_ptr<T, access::decorated::yes>;
template <typename T>
using decorated_generic_ptr = generic_ptr<T, access::decorated::yes>;

template <access::address_space Space, access::decorated Decorated, typename ElementType>
SYCL_EXTERNAL inline multi_ptr<ElementType, Space, Decorated> address_space_cast(
    ElementType* pointer) {
  return multi_ptr<ElementType, Space, Decorated>(pointer);
}

LUMEN_NAMESPACE_END
